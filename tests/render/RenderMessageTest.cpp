#include <gmock/gmock.h>

#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "base/RectF.h"
#include "pencommon/PenStrokeDrawableRT.h"
#include "render/PenGLRenderMsg.h"
#include "support/Board.h"

namespace QeltTests {
namespace {

using Qelt::PenGLRenderMsg;
using Qelt::RectF;
using testing::ElementsAre;

// What happened, in order.
using Events = std::vector<std::string>;

class FakeCanvas : public QeltDesktop::PenCanvas {
 public:
  explicit FakeCanvas(Events& log) : PenCanvas(nullptr, nullptr), events(log) {}
  Qelt::ISPLayer* GetLayer() override { return &layer; }
  void BeginTile(int index) override { events.push_back("begin " + std::to_string(index)); }
  void EndTile(int index) override { events.push_back("end " + std::to_string(index)); }

  Events& events;
  FakeLayer layer;
};

// A render drawable that draws nothing and tells what it was asked to.
class FakeDrawable : public Qelt::PenStrokeDrawableRT, public Qelt::IReferenceBitmapSettable {
 public:
  explicit FakeDrawable(Events& log) : PenStrokeDrawableRT(nullptr), events(log) {}
  void Update(bool useCache) override { events.emplace_back(useCache ? "update cache" : "update"); }
  void Draw(Qelt::ISPSubBitmap* tile, Qelt::Matrix4<float>&) override {
    events.push_back("draw at " + std::to_string(tile->GetX()));
    if (throws) throw std::runtime_error("out of the host");
  }
  void Clear() override { events.emplace_back("clear"); }
  Qelt::IReferenceBitmapSettable* GetReferenceBitmapSettable() override { return this; }
  void SetReferenceBitmap(Qelt::ISPBitmap*) override { events.emplace_back("reference"); }

  Events& events;
  bool throws = false;
};

// Two tiles side by side, 64 pixels each.
class RenderMessage : public testing::Test {
 protected:
  RenderMessage() { canvas.layer.tiles.emplace_back(64); }
  PenGLRenderMsg message(const RectF& rect) { return {&drawable, &canvas, rect, false}; }

  Events events;
  FakeCanvas canvas{events};
  FakeDrawable drawable{events};
};

// By 45 degrees no two corners give the box: (0, 0, 10, 20) has its left at (0, 20), its right at (10, 0),
// its bottom at (10, 20): -14.142136, 7.0710678 and 21.213203; moved by (100, 50). The other way round its
// top is at (10, 0), its right at (10, 20), its bottom at (0, 20).
TEST_F(RenderMessage, BoxesAllFourCornersOfItsRectangle) {
  constexpr float kHalfRoot = 0.70710678f;
  const float turn[9] = {kHalfRoot, kHalfRoot, 0, -kHalfRoot, kHalfRoot, 0, 100, 50, 1};
  canvas.setMatrix(Qelt::Matrix3<float>(turn));
  const RectF box = message({0, 0, 10, 20}).getTransformedRect();
  EXPECT_NEAR(box.left, 85.857864f, 1e-4f);
  EXPECT_NEAR(box.top, 50.0f, 1e-4f);
  EXPECT_NEAR(box.right, 107.0710678f, 1e-4f);
  EXPECT_NEAR(box.bottom, 71.213203f, 1e-4f);
  const float back[9] = {kHalfRoot, -kHalfRoot, 0, kHalfRoot, kHalfRoot, 0, 100, 50, 1};
  canvas.setMatrix(Qelt::Matrix3<float>(back));
  const RectF other = message({0, 0, 10, 20}).getTransformedRect();
  EXPECT_NEAR(other.left, 100.0f, 1e-4f);
  EXPECT_NEAR(other.top, 42.9289322f, 1e-4f);
  EXPECT_NEAR(other.right, 121.213203f, 1e-4f);
  EXPECT_NEAR(other.bottom, 64.142136f, 1e-4f);
}

// A reference bitmap is offered to those who take one.
TEST_F(RenderMessage, DrawsTheTilesItMeetsAndBracketsEveryOne) {
  const auto ran = [&](const RectF& rect, bool hasReference = false) {
    PenGLRenderMsg one = message(rect);
    if (hasReference) one.mReferenceBitmap = &canvas.layer;
    one.run();
    return std::exchange(events, {});
  };
  EXPECT_THAT(ran({10, 10, 20, 20}, true), ElementsAre("update", "begin 0", "reference", "draw at 0", "end 0",
                                                       "begin 1", "end 1", "clear"));
  EXPECT_THAT(ran({60, 10, 70, 20}), ElementsAre("update", "begin 0", "draw at 0", "end 0", "begin 1",
                                                 "draw at 64", "end 1", "clear"));
  EXPECT_THAT(ran({10, 200, 20, 220}),
              ElementsAre("update", "begin 0", "end 0", "begin 1", "end 1", "clear"));
}

// The batch is deleted right after the message: a drawable that went on holding it would touch freed memory.
TEST_F(RenderMessage, HasTheBatchForgottenAndTheTileEndedWhenTheHostThrows) {
  drawable.throws = true;
  EXPECT_THROW(message({10, 10, 70, 20}).run(), std::runtime_error);
  EXPECT_THAT(events, ElementsAre("update", "begin 0", "draw at 0", "end 0", "clear"));
}

}  // namespace
}  // namespace QeltTests
