#include <gmock/gmock.h>

#include <limits>
#include <string>
#include <vector>

#include "engine/MotionEvent.h"
#include "support/DrawableBoard.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using Qelt::MotionEvent;
using testing::ElementsAre;
using testing::IsEmpty;

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInfinity = std::numeric_limits<float>::infinity();

class LiveStroke : public testing::TestWithParam<int> {
 protected:
  const int version = GetParam();
};

// Every action in every state: up, down, moving.
TEST_P(LiveStroke, FollowsTheTableOfStates) {
  DrawingBoard board({.version = version});
  const Sample start{10.0f, 10.0f}, further{30.0f, 10.0f};
  const auto draws = [&board] { return !board.takeStamps().empty(); };

  // Up: only a down counts.
  EXPECT_FALSE(board.move({further}));
  EXPECT_FALSE(board.up(further));
  EXPECT_FALSE(board.send(Qelt::kActionCancel, {further}));
  EXPECT_FALSE(board.send(7, {further}));
  EXPECT_FALSE(draws());
  EXPECT_EQ(board.rect.right, 0.0f);

  // Down: a cancel changes nothing, a second down starts anew, an up ends.
  EXPECT_TRUE(board.down(start));
  EXPECT_FALSE(board.send(Qelt::kActionCancel, {further}));
  EXPECT_TRUE(board.down({50.0f, 10.0f}));
  EXPECT_TRUE(board.up({50.0f, 10.0f}));
  EXPECT_THAT(board.takeStamps(), ElementsAre(StampNear(50.0f, 10.0f, 0.0f)));

  // Moving: a cancel changes nothing, a down starts anew without ending the old stroke.
  EXPECT_TRUE(board.down(start));
  EXPECT_TRUE(board.move({further}));
  EXPECT_TRUE(draws());
  EXPECT_FALSE(board.send(Qelt::kActionCancel, {further}));
  EXPECT_FALSE(draws());
  EXPECT_TRUE(board.move({{50.0f, 10.0f}}));
  EXPECT_TRUE(draws());
  EXPECT_TRUE(board.down({90.0f, 10.0f}));
  EXPECT_FALSE(draws());
  EXPECT_TRUE(board.up({90.0f, 10.0f}));
  EXPECT_THAT(board.takeStamps(), ElementsAre(StampNear(90.0f, 10.0f, 0.0f)));

  // Up again: what follows is ignored.
  EXPECT_FALSE(board.up({90.0f, 10.0f}));
  EXPECT_FALSE(board.move({further}));
  EXPECT_FALSE(draws());
}

TEST_P(LiveStroke, PostsInOrderWhateverTheActionDid) {
  const auto rectAndBatch = ElementsAre("SetRect", "Batch", "Render", "DeleteBatch");
  for (const bool curve : {true, false}) {
    SCOPED_TRACE(curve ? "curve" : "straight");
    DrawingBoard board({.version = version, .curve = curve});
    // Ignored: the rectangle and the (empty) batch are handed over all the same.
    board.move({{20.0f, 10.0f}});
    EXPECT_THAT(board.takePosts(), rectAndBatch);
    EXPECT_THAT(board.takeBuffers(), ElementsAre(IsEmpty()));
    board.send(Qelt::kActionCancel, {{20.0f, 10.0f}});
    EXPECT_THAT(board.takePosts(), rectAndBatch);

    board.down({10.0f, 10.0f});
    std::vector<std::string> ofDown = {"SetPenData", "SetRect", "Batch", "Render", "DeleteBatch"};
    if (curve) ofDown.insert(ofDown.begin(), "SetStartPoint");
    EXPECT_EQ(board.takePosts(), ofDown);
    board.move({{30.0f, 10.0f}, {50.0f, 10.0f}});
    EXPECT_THAT(board.takePosts(), rectAndBatch);
    board.up({60.0f, 10.0f});
    EXPECT_THAT(board.takePosts(), rectAndBatch);
  }
}

// Nothing but short moves: the stroke ends as a tap where it began, with the tool's pressure and size.
TEST_P(LiveStroke, EndsAsATapWhenEveryMoveWasDropped) {
  DrawingBoard board({.version = version});
  board.down({10.0f, 10.0f, 0.9f});
  board.move({{11.0f, 10.0f, 0.9f}});
  EXPECT_TRUE(board.up({11.5f, 10.0f, 0.5f}));
  const std::vector<Stamp> stamps = board.takeStamps();
  ASSERT_THAT(stamps, ElementsAre(StampNear(10.0f, 10.0f, 0.0f)));
  EXPECT_EQ(stamps[0].tile, 0);
  // 0.25, times 255 / 80 from version 2 on; in version 8 times 15 / 10 and over 6 as well.
  EXPECT_FLOAT_EQ(stamps[0].alpha, version == 1 ? 0.25f : version == 8 ? 0.19921875f : 0.796875f);
  // The joint, the up point, 5 around them: the stamp's own reach (5.5 at most) goes past that upwards.
  EXPECT_EQ(board.rect.right, 16.5f);
}

