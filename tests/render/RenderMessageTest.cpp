#include <gmock/gmock.h>

#include <utility>

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

// Two tiles side by side, 64 pixels each.
class RenderMessage : public testing::Test {
 protected:
  RenderMessage() { canvas.layer.tiles.emplace_back(64); }

  Events events;
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

// By 45 degrees no two corners give the box: (0, 0, 10, 20) has its left at (0, 20), its right at (10, 0),
// its bottom at (10, 20): -14.142136, 7.0710678 and 21.213203; moved by (100, 50).
TEST_F(RenderMessage, BoxesAllFourCornersOfItsRectangle) {
  constexpr float kHalfRoot = 0.70710678f;
  const float turn[9] = {kHalfRoot, kHalfRoot, 0, -kHalfRoot, kHalfRoot, 0, 100, 50, 1};
  canvas.matrix = Matrix3<float>(turn);
  const RectF box = PenGLRenderMsg(&drawable, &canvas, RectF{0, 0, 10, 20}, false).getTransformedRect();
  EXPECT_NEAR(box.left, 85.857864f, 1e-4f);
  EXPECT_NEAR(box.top, 50.0f, 1e-4f);
  EXPECT_NEAR(box.right, 107.0710678f, 1e-4f);
  EXPECT_NEAR(box.bottom, 71.213203f, 1e-4f);
}

TEST_F(RenderMessage, DrawsTheTilesItMeetsAndBracketsEveryOne) {
  const auto ran = [&](const RectF& rect, bool useCache) {
    PenGLRenderMsg(&drawable, &canvas, rect, useCache).run();
    return std::exchange(events, {});
  };
  EXPECT_THAT(ran(RectF{10, 10, 20, 20}, false),
              ElementsAre("update", "begin 0", "draw at 0", "end 0", "begin 1", "end 1", "clear"));
  EXPECT_THAT(ran(RectF{60, 10, 70, 20}, true), ElementsAre("update cache", "begin 0", "draw at 0", "end 0",
                                                            "begin 1", "draw at 64", "end 1", "clear"));
  EXPECT_THAT(ran(RectF{10, 200, 20, 220}, false),
              ElementsAre("update", "begin 0", "end 0", "begin 1", "end 1", "clear"));
}

TEST_F(RenderMessage, OffersABitmapToThoseWhoTakeOne) {
  PenGLRenderMsg message(&drawable, &canvas, RectF{10, 10, 20, 20}, false);
  message.mReferenceBitmap = &canvas.layer;
  for (const bool takes : {false, true}) {
    events.clear();
    drawable.takesReference = takes;
    message.run();
    Events wanted{"update", "begin 0", "reference", "draw at 0", "end 0", "begin 1", "end 1", "clear"};
    if (!takes) wanted.erase(wanted.begin() + 2);
    EXPECT_EQ(events, wanted);
  }
}

TEST_F(RenderMessage, DoesNothingAtAllWithoutDrawableOrCanvas) {
  const RectF rect = RectF{10, 10, 20, 20};
  PenGLRenderMsg(nullptr, &canvas, rect, false).run();
  PenGLRenderMsg(&drawable, nullptr, rect, false).run();
  EXPECT_THAT(events, IsEmpty());
}

// The batch is deleted right after the message: a drawable that went on holding it would touch freed memory.
TEST_F(RenderMessage, HasTheBatchForgottenAndTheTileEndedWhicheverWayItEnds) {
  const RectF rect = RectF{10, 10, 70, 20};
  canvas.layer.hasBitmap = false;
  PenGLRenderMsg(&drawable, &canvas, rect, false).run();
  EXPECT_THAT(std::exchange(events, {}), ElementsAre("clear"));
  canvas.hasLayer = false;
  PenGLRenderMsg(&drawable, &canvas, rect, false).run();
  EXPECT_THAT(std::exchange(events, {}), ElementsAre("clear"));

  canvas.hasLayer = canvas.layer.hasBitmap = drawable.throws = true;
  EXPECT_THROW(PenGLRenderMsg(&drawable, &canvas, rect, false).run(), std::runtime_error);
  EXPECT_THAT(events, ElementsAre("update", "begin 0", "draw at 0", "end 0", "clear"));
}

}  // namespace
}  // namespace QeltTests
