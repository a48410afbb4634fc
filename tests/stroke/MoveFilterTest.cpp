#include "stroke/parts/MoveFilter.h"

#include <gtest/gtest.h>

#include <limits>

#include "base/PointF.h"
#include "stroke/parts/SampleCleaner.h"

namespace Qelt {
namespace {

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInfinity = std::numeric_limits<float>::infinity();
constexpr PointF kOrigin{0.0f, 0.0f};

MoveFilter filter(float minimumMove, float skipDistance) {
  MoveFilter moves;
  moves.setMinimumMove(minimumMove);
  moves.restart(skipDistance);
  return moves;
}

TEST(MoveFilterTest, DropsWhatIsShorterThanTheMinimum) {
  MoveFilter moves = filter(2.0f, 2.0f);
  EXPECT_FALSE(moves.accepts(kOrigin, {1.9f, 0.0f}));
  EXPECT_FALSE(moves.accepts(kOrigin, kOrigin));
  EXPECT_TRUE(moves.accepts(kOrigin, {2.0f, 0.0f}));
  EXPECT_TRUE(moves.accepts(kOrigin, {1.5f, 1.5f}));  // 2.12 away
}

TEST(MoveFilterTest, TakesShortMovesEveryOtherTimeBeginningWithTheSecond) {
  MoveFilter moves = filter(2.0f, 20.0f);
  EXPECT_FALSE(moves.accepts(kOrigin, {5.0f, 0.0f}));
  EXPECT_TRUE(moves.accepts(kOrigin, {5.0f, 0.0f}));
  EXPECT_FALSE(moves.accepts(kOrigin, {19.9f, 0.0f}));
  // Below the minimum nothing toggles.
  EXPECT_FALSE(moves.accepts(kOrigin, {1.0f, 0.0f}));
  EXPECT_TRUE(moves.accepts(kOrigin, {5.0f, 0.0f}));
}

TEST(MoveFilterTest, BeginsTheAlternationAnewAfterALongMoveAndWithEachStroke) {
  MoveFilter moves = filter(2.0f, 20.0f);
  EXPECT_FALSE(moves.accepts(kOrigin, {5.0f, 0.0f}));  // the next short one would be taken
  EXPECT_TRUE(moves.accepts(kOrigin, {20.0f, 0.0f}));
  EXPECT_FALSE(moves.accepts(kOrigin, {5.0f, 0.0f}));
  moves.restart(20.0f);
  EXPECT_FALSE(moves.accepts(kOrigin, {5.0f, 0.0f}));
}

TEST(MoveFilterTest, DropsPointsThatAreNotFinite) {
  MoveFilter moves = filter(0.0f, 0.0f);
  for (const float bad : {kNaN, kInfinity, -kInfinity}) {
    EXPECT_FALSE(moves.accepts(kOrigin, {bad, 0.0f}));
    EXPECT_FALSE(moves.accepts(kOrigin, {0.0f, bad}));
  }
}

TEST(MoveFilterTest, MeasuresDistancesWhoseSquaresOverflow) {
  EXPECT_FLOAT_EQ(distanceBetween({-3e19f, 0.0f}, {0.0f, 4e19f}), 5e19f);
  EXPECT_EQ(distanceBetween({0.0f, 0.0f}, {3.0f, 4.0f}), 5.0f);
}

TEST(SampleCleanerTest, SubstitutesAndCaps) {
  const SampleCleaner cleaner{0.6f, 0.79f};
  EXPECT_EQ(cleaner.pressure(0.3f, kToolStylus), 0.3f);
  EXPECT_EQ(cleaner.pressure(1.7f, kToolStylus), 1.0f);
  EXPECT_EQ(cleaner.pressure(kNaN, kToolStylus), 0.6f);
  EXPECT_EQ(cleaner.pressure(0.3f, kToolFinger), 0.6f);
  EXPECT_EQ(cleaner.pressure(0.3f, kToolMouse), 0.6f);
  EXPECT_EQ(cleaner.tilt(0.5f), 0.5f);
  EXPECT_EQ(cleaner.tilt(1.2f), 0.79f);
  EXPECT_FALSE(cleaner.exceedsCap(0.79f));
  EXPECT_TRUE(cleaner.exceedsCap(0.8f));
  for (const float bad : {kNaN, kInfinity, -kInfinity}) {
    EXPECT_EQ(cleaner.tilt(bad), 0.0f);
    EXPECT_FALSE(cleaner.exceedsCap(bad));
    EXPECT_EQ(SampleCleaner::orientation(bad), 0.0f);
  }
  EXPECT_EQ(SampleCleaner::orientation(-3.1f), -3.1f);
}

TEST(SampleCleanerTest, TellsCoarseTools) {
  EXPECT_TRUE(isCoarseTool(kToolFinger, kSourceTouchScreen));
  EXPECT_TRUE(isCoarseTool(kToolMouse, kSourceMouse));
  EXPECT_TRUE(isCoarseTool(kToolStylus, kSourceTouchScreen));
  EXPECT_FALSE(isCoarseTool(kToolStylus, kSourceStylus));
  EXPECT_FALSE(isCoarseTool(kToolEraser, kSourceTouchScreen));
}

}  // namespace
}  // namespace Qelt