TEST_P(LiveStroke, GoesOnStraightWhenSmoothingIsSwitchedOffMidStroke) {
  DrawingBoard board({.version = version});
  board.down({100.0f, 50.0f});
  board.move({{108.4f, 50.0f}});
  board.takeStamps();
  board.shared.mCurveEnabled = false;
  // From the last point, not from the mid point 104.2; version 8 carries 0.2, then 0.1.
  board.move({{112.5f, 50.0f}});
  std::vector<Stamp> stamps = board.takeStamps();
  ASSERT_FALSE(stamps.empty());
  EXPECT_THAT(stamps.front(), StampNear(version == 8 ? 108.6f : 108.4f, 50.0f, 1e-3f));
  board.up({116.8f, 50.0f});
  stamps = board.takeStamps();
  ASSERT_FALSE(stamps.empty());
  EXPECT_THAT(stamps.front(), StampNear(version == 8 ? 112.6f : 112.5f, 50.0f, 1e-3f));
}

// A stylus on a touch screen reports no pressure: it is replaced in every sample. A finger's is substituted
// for drawing alone; both draw with the same.
TEST_P(LiveStroke, WritesItsCorrectionsBackIntoTheEvent) {
  const float cap = version == 5 ? 1.0f : 0.79f;
  const float substitute = version == 8 ? 0.6f : 0.5f;
  struct Case {
    int tool, source;
    float pressure;
  };
  std::vector<std::vector<float>> placed;
  for (const auto& [tool, source, pressure] : {Case{Qelt::kToolStylus, Qelt::kSourceStylus, 0.9f},
                                               Case{Qelt::kToolStylus, Qelt::kSourceTouchScreen, substitute},
                                               Case{Qelt::kToolFinger, Qelt::kSourceTouchScreen, 0.9f}}) {
    SCOPED_TRACE("tool " + std::to_string(tool) + ", source " + std::to_string(source));
    DrawingBoard board({.version = version});
    const Sample end{40.0f, 0.0f, 0.9f, 1.2f};
    for (const int action : {Qelt::kActionDown, Qelt::kActionMove, Qelt::kActionUp}) {
      std::vector<Sample> samples = {end};
      if (action == Qelt::kActionMove) samples = {{10.0f, 0.0f, 0.9f, 1.3f}, {20.0f, 0.0f, 0.9f, 0.6f}, end};
      const MotionEvent event = motionEvent(action, samples, tool, source);
      board.send(event);
      EXPECT_EQ(event.GetPressure(0), pressure) << "action " << action;
      EXPECT_EQ(event.GetTilt(0), cap) << "action " << action;
      if (action != Qelt::kActionMove) continue;
      EXPECT_EQ(event.GetHistoricalPressure(0), pressure);
      EXPECT_EQ(event.GetHistoricalPressure(1), pressure);
      EXPECT_EQ(event.GetHistoricalTilt(0), cap);
      EXPECT_EQ(event.GetHistoricalTilt(1), 0.6f);
    }
    placed.push_back(board.takeFloats());
  }
  EXPECT_NE(placed[0], placed[1]);
  EXPECT_EQ(placed[1], placed[2]);
}

INSTANTIATE_TEST_SUITE_P(Versions, LiveStroke, testing::ValuesIn(allVersions()), versionName);

TEST(EndlessSegmentTest, IsCutShortAndTheNextBeginsAtItsSpacing) {
  const LogCapture log;
  DrawingBoard board({.curve = false});
  board.down({0.0f, 0.0f});
  board.takeBatches();
  board.move({{1e30f, 0.0f}});
  EXPECT_THAT(board.takeBuffers(), ElementsAre(BatchOf(262144, 11)));
  board.move({{20.0f, 20.0f}});
  board.takeBatches();
  // 40 units, a stamp every 0.4.
  board.move({{60.0f, 20.0f}});
  EXPECT_NEAR(static_cast<double>(board.takeStamps().size()), 100.0, 1.0);
}

// Margins of version 8 are device pixels: at zoom 4 half a pixel is 0.125 units. A view that cannot be
// inverted counts as unscaled. Each call sees a change of view at once, in either direction.
TEST(ViewScaleTest, MarginsOfVersion8AreDevicePixels) {
  struct Case {
    float zoomX, zoomY, halfWidth, halfHeight;
  };
  const Case cases[] = {{4.0f, 4.0f, 5.125f, 5.125f}, {4.0f, 0.5f, 5.125f, 6.0f},
                        {0.5f, 0.5f, 6.0f, 6.0f},     {0.0f, 0.0f, 5.5f, 5.5f},
                        {kNaN, kNaN, 5.5f, 5.5f},     {kInfinity, 1.0f, 5.5f, 5.5f}};
  const std::vector<Sample> tap = {{10.0f, 10.0f}, {10.0f, 10.0f}};
  void (*const ways[])(DrawingBoard&, const std::vector<Sample>&) = {
      [](DrawingBoard& board, const auto& samples) { board.stroke(samples); },
      [](DrawingBoard& board, const auto& samples) { board.redraw(board.recorded(samples)); },
      [](DrawingBoard& board, const auto& samples) { board.redraw(*board.stored(samples)); }};
  for (const auto& draw : ways) {
    DrawingBoard board;
    for (const auto& [zoomX, zoomY, halfWidth, halfHeight] : cases) {
      Qelt::Matrix3<float> view = viewOf(zoomX);
      view[4] = zoomY;
      board.canvas.setMatrix(view);
      draw(board, tap);
      const Stamp stamp = board.takeStamps().at(0);
      EXPECT_FLOAT_EQ(stamp.halfWidth, halfWidth) << zoomX << ", " << zoomY << ", way " << &draw - ways;
      EXPECT_FLOAT_EQ(stamp.halfHeight, halfHeight) << zoomX << ", " << zoomY << ", way " << &draw - ways;
    }
  }
}

}  // namespace
}  // namespace QeltTests
