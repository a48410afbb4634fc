#include <gmock/gmock.h>

#include "base/RectF.h"
#include "math/Matrix3.h"
#include "render/Fakes.h"
#include "render/PenGLRenderMsg.h"

namespace QeltTests {
namespace {

using Qelt::Matrix3;
using Qelt::PenGLRenderMsg;
using Qelt::RectF;
using testing::ElementsAre;
using testing::IsEmpty;

RectF rectOf(float left, float top, float right, float bottom) {
  RectF rect;
  rect.Set(left, top, right, bottom);
  return rect;
}

// Two tiles side by side, 64 pixels each.
class RenderMessage : public testing::Test {
 protected:
  RenderMessage() {
    bitmap.tiles.emplace_back(0, 0, 64, 64);
    bitmap.tiles.emplace_back(64, 0, 64, 64);
    layer.bitmap = &bitmap;
    canvas.layer = &layer;
  }

  Events events;
  FakeBitmap bitmap;
  FakeLayer layer;
  FakeCanvas canvas{events};
  FakeDrawable drawable{events};
};

TEST_F(RenderMessage, CarriesTheCanvassTransformIntoSpace) {
  const float elements[9] = {1, 2, 3, 4, 5, 6, 7, 8, 9};
  canvas.matrix = Matrix3<float>(elements);
  const PenGLRenderMsg message(&drawable, &canvas, {}, false);
  const float expected[16] = {1, 2, 0, 3, 4, 5, 0, 6, 0, 0, 1, 0, 7, 8, 0, 9};
  for (int i = 0; i < 16; ++i) EXPECT_EQ(message.mMatrix[i], expected[i]) << i;
}

// A quarter turn with zoom 2: (x, y) goes to (100 - 2 y, 50 + 2 x). The corners of (10, 20, 40, 30) land on
// (60, 70), (40, 70), (60, 130) and (40, 130).
TEST_F(RenderMessage, BoxesTheTurnedRectangle) {
  const float turn[9] = {0, 2, 0, -2, 0, 0, 100, 50, 1};
  canvas.matrix = Matrix3<float>(turn);
  const RectF box = PenGLRenderMsg(&drawable, &canvas, rectOf(10, 20, 40, 30), false).getTransformedRect();
  EXPECT_EQ(box.left, 40.0f);
  EXPECT_EQ(box.top, 70.0f);
  EXPECT_EQ(box.right, 60.0f);
  EXPECT_EQ(box.bottom, 130.0f);
}

// By 45 degrees no two corners give the box: (0, 0, 10, 20) has its left at (0, 20), its right at (10, 0),
// its bottom at (10, 20): -14.142136, 7.0710678 and 21.213203.
TEST_F(RenderMessage, BoxesAllFourCorners) {
  constexpr float kHalfRoot = 0.70710678f;
  const float turn[9] = {kHalfRoot, kHalfRoot, 0, -kHalfRoot, kHalfRoot, 0, 0, 0, 1};
  canvas.matrix = Matrix3<float>(turn);
  const RectF box = PenGLRenderMsg(&drawable, &canvas, rectOf(0, 0, 10, 20), false).getTransformedRect();
  EXPECT_NEAR(box.left, -14.142136f, 1e-4f);
  EXPECT_NEAR(box.top, 0.0f, 1e-4f);
  EXPECT_NEAR(box.right, 7.0710678f, 1e-4f);
  EXPECT_NEAR(box.bottom, 21.213203f, 1e-4f);
}

TEST_F(RenderMessage, DrawsTheTilesItMeetsAndBracketsEveryOne) {
  PenGLRenderMsg(&drawable, &canvas, rectOf(10, 10, 20, 20), false).run();
  EXPECT_THAT(events, ElementsAre("update", "begin 0", "draw at 0", "end 0", "begin 1", "end 1", "clear"));
  events.clear();
  PenGLRenderMsg(&drawable, &canvas, rectOf(60, 10, 70, 20), true).run();
  EXPECT_THAT(events, ElementsAre("update cache", "begin 0", "draw at 0", "end 0", "begin 1", "draw at 64",
                                  "end 1", "clear"));
  events.clear();
  PenGLRenderMsg(&drawable, &canvas, rectOf(10, 200, 20, 220), false).run();
  EXPECT_THAT(events, ElementsAre("update", "begin 0", "end 0", "begin 1", "end 1", "clear"));
}

TEST_F(RenderMessage, OffersABitmapToThoseWhoTakeOne) {
  PenGLRenderMsg message(&drawable, &canvas, rectOf(10, 10, 20, 20), false);
  message.mReferenceBitmap = &bitmap;
  message.run();
  EXPECT_THAT(events, testing::Not(testing::Contains("reference")));
  events.clear();
  drawable.takesReference = true;
  message.run();
  EXPECT_THAT(events, ElementsAre("update", "begin 0", "reference", "draw at 0", "end 0", "begin 1", "end 1",
                                  "clear"));
}

TEST_F(RenderMessage, DoesNothingAtAllWithoutDrawableCanvasLayerOrBitmap) {
  const RectF rect = rectOf(10, 10, 20, 20);
  PenGLRenderMsg(nullptr, &canvas, rect, false).run();
  PenGLRenderMsg(&drawable, nullptr, rect, false).run();
  layer.bitmap = nullptr;
  PenGLRenderMsg(&drawable, &canvas, rect, false).run();
  canvas.layer = nullptr;
  PenGLRenderMsg(&drawable, &canvas, rect, false).run();
  EXPECT_THAT(events, IsEmpty());
}

}  // namespace
}  // namespace QeltTests
