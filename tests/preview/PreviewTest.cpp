#include <gmock/gmock.h>

#include <string>
#include <vector>

#include "preview/Pencil2PreviewDrawableGL.h"
#include "support/DrawableBoard.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using Qelt::Pencil2PreviewDrawableGL;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

using Panel = DrawableBoard<Pencil2PreviewDrawableGL>;

// Alpha 160: colour factor 2.
BoardOptions panel(float size, bool curve = true, int source = Qelt::kSourceStylus) {
  return {.size = size, .color = 0xA0202020u, .curve = curve, .source = source};
}

const std::vector<Sample> kSampleStroke = {{10.3f, 40.0f, 0.5f},
                                           {40.0f, 20.0f, 0.7f, 0.4f, 0.3f},
                                           {70.0f, 60.0f, 0.9f, 0.9f, 0.6f},
                                           {110.0f, 35.0f, 0.6f, 0.2f, 0.1f}};

// Kept: on curves the ramps count steps, the walk counts distances.
TEST(Preview, RampsMayOvershootAndTheNextSegmentBeginsFromTheirTargets) {
  Panel board(panel(10.0f));
  board.down({0.0f, 0.0f, 0.5f});
  // Mean tilt 1 / 3: blend (0.33333 - 0.05) / 1.9 = 0.149123, width 10 + 50 * 0.149123 = 17.456.
  board.move({{41.0f, 0.0f, 0.5f, 1.0f}});
  const std::vector<Stamp> first = board.takeStamps();
  ASSERT_THAT(first, SizeIs(25));
  // 16 steps of 0.46602 each, but 25 stamps.
  EXPECT_NEAR(first[0].halfWidth, 5.5f, 1e-4f);
  EXPECT_NEAR(first[24].halfWidth, (10.0f + 24.0f * 0.46602f + 1.0f) / 2.0f, 1e-3f);
  EXPECT_NEAR(first[0].narrowing, 0.149123f, 1e-5f);
  board.move({{82.0f, 0.0f, 0.5f, 1.0f}});
  EXPECT_NEAR(board.takeStamps()[0].halfWidth, (17.4561f + 1.0f) / 2.0f, 1e-3f);
}

// Pressures 0.8 and 0.1: 0.64 * 2 and, raised to 0.16, 0.16 * 2. Live strokes are given up half way.
TEST(Preview, NothingFadesInAndNothingIsLeftOfTheStrokeBefore) {
  Panel board(panel(10.0f));
  for (const float pressure : {0.1f, 0.8f, 0.1f}) {
    const Sample from{0.3f, 0.0f, pressure}, to{41.0f, 0.0f, pressure};
    for (const bool live : {false, true}) {
      if (live) board.down(from);
      live ? board.move({to}) : board.redraw(board.recorded({from, to}));
      const std::vector<Stamp> placed = board.takeStamps();
      EXPECT_FALSE(placed.empty());
      for (const Stamp& stamp : placed) EXPECT_NEAR(stamp.alpha, pressure == 0.8f ? 1.28f : 0.32f, 1e-5f);
    }
  }
}

TEST(Preview, FingersTakeShortMovesEveryOtherTime) {
  Panel board(
      {.color = 0xA0202020u, .curve = false, .tool = Qelt::kToolFinger, .source = Qelt::kSourceTouchScreen});
  board.down({0.0f, 0.0f, 1.0f});
  board.move({{20.0f, 0.0f}});  // left out
  EXPECT_THAT(board.takeStamps(), IsEmpty());
  board.move({{30.0f, 0.0f}});
  const std::vector<Stamp> placed = board.takeStamps();
  ASSERT_THAT(placed, SizeIs(24));            // from 0 to 30
  EXPECT_NEAR(placed[0].alpha, 0.5f, 1e-5f);  // pressure 0.5 whatever is reported
  board.move({{31.9f, 0.0f}});                // below size / 5
  board.move({{79.8f, 0.0f}});                // left out
  board.move({{80.2f, 0.0f}});                // more than 50 away: always taken
  EXPECT_THAT(board.takeStamps(), SizeIs(40));
  board.move({{130.4f, 0.0f}});
  EXPECT_THAT(board.takeStamps(), SizeIs(40));
}

// Kept: a straight replay posts no start point, a straight stroke does.
TEST(Preview, PostsTheStartPointLiveAndOnCurvedReplays) {
  for (const bool curve : {true, false}) {
    Panel board(panel(10.0f, curve));
    board.down(kSampleStroke[0]);
    EXPECT_THAT(board.takePosts(),
                ElementsAre("SetStartPoint", "SetPenData", "SetRect", "Batch", "Render", "DeleteBatch"));
    board.redraw(board.recorded(kSampleStroke));
    std::vector<std::string> ofReplay = {"SetRedrawState", "SetPenData", "SetStartPoint", "SetRect",
                                         "Batch",          "Render",     "DeleteBatch"};
    if (!curve) ofReplay.erase(ofReplay.begin() + 2);
    EXPECT_EQ(board.takePosts(), ofReplay);
  }
}

TEST(Preview, WithoutASizeCurvesLogAndNothingIsPlaced) {
  Panel board(panel(0.0f));
  LogCapture log;
  EXPECT_TRUE(board.down({0.0f, 0.0f}));
  EXPECT_TRUE(board.move({{40.0f, 0.0f}}));
  EXPECT_FALSE(board.up({80.0f, 0.0f}));
  std::vector<std::string> lines;
  for (const LogLine& line : log.take()) {
    if (line.priority == 6) lines.push_back(line.text);
  }
  // Kept: the second one names another class.
  EXPECT_THAT(lines,
              ElementsAre("Pencil2PreviewDrawableGL::drawLine, mRepeatDistance is a wrong value(0.000000).",
                          "Pencil3GL::EndPen, mRepeatDistance is a wrong value(0.000000)."));
  EXPECT_THAT(board.takeStamps(), IsEmpty());
  // The area of a replay that placed nothing is where it began, not the page's corner as well.
  EXPECT_TRUE(board.redraw(board.recorded({{50.0f, 60.0f}, {90.0f, 60.0f}})));
  EXPECT_EQ(board.rect.left, 49.0f);
  EXPECT_EQ(board.rect.top, 59.0f);
}

}  // namespace
}  // namespace QeltTests
