#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <vector>

#include "engine/MotionEvent.h"
#include "outline/OutlineDrawables.h"
#include "support/DrawableBoard.h"

namespace QeltTests {
namespace {

using Qelt::MotionEvent;
using testing::ElementsAre;
using testing::SizeIs;

class OutlineVersions : public testing::TestWithParam<int> {
 protected:
  const int version = GetParam();

  // Stamps up to 1 unit wide are drawn 1.3 wide in versions 1 to 3, all of them 1 wider in 4 and 5.
  float halfOf(float size) const { return (version >= 4 ? size + 1.0f : size > 1.0f ? size : 1.3f) / 2.0f; }
};

const std::vector<Sample> kStroke = {{10.7f, 20.2f},
                                     {31.3f, 24.6f, 0.5f, 0.3f, 0.2f},
                                     {55.1f, 20.9f, 0.9f, 0.77f, 0.9f},
                                     {70.4f, 41.8f, 0.4f, 0.95f, 1.2f}};

TEST_P(OutlineVersions, OnePointIsOneStampCutToWholeNumbers) {
  for (const bool curve : {true, false}) {
    OutlineBoard board({.version = version, .curve = curve});
    board.drawable->SetOutlineSize(3.0f);
    for (const std::size_t stream : {0u, 1u}) {
      EXPECT_TRUE(board.outline({{10.7f, -20.9f, 0.5f, 0.0f, 0.5f}}));
      const Stamp stamp = board.takeStamps(stream).back();
      EXPECT_THAT(stamp, StampNear(10.0f, -20.0f, 1e-5f));
      EXPECT_NEAR(stamp.directionX, -std::sin(0.5f), 1e-6f);
      EXPECT_NEAR(stamp.directionY, std::cos(0.5f), 1e-6f);
      EXPECT_EQ(stamp.narrowing, 0.0f);
      // The size reached so far is 0; the second stream is larger by the outline size.
      EXPECT_NEAR(stamp.halfWidth, halfOf(0.0f) + (stream == 1 ? 3.0f : 0.0f), 1e-5f);
    }
    // The area goes by the point itself: 1 around the end, a straight replay 5, the outline size 3.
    EXPECT_NEAR(board.rect.left, 10.7f - 4.0f - (curve ? 0.0f : 5.0f), 1e-4f);
    EXPECT_NEAR(board.rect.bottom, -20.9f + 4.0f + (curve ? 0.0f : 5.0f), 1e-4f);
  }
}

TEST_P(OutlineVersions, TheSizeReachedGoesOnToTheNextOutline) {
  OutlineBoard board({.version = version, .size = 4.0f, .curve = false});
  const std::vector<Sample> line = {{0.0f, 0.0f}, {40.0f, 0.0f}};
  board.outline(line);
  EXPECT_NEAR(board.takeStamps().front().halfWidth, halfOf(0.0f), 1e-6f);
  // A tap does not change it, nor does the end of a stroke.
  for (int i = 0; i < 2; ++i) {
    board.outline({{5.0f, 5.0f}});
    EXPECT_NEAR(board.takeStamps().front().halfWidth, halfOf(4.0f), 1e-5f);
  }
  board.settings.size = 8.0f;
  board.outline(line);
  const std::vector<Stamp> stamps = board.takeStamps();
  EXPECT_NEAR(stamps.front().halfWidth, halfOf(4.0f), 1e-5f);
  EXPECT_GT(stamps[stamps.size() / 3].halfWidth, stamps.front().halfWidth);
}

TEST_P(OutlineVersions, EventsAndStoredStrokesGiveTheSameOutlineInTwoStreams) {
  for (const bool curve : {true, false}) {
    OutlineBoard board({.version = version, .size = 6.0f, .curve = curve});
    board.outline(kStroke);  // brings the size up
    EXPECT_THAT(board.takePosts(), ElementsAre("SetRect", "Batch", "Render", "DeleteBatch", "DeleteBatch"));
    board.takeBuffers();
    EXPECT_TRUE(board.outline(kStroke));
    const auto fromEvent = board.takeBuffers();
    ASSERT_THAT(fromEvent, SizeIs(2));
    EXPECT_FALSE(fromEvent[0].empty());
    EXPECT_TRUE(board.outline(*board.stored(kStroke)));
    EXPECT_EQ(board.takeBuffers(), fromEvent);
  }
}

INSTANTIATE_TEST_SUITE_P(Versions, OutlineVersions, testing::ValuesIn(outlineVersions()), versionName);

// --- What tells the versions apart ---

// Kept: a segment below 1 moves the mid point and enters the histories, but neither the last point nor the
// mean orientation that the next sample is unwrapped against.
TEST(Outline, VersionOneDropsShortSegmentsAndKeepsTheMeanOrientation) {
  OutlineBoard board({.version = 1, .size = 1.0f, .curve = false});
  // Mean 3.0. The sample -3.0 becomes 3.2832 and would raise the mean to 3.0057; -0.139 lies within pi of
  // 3.0, but not of 3.0057.
  board.outline(
      {{0.0f, 0.0f, 0.5f, 0.0f, 3.0f}, {0.5f, 0.0f, 0.5f, 0.0f, -3.0f}, {10.0f, 0.0f, 0.5f, 0.0f, -0.139f}});
  const std::vector<Stamp> stamps = board.takeStamps();
  ASSERT_FALSE(stamps.empty());
  EXPECT_EQ(stamps[0].x, 0.0f);
  const float mean = (48.0f * 3.0f + 3.283185f - 0.139f) / 50.0f;
  EXPECT_NEAR(stamps[0].directionX, -std::sin(mean), 1e-5f);
  EXPECT_NEAR(stamps[0].directionY, std::cos(mean), 1e-5f);
}

TEST(Outline, FingersTakeShortMovesEveryOtherTime) {
  OutlineBoard finger(
      {.version = 3, .curve = false, .tool = Qelt::kToolFinger, .source = Qelt::kSourceTouchScreen});
  finger.outline({{0.0f, 0.0f}, {20.0f, 0.0f}, {40.0f, 0.0f}});
  // From 0 to 40 in one segment of 32 stamps, and the one of the end.
  EXPECT_THAT(finger.takeStamps(), SizeIs(33));
  for (const int version : outlineVersions()) {
    const auto stampsOf = [version](int tool, float move) {
      OutlineBoard board({.version = version, .curve = false, .tool = tool});
      board.outline({{0.0f, 0.0f}, {move, 0.0f}, {2.0f * move, 0.0f}});
      return board.takeStamps().size();
    };
    // 50 units are far enough.
    EXPECT_EQ(stampsOf(Qelt::kToolFinger, 50.7f), stampsOf(Qelt::kToolStylus, 50.7f)) << version;
    EXPECT_NE(stampsOf(Qelt::kToolFinger, 49.8f), stampsOf(Qelt::kToolStylus, 49.8f)) << version;
  }
}

// A record that could not be made is no reason to crash.
TEST(Outline, ScalesComeFromTheScreenAndNothingFromNowhere) {
  OutlineBoard board({.version = 4, .size = 10.0f});
  EXPECT_EQ(board.drawable->getSpeedScale(), 0.0f);  // Kept: no screen, where a stroke answers 1
  Qelt::Pencil2OutlineDrawableGLV4 orphan(nullptr, nullptr);
  orphan.SetCanvas(&board.canvas);
  const MotionEvent event = board.recorded(kStroke);
  EXPECT_FALSE(orphan.DrawOutline(&event, &board.rect));
  EXPECT_EQ(orphan.getSpeedScale(), 0.0f);
}

}  // namespace
}  // namespace QeltTests
