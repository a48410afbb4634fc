#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <limits>
#include <random>
#include <vector>

#include "graphics/SmPath.h"
#include "stroke/parts/SegmentPath.h"
#include "stroke/parts/StampCounter.h"
#include "stroke/parts/StampWalk.h"

namespace Qelt {
namespace {

using testing::ElementsAre;
using testing::FloatNear;
using testing::IsEmpty;

// A path from the origin along x.
class Line {
 public:
  explicit Line(float length) {
    mPath.moveTo(0.0f, 0.0f);
    mPath.lineTo(length, 0.0f);
    mPath.resetPath(0);
  }

  std::vector<float> evenly(int count, float length) {
    std::vector<float> at;
    cutShort = walkEvenly(mPath, count, length, [&at](SmPoint point) { at.push_back(point.x); });
    return at;
  }

  std::vector<float> spaced(float first, float spacing, float length) {
    std::vector<float> at;
    const WalkResult result =
        walkSpaced(mPath, first, spacing, length, [&at](SmPoint point) { at.push_back(point.x); });
    carry = result.carry;
    cutShort = result.cutShort;
    return at;
  }

  float carry = 0.0f;
  bool cutShort = false;

 private:
  SmPath mPath;
};

auto near(float x) {
  return FloatNear(x, 1e-4f);
}

TEST(EvenWalkTest, StartsAtTheBeginningAndEndsOneStepShort) {
  Line line(1.0f);
  EXPECT_THAT(line.evenly(4, 1.0f), ElementsAre(near(0.0f), near(0.25f), near(0.5f), near(0.75f)));
  EXPECT_THAT(line.evenly(0, 1.0f), IsEmpty());
  // It stops where the path has no position, and gives a point its one stamp.
  EXPECT_THAT(line.evenly(4, 2.0f), ElementsAre(near(0.0f), near(0.5f), near(1.0f)));
  EXPECT_FALSE(line.cutShort);
  EXPECT_THAT(Line(0.0f).evenly(1, 0.0f), ElementsAre(0.0f));
}

TEST(SpacedWalkTest, PlacesFromTheCarriedDistanceAndCarriesTheRest) {
  Line line(2.25f);
  EXPECT_THAT(line.spaced(0.5f, 0.5f, 2.25f), ElementsAre(near(0.5f), near(1.0f), near(1.5f), near(2.0f)));
  EXPECT_EQ(line.carry, 0.25f);  // 2.5 - 2.25
  EXPECT_FALSE(line.cutShort);
  // A stamp at the very end is taken.
  EXPECT_THAT(line.spaced(0.5f, 0.5f, 2.0f), ElementsAre(near(0.5f), near(1.0f), near(1.5f), near(2.0f)));
  EXPECT_EQ(line.carry, 0.5f);
  // A segment shorter than what is carried shortens that.
  EXPECT_THAT(line.spaced(0.75f, 0.5f, 0.25f), IsEmpty());
  EXPECT_EQ(line.carry, 0.5f);  // 0.75 - 0.25
  EXPECT_FALSE(line.cutShort);
}

// At 2^24 the next float is 2 away: 0.4 more is the same number.
TEST(SpacedWalkTest, EndsWhereItCanNoLongerAdvance) {
  Line line(33554432.0f);
  EXPECT_LE(line.spaced(16777216.0f, 0.4f, 33554432.0f).size(), 1u);
  EXPECT_TRUE(line.cutShort);
  EXPECT_EQ(line.carry, 0.4f);
}

TEST(WalksTest, EndAtTheBoundOnStamps) {
  Line line(1e6f);
  EXPECT_EQ(line.spaced(0.4f, 0.4f, 1e6f).size(), static_cast<std::size_t>(kMostStampsPerSegment));
  EXPECT_TRUE(line.cutShort);
  EXPECT_EQ(line.carry, 0.4f);
  EXPECT_EQ(line.evenly(1'000'000, 1e6f).size(), static_cast<std::size_t>(kMostStampsPerSegment));
  EXPECT_TRUE(line.cutShort);
  EXPECT_EQ(line.evenly(kMostStampsPerSegment, 1e6f).size(), static_cast<std::size_t>(kMostStampsPerSegment));
  EXPECT_FALSE(line.cutShort);
}

TEST(WalksTest, EndOnPathsWithoutAFiniteLength) {
  for (const float length :
       {std::numeric_limits<float>::infinity(), std::numeric_limits<float>::quiet_NaN()}) {
    Line line(length);
    EXPECT_THAT(line.spaced(0.4f, 0.4f, length), IsEmpty());
    EXPECT_EQ(line.carry, 0.4f);
    EXPECT_TRUE(line.cutShort);
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
    const std::size_t reserved = spacedStamps(first, 0.4f, length);
    ASSERT_GE(reserved, placed) << first << " on " << length;
    ASSERT_LE(reserved, placed + 2) << first << " on " << length;
  }
  EXPECT_EQ(spacedStamps(0.4f, 0.4f, 1e30f), static_cast<std::size_t>(kMostStampsPerSegment));
  EXPECT_EQ(spacedStamps(0.4f, 0.4f, std::numeric_limits<float>::quiet_NaN()), 0u);
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

TEST(SegmentPathTest, RunsStraightFromTheLastPointWithoutSmoothing) {
  SegmentPath path;
  path.start({1.0f, 2.0f});
  EXPECT_FLOAT_EQ(path.extend({4.0f, 6.0f}, Smoothing::Straight), 5.0f);
  EXPECT_EQ(path.mid().x, 1.0f);  // stays
  EXPECT_FLOAT_EQ(path.close({4.0f, 6.0f}, Smoothing::Straight), 5.0f);
}

TEST(StampCounterTest, LetsTheShapesTakeTurnsEvenPastTheLargestCount) {
  StampCounter stamps;
  stamps.restart(std::numeric_limits<std::int32_t>::max() - 1);  // 2147483646 = 3 * 715827882
  EXPECT_EQ(stamps.next(), 0);
  EXPECT_EQ(stamps.next(), 1);
  EXPECT_EQ(stamps.next(), 2);
  EXPECT_EQ(stamps.next(), 0);
  EXPECT_GT(stamps.count(), 0);
}

}  // namespace
}  // namespace Qelt
