#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <string>
#include <utility>
#include <vector>

#include "engine/MotionEvent.h"
#include "support/DrawableBoard.h"

namespace QeltTests {
namespace {

using Qelt::MotionEvent;
using testing::ElementsAre;

class LiveStroke : public testing::TestWithParam<int> {
 protected:
  const int version = GetParam();
  const ExpectedVersion& expected = expectedOf(version);
};

// Every action in every state: up, down, moving.
TEST_P(LiveStroke, FollowsTheTableOfStates) {
  constexpr int down = Qelt::kActionDown, move = Qelt::kActionMove, up = Qelt::kActionUp,
                cancel = Qelt::kActionCancel;
  struct Step {
    int action;
    float x;
    bool answer, draws;
  };
  // Up: only a down counts. Down: a cancel changes nothing, a second down starts anew, an up ends. Moving: a
  // cancel changes nothing, a down starts anew without ending the old stroke. Up again.
  const Step steps[] = {
      {move, 30.0f, false, false}, {up, 30.0f, false, false},     {cancel, 30.0f, false, false},
      {7, 30.0f, false, false},    {down, 10.0f, true, false},    {cancel, 30.0f, false, false},
      {down, 50.0f, true, false},  {up, 50.0f, true, true},       {down, 10.0f, true, false},
      {move, 30.0f, true, true},   {cancel, 30.0f, false, false}, {move, 50.0f, true, true},
      {down, 90.0f, true, false},  {up, 90.0f, true, true},       {up, 90.0f, false, false},
      {move, 30.0f, false, false}};
  DrawingBoard board({.version = version});
  for (const Step& step : steps) {
    SCOPED_TRACE("step " + std::to_string(&step - steps));
    const auto& [action, x, answer, draws] = step;
    EXPECT_EQ(board.send(action, {{x, 10.0f}}), answer);
    const std::vector<Stamp> stamps = board.takeStamps();
    EXPECT_EQ(!stamps.empty(), draws);
    if (action == up && draws) {
      EXPECT_THAT(stamps, ElementsAre(StampNear(x, 10.0f, 0.0f)));
    }
    EXPECT_EQ(board.rect.right != 0.0f, answer);
  }
}

// Nothing but short moves: the stroke ends as a tap where it began. Its alpha shows the pressure, which
// fingers, mice and a stylus on a touch screen are given. Of those even longer moves are short.
TEST_P(LiveStroke, EndsAsATapWhenEveryMoveWasDropped) {
  for (const auto& [tool, source] : {std::pair{Qelt::kToolStylus, Qelt::kSourceStylus},
                                     {Qelt::kToolFinger, Qelt::kSourceTouchScreen},
                                     {Qelt::kToolMouse, Qelt::kSourceMouse},
                                     {Qelt::kToolStylus, Qelt::kSourceTouchScreen}}) {
    SCOPED_TRACE("tool " + std::to_string(tool) + ", source " + std::to_string(source));
    const bool isPen = source == Qelt::kSourceStylus;
    const float shortMove = isPen ? 2.0f : expected.shortMove;  // a fifth of the size
    DrawingBoard board({.version = version, .color = 0x50202020u, .tool = tool, .source = source});
    board.down({10.0f, 10.0f, 0.9f});
    board.move({{9.8f + shortMove, 10.0f, 0.9f}});
    EXPECT_TRUE(board.up({11.5f, 10.0f, isPen ? expected.unknownPressure : 0.9f}));
    const std::vector<Stamp> stamps = board.takeStamps();
    ASSERT_THAT(stamps, ElementsAre(StampNear(10.0f, 10.0f, 0.0f)));
    EXPECT_EQ(stamps[0].tile, 0);
    EXPECT_FLOAT_EQ(stamps[0].alpha, expected.tapAlpha);
    // The joint, the up point, 5 around them: the stamp's own reach goes past that upwards, if anywhere.
    EXPECT_EQ(board.rect.right, 16.5f);
    board.down({10.0f, 10.0f});
    board.move({{10.2f + shortMove, 10.0f}});
    EXPECT_FALSE(board.takeStamps().empty());
  }
}

TEST_P(LiveStroke, GoesOnStraightWhenSmoothingIsSwitchedOffMidStroke) {
  DrawingBoard board({.version = version});
  board.down({100.0f, 50.0f});
  board.move({{108.4f, 50.0f}});
  board.takeStamps();
  board.shared.mCurveEnabled = false;
  // From the last point, not from the mid point 104.2.
  board.move({{112.5f, 50.0f}});
  std::vector<Stamp> stamps = board.takeStamps();
  ASSERT_FALSE(stamps.empty());
  EXPECT_THAT(stamps.front(), StampNear(108.4f + expected.firstStampAt(4.2f), 50.0f, 1e-3f));
  board.up({116.8f, 50.0f});
  stamps = board.takeStamps();
  ASSERT_FALSE(stamps.empty());
  EXPECT_THAT(stamps.front(), StampNear(112.5f + expected.firstStampAt(8.3f), 50.0f, 1e-3f));
}

// A stylus on a touch screen reports no pressure: it is replaced in every sample. A finger's is substituted
// for drawing alone; both draw with the same.
TEST_P(LiveStroke, WritesItsCorrectionsBackIntoTheEvent) {
  const auto& [unknownPressure, cap] = std::pair(expected.unknownPressure, expected.tiltCap);
  struct Case {
    int tool, source;
    float pressure;
  };
  std::vector<std::vector<float>> placed;
  for (const auto& [tool, source, pressure] :
       {Case{Qelt::kToolStylus, Qelt::kSourceStylus, 0.9f},
        Case{Qelt::kToolStylus, Qelt::kSourceTouchScreen, unknownPressure},
        Case{Qelt::kToolFinger, Qelt::kSourceTouchScreen, 0.9f}}) {
    SCOPED_TRACE("tool " + std::to_string(tool) + ", source " + std::to_string(source));
    DrawingBoard board({.version = version});
    for (const int action : {Qelt::kActionDown, Qelt::kActionMove, Qelt::kActionUp}) {
      const MotionEvent event = motionEvent(
          action, {{10.0f, 0.0f, 0.9f, 1.3f}, {20.0f, 0.0f, 0.9f, 0.6f}, {80.0f, 0.0f, 0.9f, 1.2f}}, tool,
          source);
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

// What the queue would not delete goes first; until it does, nothing new is handed over.
TEST(RefusedDeletion, IsOfferedAgainAheadOfTheNextBatch) {
  DrawingBoard board;
  board.down({10.0f, 10.0f});
  board.takePosts();
  board.queue.accept = [](const Qelt::ITask& task) { return taskName(task) != "DeleteBatch"; };
  board.move({{30.0f, 10.0f}});
  EXPECT_THAT(board.takePosts(), ElementsAre("SetRect", "Batch", "Render"));
  board.move({{50.0f, 10.0f}});
  EXPECT_THAT(board.takePosts(), ElementsAre("SetRect"));
  board.queue.accept = nullptr;
  board.move({{70.0f, 10.0f}});
  EXPECT_THAT(board.takePosts(), ElementsAre("SetRect", "DeleteBatch", "Batch", "Render", "DeleteBatch"));
}

// So long that rounding shortens most steps from stamp to stamp, and the segment takes hundreds of stamps
// more than its length holds of spacings.
TEST(FarMove, HandsOverEveryStampOfItsWay) {
  DrawingBoard board({.curve = false});
  board.down({0.0f, 10.0f});
  board.move({{60000.0f, 10.0f}});
  const std::vector<Stamp> stamps = board.takeStamps();
  ASSERT_GT(stamps.size(), 150100u);
  for (std::size_t i = 1; i < stamps.size(); ++i) {
    ASSERT_NEAR(stamps[i].x - stamps[i - 1].x, 0.4f, 0.005f) << i;
    ASSERT_EQ(stamps[i].tile, (stamps[i - 1].tile + 1) % 3) << i;
  }
  EXPECT_NEAR(stamps.back().x, 60000.0f, 0.41f);
}

// Margins of version 8 are device pixels: at zoom 4 half a pixel is 0.125 units. A view that cannot be
// inverted counts as unscaled. Each call sees a change of view at once, in either direction.
TEST(ViewScaleTest, MarginsOfVersion8AreDevicePixels) {
  struct Case {
    float zoomX, zoomY, halfWidth, halfHeight;
  };
  const Case cases[] = {{4.0f, 4.0f, 5.125f, 5.125f},
                        {4.0f, 0.5f, 5.125f, 6.0f},
                        {0.0f, 0.0f, 5.5f, 5.5f},
                        {NAN, NAN, 5.5f, 5.5f},
                        {INFINITY, 1.0f, 5.5f, 5.5f}};
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
