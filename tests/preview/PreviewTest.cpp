#include <gmock/gmock.h>

#include <cstddef>
#include <limits>
#include <string>
#include <vector>

#include "base/Error.h"
#include "engine/MotionEvent.h"
#include "preview/Pencil2PreviewDrawableGL.h"
#include "support/DrawableBoard.h"
#include "support/LogCapture.h"
#include "support/StampPicture.h"
#include "support/Stamps.h"

namespace QeltTests {
namespace {

using Qelt::Error;
using Qelt::MotionEvent;
using Qelt::Pencil2PreviewDrawableGL;
using Qelt::RectF;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

using Panel = DrawableBoard<Pencil2PreviewDrawableGL>;

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();

// Alpha 160: colour factor 2.
BoardOptions panel(float size, bool curve = true, int source = Qelt::kSourceStylus) {
  return {.size = size, .color = 0xA0202020u, .curve = curve, .source = source};
}

const std::vector<Sample> kSampleStroke = {{10.3f, 40.0f, 0.5f},
                                           {40.0f, 20.0f, 0.7f, 0.4f, 0.3f},
                                           {70.0f, 60.0f, 0.9f, 0.9f, 0.6f},
                                           {110.0f, 35.0f, 0.6f, 0.2f, 0.1f}};

TEST(Preview, TapPlacesOneStampAtTheDownPoint) {
  for (const bool curve : {true, false}) {
    Panel board(panel(10.0f, curve));
    EXPECT_TRUE(board.down({50.3f, 40.0f, 0.7f}));
    EXPECT_EQ(board.rect.left, 50.3f);
    EXPECT_EQ(board.rect.bottom, 40.0f);
    EXPECT_TRUE(board.up({52.0f, 40.0f, 0.7f}));
    const std::vector<Stamp> placed = board.takeStamps();
    ASSERT_THAT(placed, SizeIs(1));
    EXPECT_THAT(placed[0], StampNear(50.3f, 40.0f, 1e-5f));
    EXPECT_NEAR(placed[0].halfWidth, 5.5f, 1e-5f);  // (10 + 1) / 2
    EXPECT_NEAR(placed[0].alpha, 0.98f, 1e-6f);     // 0.49 * 160 / 80
    EXPECT_EQ(placed[0].tile, 0);
    EXPECT_EQ(placed[0].directionX, 0.0f);
    EXPECT_EQ(placed[0].directionY, 1.0f);
    // From the down point to the up point, 1 more, and the stamp.
    EXPECT_NEAR(board.rect.left, 44.8f, 1e-4f);
    EXPECT_NEAR(board.rect.right, 55.8f, 1e-4f);
    EXPECT_NEAR(board.rect.top, 34.5f, 1e-4f);
  }
}

TEST(Preview, CurvesCarryTheirSpacingFromSegmentToSegment) {
  Panel board(panel(10.0f));  // a stamp every 0.8
  board.down({0.0f, 0.0f});
  board.move({{41.0f, 0.0f}});  // as far as 20.5: 25 stamps, 0.3 left over
  board.move({{82.0f, 0.0f}});  // as far as 61.5: the 76th lies at 60.8
  const std::vector<Stamp> placed = board.takeStamps();
  ASSERT_THAT(placed, SizeIs(76));
  for (std::size_t i = 0; i < placed.size(); ++i) {
    EXPECT_THAT(placed[i], StampNear(0.8f * static_cast<float>(i + 1), 0.0f, 0.02f)) << i;
    EXPECT_EQ(placed[i].tile, static_cast<int>(i % 3)) << i;
  }
}

TEST(Preview, StraightSegmentsAreDividedEvenlyFromTheirOwnStart) {
  Panel board(panel(10.0f, false));
  board.down({0.0f, 0.0f});
  board.move({{41.0f, 0.0f}});  // trunc(8 / 10 * 41) = 32
  board.move({{41.0f, 5.0f}});  // 4
  const std::vector<Stamp> placed = board.takeStamps();
  ASSERT_THAT(placed, SizeIs(36));
  for (int i = 0; i < 32; ++i) {
    EXPECT_THAT(placed[i], StampNear(41.0f / 32.0f * static_cast<float>(i), 0.0f, 0.02f)) << i;
  }
  EXPECT_THAT(placed[32], StampNear(41.0f, 0.0f, 0.02f));
  EXPECT_THAT(placed[35], StampNear(41.0f, 3.75f, 0.02f));
}

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

// Pressures 0.8 and 0.1: 0.64 * 2 and, raised to 0.16, 0.16 * 2.
TEST(Preview, NothingFadesInAndNothingIsLeftOfTheStrokeBefore) {
  Panel board(panel(10.0f));
  const auto expectAlpha = [&board](float alpha) {
    const std::vector<Stamp> placed = board.takeStamps();
    EXPECT_FALSE(placed.empty());
    for (const Stamp& stamp : placed) EXPECT_NEAR(stamp.alpha, alpha, 1e-5f);
  };
  for (const float pressure : {0.1f, 0.8f, 0.1f}) {
    board.redraw(board.recorded({{0.3f, 0.0f, pressure}, {41.0f, 0.0f, pressure}}));
    expectAlpha(pressure == 0.8f ? 1.28f : 0.32f);
  }
  // Live, after one that was given up half way.
  for (const float pressure : {0.8f, 0.1f}) {
    board.down({0.3f, 0.0f, pressure});
    board.move({{41.0f, 0.0f, pressure}});
    expectAlpha(pressure == 0.8f ? 1.28f : 0.32f);
  }
}

// The live up closes at its own alpha; the end of a replay ramps to it.
TEST(Preview, TheClosingSegmentRampsInReplaysOnly) {
  Panel board(panel(10.0f, false));
  board.down({0.3f, 0.0f, 0.8f});
  board.move({{41.0f, 0.0f, 0.8f}});
  board.takeBatches();
  board.up({61.0f, 0.0f, 0.4f});
  for (const Stamp& stamp : board.takeStamps()) EXPECT_NEAR(stamp.alpha, 0.32f, 1e-5f);
  board.redraw(motionEvent(Qelt::kActionUp, {{0.3f, 0.0f, 0.8f}, {41.0f, 0.0f, 0.8f}, {61.0f, 0.0f, 0.4f}}));
  const std::vector<Stamp> placed = board.takeStamps();
  ASSERT_THAT(placed, SizeIs(48));
  EXPECT_NEAR(placed[32].alpha, 1.28f, 1e-5f);
  EXPECT_NEAR(placed[40].alpha, 0.80f, 1e-4f);  // half way
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
  board.move({{40.0f, 0.0f}});                // left out
  board.move({{85.0f, 0.0f}});                // 55 away: always taken
  EXPECT_THAT(board.takeStamps(), SizeIs(44));
}

TEST(Preview, AStylusOnATouchScreenHasItsPressureReplacedInTheEvent) {
  Panel board(panel(10.0f, true, Qelt::kSourceTouchScreen));
  board.down({0.0f, 0.0f, 0.9f});
  const MotionEvent move = motionEvent(Qelt::kActionMove, {{60.0f, 0.0f, 0.9f}, {120.0f, 0.0f, kNaN, 1.3f}},
                                       Qelt::kToolStylus, Qelt::kSourceTouchScreen);
  EXPECT_TRUE(board.send(move));
  EXPECT_EQ(move.GetHistoricalPressure(0), 0.5f);
  EXPECT_EQ(move.GetPressure(0), 0.5f);
  EXPECT_EQ(move.GetTilt(0), 1.0f);  // capped at 1, not at the strokes' 0.79
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

TEST(Preview, ReplaysDrawWhatTheLiveStrokeDrew) {
  for (const bool curve : {true, false}) {
    Panel board(panel(7.0f, curve));
    board.down(kSampleStroke[0]);
    board.move({kSampleStroke.begin() + 1, kSampleStroke.end()});
    const std::vector<float> live = board.takeFloats();
    EXPECT_TRUE(board.redraw(board.recorded(kSampleStroke)));
    std::vector<float> replayed = board.takeFloats();
    ASSERT_GE(replayed.size(), live.size());
    replayed.resize(live.size());  // then follows the closing segment
    EXPECT_EQ(replayed, live);
    for (const Sample& sample : kSampleStroke) {
      EXPECT_LT(board.rect.left, sample.x);
      EXPECT_GT(board.rect.bottom, sample.y);
    }
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
  // Straight segments do not ask for a spacing.
  board.shared.mCurveEnabled = false;
  board.down({0.0f, 0.0f});
  board.move({{40.0f, 0.0f}});
  EXPECT_TRUE(board.up({80.0f, 0.0f}));
  EXPECT_THAT(board.takeStamps(), IsEmpty());
}

// A size that is none when the pen goes down gives way to the first that is one, in segments and taps alike.
// (Curves have no spacing to be walked at then.)
TEST(Preview, BegunWithoutASizeTakesItsWidthFromTheFirstThatIsOne) {
  const auto drawn = [](float begun, bool taps) {
    Panel board(panel(begun));
    board.shared.mCurveEnabled = false;
    board.down({0.0f, 0.0f});
    board.settings.size = 10.0f;
    if (!taps) board.move({{40.0f, 0.0f}, {80.0f, 20.0f}});
    board.up({80.0f, 20.0f});
    return board.takeFloats();
  };
  for (const float none : {0.0f, -3.0f, std::numeric_limits<float>::quiet_NaN()}) {
    EXPECT_EQ(drawn(none, false), drawn(10.0f, false)) << none;
    EXPECT_EQ(drawn(none, true), drawn(10.0f, true)) << none;
  }
}

TEST(Preview, RefusesWhatIsMissing) {
  Panel board(panel(10.0f));
  const MotionEvent event = board.recorded(kSampleStroke);
  const MotionEvent* const none = nullptr;
  RectF rect;
  EXPECT_TRUE(isRefused([&] { return board.drawable->Draw(none, &rect); }));
  EXPECT_TRUE(isRefused([&] { return board.drawable->Draw(&event, nullptr); }));
  EXPECT_TRUE(isRefused([&] { return board.drawable->RedrawPen(none, &rect); }));
  EXPECT_TRUE(isRefused([&] { return board.drawable->RedrawPen(&event, nullptr); }));
  EXPECT_TRUE(board.drawable->RedrawPen(static_cast<const Qelt::List*>(nullptr), nullptr));
  Error::SetError(0);
  EXPECT_FALSE(board.move({{1.0f, 1.0f}}));  // before any down: only the batch is handed over
  EXPECT_THAT(board.takePosts(), ElementsAre("SetRect", "Batch", "Render", "DeleteBatch"));
  board.drawable->SetCanvas(nullptr);
  EXPECT_FALSE(board.down({1.0f, 1.0f}));
  EXPECT_FALSE(board.redraw(event));
  EXPECT_THAT(board.takePosts(), IsEmpty());
  EXPECT_EQ(Error::GetError(), 0u);
  Pencil2PreviewDrawableGL orphan(nullptr, nullptr);
  orphan.SetCanvas(&board.canvas);
  EXPECT_FALSE(orphan.Draw(&event, &rect));
  EXPECT_FALSE(orphan.RedrawPen(&event, &rect));

  const MotionEvent empty = motionEvent(Qelt::kActionUp, {{1.0f, 1.0f}});  // no history
  board.drawable->SetCanvas(&board.canvas);
  EXPECT_TRUE(board.redraw(empty));  // Kept: curves answer true all the same
  EXPECT_EQ(Error::GetError(), Error::kInvalidArgument);
  board.shared.mCurveEnabled = false;
  EXPECT_TRUE(isRefused([&] { return board.redraw(empty); }));
}

// Kept: the grain's x goes by the height of its tile on screen, its y by the width.
TEST(PreviewPicture, GrainSwapsWidthAndHeight) {
  BoardOptions options = panel(199.0f);
  options.width = 420;
  options.height = 210;
  Panel board(options);
  Qelt::Matrix3<float> wide;
  wide.setScale(2.0f, 1.0f);
  board.canvas.setMatrix(wide);
  board.stroke({{103.3f, 104.7f, 0.5f, 0.0f, 0.4f}});
  const std::vector<Stamp> placed = board.takeStamps();
  ASSERT_THAT(placed, SizeIs(1));
  const std::vector<std::uint8_t> pixels = board.pixels();

  StampPicture expected{.stamp = placed[0], .zoomX = 2.0f, .startX = 206.6f, .startY = 104.7f};
  expected.grainX = 150.0f;  // the height of a 150-unit tile in this view
  expected.grainY = 300.0f;  // its width
  EXPECT_LT(expected.shareOff(pixels, options.width, options.height, 0.47f), 0.02);
  std::swap(expected.grainX, expected.grainY);
  EXPECT_GT(expected.shareOff(pixels, options.width, options.height, 0.47f), 0.5);
}

}  // namespace
}  // namespace QeltTests
