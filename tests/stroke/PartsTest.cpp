#include <gmock/gmock.h>

#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <numbers>
#include <random>
#include <utility>
#include <vector>

#include "base/PointF.h"
#include "base/RectF.h"
#include "graphics/SmPath.h"
#include "stroke/input/LiveInput.h"
#include "stroke/input/MoveFilter.h"
#include "stroke/input/PenAttitude.h"
#include "stroke/input/SampleCleaner.h"
#include "stroke/placing/PatternShift.h"
#include "stroke/placing/SegmentPath.h"
#include "stroke/placing/StampRun.h"
#include "stroke/placing/StampWalk.h"
#include "support/Board.h"

namespace Qelt {
namespace {

using testing::ElementsAre;
using testing::FloatNear;
using testing::IsEmpty;
using testing::Pointwise;
using testing::SizeIs;

// --- Input ---

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

// Each move from the origin along x, and whether it is taken.
TEST(MoveFilterTest, TakesShortMovesEveryOtherTimeBeginningWithTheSecond) {
  MoveFilter moves = filter(2.0f, 20.0f);
  const std::pair<float, bool> cases[] = {{5.0f, false},  {5.0f, true},
                                          {19.9f, false}, {1.0f, false},  // below the minimum nothing toggles
                                          {5.0f, true},   {5.0f, false},  // the next short one would be taken
                                          {20.0f, true},  {5.0f, false}};  // a long one begins anew
  for (const auto& [x, taken] : cases) EXPECT_EQ(moves.accepts(kOrigin, {x, 0.0f}), taken) << x;
  moves.restart(20.0f);  // as each stroke does
  EXPECT_FALSE(moves.accepts(kOrigin, {5.0f, 0.0f}));
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

// --- Attitude ---

constexpr float kPi = std::numbers::pi_v<float>;

// Against the mean as one would write it down: all slots from 0 upwards, in single precision.
template <int Size>
void expectTheSameMeans(unsigned seed) {
  std::mt19937 random(seed);
  std::uniform_real_distribution<float> values(-4.0f, 4.0f);
  MeanRing<Size> ring;
  std::array<float, Size> slots{};
  int counter = 0;
  for (int push = 0; push < 4 * Size + 3; ++push) {
    // Now and then a new stroke, at any state of the ring.
    if (random() % 97 == 0) {
      slots.fill(values(random));
      ring.fill(slots[0]);
      counter = 0;
    }
    const float value = values(random) * ((random() % 8 == 0) ? 1000.0f : 1.0f);
    ring.push(value);
    slots[counter++ % Size] = value;
    float sum = 0.0f;
    for (const float slot : slots) sum += slot;
    ASSERT_EQ(std::bit_cast<std::uint32_t>(ring.mean()),
              std::bit_cast<std::uint32_t>(sum / static_cast<float>(Size)))
        << "push " << push << " of seed " << seed;
  }
}

TEST(MeanRingTest, EqualsAPlainSumBitForBitOverAllWraps) {
  for (unsigned seed = 1; seed <= 200; ++seed) {
    expectTheSameMeans<70>(seed);
    expectTheSameMeans<50>(seed);
    expectTheSameMeans<3>(seed);
  }
}

TEST(PenAttitudeTest, DoesNotJumpWhereTheAngleWraps) {
  struct Case {
    float before, after, mean;
  };
  const Case cases[] = {
      // -3.1 lies 0.083 beyond 3.1, as 3.1831853: (49 * 3.1 + 3.1831853) / 50. And the other way round.
      {3.1f, -3.1f, 3.1016637f},
      {-3.1f, 3.1f, -3.1016637f},
      // Turns of up to half a turn are left alone: (49 - 1) / 50; exactly half a turn is not beyond.
      {1.0f, -1.0f, 0.96f},
      {1.0f, 1.0f - kPi, 1.0f - kPi / 50.0f},
      // From 0 there is no other side.
      {0.0f, -3.1f, -0.062f}};
  PenAttitude<70, 50> attitude;
  for (const auto& [before, after, mean] : cases) {
    attitude.fill(0.0f, before);
    attitude.push(0.0f, after);
    EXPECT_NEAR(attitude.meanOrientation(), mean, 1e-5f) << before << " to " << after;
  }
  // Samples on both sides settle half way between 3.1 and 3.1831853.
  attitude.fill(0.0f, 3.1f);
  for (int push = 0; push < 200; ++push) attitude.push(0.0f, push % 2 == 0 ? -3.1f : 3.1f);
  EXPECT_NEAR(attitude.meanOrientation(), 3.1415927f, 1e-4f);
}

TEST(PatternShiftTest, MovesEvery300Segments) {
  PatternShift shift;
  for (int segment = 1; segment <= 600; ++segment) {
    shift.countSegment();
    ASSERT_EQ(shift.offset().x, segment < 300 ? 0.0f : segment < 600 ? 77.0f : 154.0f) << segment;
    ASSERT_EQ(shift.offset().y, segment < 300 ? 0.0f : segment < 600 ? 37.0f : 74.0f) << segment;
  }
  EXPECT_EQ(shift.segments(), 0);
}

// --- Walks ---

// A path from the origin along x.
class Line {
 public:
  explicit Line(float length) {
    mPath.moveTo(0.0f, 0.0f);
    mPath.lineTo(length, 0.0f);
    mPath.resetPath(0);
  }

  std::vector<float> evenly(int count, float length, int most = kMostStampsPerSegment) {
    Places places;
    result = walkEvenly(mPath, count, length, most, places);
    passedOver = places.passedOver;
    return places.at;
  }

  std::vector<float> spaced(float first, float spacing, float length, int most = kMostStampsPerSegment) {
    Places places;
    result = walkSpaced(mPath, first, spacing, length, most, places);
    passedOver = places.passedOver;
    return places.at;
  }

  WalkResult result{};
  std::vector<float> passedOver;

 private:
  struct Places {
    void operator()(SmPoint point) { at.push_back(point.x); }
    void passOver(float distance) { passedOver.push_back(distance); }
    std::vector<float> at, passedOver;
  };

  SmPath mPath;
};

// At 2^24 the next float is 2 away: 0.4 more is the same number.
TEST(SpacedWalkTest, EndsWhereItCanNoLongerAdvance) {
  Line line(33554432.0f);
  EXPECT_LE(line.spaced(16777216.0f, 0.4f, 33554432.0f).size(), 1u);
  EXPECT_TRUE(line.result.cutShort);
  EXPECT_EQ(line.result.carry, 0.4f);
}

TEST(WalksTest, StopWhereThePathHasNoPositionAndGiveAPointItsOneStamp) {
  Line line(1.0f);
  EXPECT_THAT(line.evenly(4, 2.0f), Pointwise(FloatNear(1e-4f), {0.0f, 0.5f, 1.0f}));
  EXPECT_FALSE(line.result.cutShort);
  EXPECT_THAT(Line(0.0f).evenly(1, 0.0f), ElementsAre(0.0f));
  // A segment shorter than what is carried shortens that.
  EXPECT_THAT(line.spaced(0.75f, 0.5f, 0.25f), IsEmpty());
  EXPECT_EQ(line.result.carry, 0.5f);  // 0.75 - 0.25
  // A stamp at the very end is taken.
  EXPECT_THAT(line.spaced(0.5f, 0.5f, 1.0f), SizeIs(2));
  EXPECT_EQ(line.result.carry, 0.5f);
}

TEST(WalksTest, EndAtTheBoundOnStamps) {
  Line line(1e6f);
  EXPECT_EQ(line.spaced(0.4f, 0.4f, 1e6f).size(), static_cast<std::size_t>(kMostStampsPerSegment));
  EXPECT_TRUE(line.result.cutShort);
  EXPECT_EQ(line.result.carry, 0.4f);
  EXPECT_EQ(line.evenly(1'000'000, 1e6f).size(), static_cast<std::size_t>(kMostStampsPerSegment));
  EXPECT_TRUE(line.result.cutShort);
  EXPECT_EQ(line.evenly(kMostStampsPerSegment, 1e6f).size(), static_cast<std::size_t>(kMostStampsPerSegment));
  EXPECT_FALSE(line.result.cutShort);
}

// Past the bound of a call the rest of a segment is only walked: the carry is what it would have been.
TEST(WalksTest, PassOverWhatIsBeyondTheMostWanted) {
  Line line(10.0f);
  EXPECT_THAT(line.spaced(1.0f, 4.0f, 10.0f, 2), ElementsAre(1.0f, 5.0f));
  EXPECT_THAT(line.passedOver, ElementsAre(9.0f));
  EXPECT_EQ(line.result.carry, 3.0f);
  EXPECT_EQ(line.result.stamps, 3);
  EXPECT_THAT(line.evenly(4, 10.0f, 1), ElementsAre(0.0f));
  EXPECT_THAT(line.passedOver, ElementsAre(2.5f, 5.0f, 7.5f));
  EXPECT_EQ(line.result.stamps, 4);
}

TEST(WalksTest, EndOnPathsWithoutAFiniteLength) {
  for (const float length :
       {std::numeric_limits<float>::infinity(), std::numeric_limits<float>::quiet_NaN()}) {
    Line line(length);
    EXPECT_THAT(line.spaced(0.4f, 0.4f, length), IsEmpty());
    EXPECT_EQ(line.result.carry, 0.4f);
    EXPECT_TRUE(line.result.cutShort);
    EXPECT_THAT(line.evenly(std::numeric_limits<int>::max(), length), IsEmpty());
  }
}

TEST(SpacedStampsTest, NeverReservesTooLittle) {
  std::mt19937 random(7);
  std::uniform_real_distribution<float> lengths(0.0f, 300.0f);
  for (int round = 0; round < 2000; ++round) {
    const float length = lengths(random);
    const float first = lengths(random) * 0.01f;
    Line line(length);
    const std::size_t placed = line.spaced(first, 0.4f, length).size();
    const auto reserved = static_cast<std::size_t>(spacedStamps(first, 0.4f, length));
    ASSERT_GE(reserved, placed) << first << " on " << length;
    ASSERT_LE(reserved, placed + 2) << first << " on " << length;
  }
  EXPECT_EQ(spacedStamps(0.4f, 0.4f, 1e30f), kMostStampsPerSegment);
  EXPECT_EQ(spacedStamps(0.4f, 0.4f, std::numeric_limits<float>::quiet_NaN()), 0);

  // A point that is dropped asks for no room: from (0, 0) over (4, 0) to (8, 0), 20 stamps and two a point.
  EXPECT_EQ(stampsOfMove(QeltTests::motionEvent(kActionMove, {{4.0f, 0.0f}, {kNaN, 0.0f}, {8.0f, 0.0f}}),
                         {0.0f, 0.0f}, {0.0f, 0.0f}, 0.4f),
            26);
}

// From (0, 0) over (10, 0) to (10, 10): mid points (5, 0) and (10, 5); the curve between them is controlled
// by the corner and passes through (5 / 4 + 10 / 2 + 10 / 4, 0 + 0 + 5 / 4) = (8.75, 1.25) half way.
TEST(SegmentPathTest, RunsFromMidPointToMidPointAroundTheInputPoint) {
  SegmentPath path;
  path.start({0.0f, 0.0f});
  EXPECT_FLOAT_EQ(path.extend({10.0f, 0.0f}, Smoothing::Curve), 5.0f);
  path.setLast({10.0f, 0.0f});
  const float length = path.extend({10.0f, 10.0f}, Smoothing::Curve);
  EXPECT_EQ(path.mid().x, 10.0f);
  EXPECT_EQ(path.mid().y, 5.0f);
  SmPoint at;
  ASSERT_TRUE(path.path().getPosTan(0.0f, &at, nullptr));
  EXPECT_NEAR(at.x, 5.0f, 0.01f);
  EXPECT_NEAR(at.y, 0.0f, 0.01f);
  ASSERT_TRUE(path.path().getPosTan(length * 0.5f, &at, nullptr));
  EXPECT_NEAR(at.x, 8.75f, 0.01f);
  EXPECT_NEAR(at.y, 1.25f, 0.01f);

  // The closing one ends at the up point itself.
  path.setLast({10.0f, 10.0f});
  EXPECT_FLOAT_EQ(path.close({10.0f, 12.0f}, Smoothing::Curve), 7.0f);
}

// Whatever is no number about a stamp, first or last: the box is that of the other two.
TEST(DirtyBoxTest, LeavesOutEdgesThatAreNoNumbers) {
  for (const auto& [x, y, reach] : {std::array{kNaN, 5.0f, 1.0f}, {5.0f, kNaN, 1.0f}, {5.0f, 5.0f, kNaN}}) {
    for (const int bad : {0, 1, 2}) {
      DirtyBox box;
      if (bad == 0) box.add(x, y, reach);
      box.add(0.0f, 0.0f, 2.0f);
      if (bad == 1) box.add(x, y, reach);
      box.add(9.0f, 9.0f, 2.0f);
      if (bad == 2) box.add(x, y, reach);
      RectF rect{3.0f, 4.0f, 3.0f, 4.0f};
      box.uniteInto(&rect);
      EXPECT_THAT((std::array{rect.left, rect.top, rect.right, rect.bottom}),
                  ElementsAre(-2.0f, -2.0f, 11.0f, 11.0f));
    }
  }
}

TEST(StampCounterTest, LetsTheShapesTakeTurnsEvenPastTheLargestCount) {
  StampCounter stamps(std::numeric_limits<std::int32_t>::max() - 1);  // 2147483646 = 3 * 715827882
  for (const int shape : {0, 1, 2, 0}) EXPECT_EQ(stamps.next(), shape);
  EXPECT_GT(stamps.count(), 0);
}

}  // namespace
}  // namespace Qelt
