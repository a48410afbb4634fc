#include <gmock/gmock.h>

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>
#include <cstdint>
#include <limits>
#include <random>
#include <vector>

#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "graphics/SmPath.h"
#include "stroke/input/LiveInput.h"
#include "stroke/input/MoveFilter.h"
#include "stroke/input/PenAttitude.h"
#include "stroke/placing/StampRun.h"
#include "stroke/placing/StampWalk.h"
#include "support/Board.h"

namespace Qelt {
namespace {

using testing::ElementsAreArray;

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
    // Now and then what it replaces.
    const float value =
        random() % 4 == 0 ? slots[counter % Size] : values(random) * ((random() % 8 == 0) ? 1000.0f : 1.0f);
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

// What lies more than half a turn from the mean is turned by a full one; at exactly that much it stays. A
// mean may lie beyond half a turn, and 0 is on neither side of it.
TEST(PenAttitudeTest, TurnsOrientationsThatLieAcrossHalfATurnFromTheMean) {
  constexpr float kQuarter = 1.5707964f;
  const struct {
    float mean, sample, taken;
  } cases[] = {{3.0f, -3.0f, 3.2831855f},
               {-3.0f, 3.0f, -3.2831855f},
               {kQuarter, -kQuarter, -kQuarter},
               {-kQuarter, kQuarter, kQuarter},
               {3.2f, 0.0f, 0.0f},
               {-3.2f, 0.0f, 0.0f},
               {0.0f, 3.2f, 3.2f}};
  for (const auto& [mean, sample, taken] : cases) {
    PenAttitude<1, 1> attitude;
    attitude.fill(0.0f, mean);
    attitude.push(0.0f, sample);
    EXPECT_FLOAT_EQ(attitude.meanOrientation(), taken) << mean << ", " << sample;
  }
}

// Whatever is NaN about a stamp, wherever it stands, and however they come: the box is that of the others.
TEST(DirtyBoxTest, LeavesOutEdgesThatAreNaN) {
  for (const auto& [x, y, reach] : {std::array{NAN, 5.0f, 1.0f}, {5.0f, NAN, 1.0f}, {5.0f, 5.0f, NAN}}) {
    for (const std::size_t bad : {0, 1, 2, 3}) {
      std::array<SmPoint, 4> centres{{{1.0f, 0.0f}, {0.0f, 1.0f}, {9.0f, 7.0f}, {8.0f, 9.0f}}};
      std::array<float, 4> reaches{1.0f, 2.0f, 2.0f, 3.0f};
      centres[bad] = {x, y};
      reaches[bad] = reach;
      std::array<float, 4> expected{100.0f, 100.0f, -100.0f, -100.0f};
      for (std::size_t i = 0; i < 4; ++i) {
        if (i == bad) continue;
        expected[0] = std::min(expected[0], centres[i].x - reaches[i]);
        expected[1] = std::min(expected[1], centres[i].y - reaches[i]);
        expected[2] = std::max(expected[2], centres[i].x + reaches[i]);
        expected[3] = std::max(expected[3], centres[i].y + reaches[i]);
      }
      for (const int atOnce : {1, 2, 3, 4}) {
        DirtyBox box;
        for (int i = 0; i < 4; i += atOnce) {
          box.add(centres.data() + i, reaches.data() + i, std::min(atOnce, 4 - i));
        }
        RectF rect{3.0f, 4.0f, 3.0f, 4.0f};
        box.uniteInto(&rect);
        EXPECT_THAT((std::array{rect.left, rect.top, rect.right, rect.bottom}), ElementsAreArray(expected));
      }
    }
  }
}

// A box without any width, since nothing had an x, is none.
TEST(DirtyBoxTest, IsNoneWhereAnAxisIsMissing) {
  for (const SmPoint centre : {SmPoint{NAN, 5.0f}, SmPoint{5.0f, NAN}}) {
    DirtyBox box;
    const float reach = 1.0f;
    box.add(&centre, &reach, 1);
    RectF rect{3.0f, 4.0f, 5.0f, 6.0f};
    box.uniteInto(&rect);
    EXPECT_THAT((std::array{rect.left, rect.top, rect.right, rect.bottom}),
                ElementsAreArray({3.0f, 4.0f, 5.0f, 6.0f}));
  }
}

// An edge at zero is written as 0, never as -0.
TEST(DirtyBoxTest, HasPositiveZeros) {
  DirtyBox box;
  const SmPoint centres[] = {{-2.0f, -3.0f}, {-3.0f, -2.0f}};
  const float reaches[] = {2.0f, 2.0f};
  box.add(centres, reaches, 2);
  RectF rect{-9.0f, -9.0f, -9.0f, -9.0f};
  box.uniteInto(&rect);
  EXPECT_EQ(std::bit_cast<std::uint32_t>(rect.right), 0u);
  EXPECT_EQ(std::bit_cast<std::uint32_t>(rect.bottom), 0u);
}

TEST(DistanceTest, IsTakenInDoublesWhereSquaresDoNotFit) {
  EXPECT_FLOAT_EQ(distanceBetween({-2e19f, 0.0f}, {2e19f, 0.0f}), 4e19f);
  EXPECT_FLOAT_EQ(distanceBetween({0.0f, -2e19f}, {0.0f, 2e19f}), 4e19f);
}

// Notes the x of the stamps that a walk places, and the distances of those that it passes over.
struct NotedRun {
  SmPoint* places() { return at.data(); }
  void place(int count) {
    for (int i = 0; i < count; ++i) placed.push_back(at[static_cast<std::size_t>(i)].x);
  }
  void passOver(float distance) { passed.push_back(distance); }
  std::array<SmPoint, kStampsAtOnce> at;
  std::vector<float> placed, passed;
};

// So far out that the next float is further away than the next stamp, or that there is none.
TEST(StampWalkTest, EndsWhereItCannotGoOn) {
  SmPath path;
  path.moveTo(0.0f, 0.0f);
  path.lineTo(2e8f, 0.0f);
  path.resetPath(0);
  for (const auto& [first, spacing, length] :
       {std::array{1e8f, 0.4f, 2e8f}, std::array{3e38f, 3e38f, 3e38f}}) {
    for (const int most : {0, 9}) {
      NotedRun run;
      const WalkResult walk = walkSpaced(path, first, spacing, length, most, run);
      EXPECT_EQ(walk.stamps, 1);
      EXPECT_TRUE(walk.cutShort);
      EXPECT_EQ(walk.carry, spacing);
      EXPECT_EQ(run.passed.size(), most == 0 ? 1u : 0u);
    }
  }
  // The last steps before 2^24 are a whole one each; from there on half a step and a bit leads nowhere.
  NotedRun run;
  const WalkResult walk = walkSpaced(path, 0x1p24f - 3.0f, 1.0f, 2e8f, 99, run);
  EXPECT_EQ(walk.stamps, 4);
  EXPECT_EQ(run.placed.size(), 4u);
  EXPECT_TRUE(walk.cutShort);
}

// However many are handed over at once: those beyond the bound are passed over, one by one and in order.
TEST(StampWalkTest, PlacesNoMoreThanItMay) {
  SmPath path;
  path.moveTo(0.0f, 0.0f);
  path.lineTo(100.0f, 0.0f);
  path.resetPath(0);
  for (const int most : {0, 1, 31, 32, 33, 50, 100}) {
    for (const bool evenly : {false, true}) {
      NotedRun run;
      const WalkResult walk =
          evenly ? walkEvenly(path, 100, 100.0f, most, run) : walkSpaced(path, 0.0f, 1.0f, 99.5f, most, run);
      EXPECT_EQ(walk.stamps, 100);
      EXPECT_FALSE(walk.cutShort);
      EXPECT_EQ(walk.carry, evenly ? 0.0f : 0.5f);
      ASSERT_EQ(run.placed.size(), static_cast<std::size_t>(most));
      std::vector<float> all = run.placed;
      all.insert(all.end(), run.passed.begin(), run.passed.end());
      ASSERT_EQ(all.size(), 100u);
      for (std::size_t i = 0; i < 100; ++i) EXPECT_FLOAT_EQ(all[i], static_cast<float>(i));
    }
  }
}

// Room is made ahead: a stamp every half unit of 1.95 + 5 + 12, which is 37.9, and two a sample, of which one
// lies nowhere; for a segment one each unit and two more.
TEST(RoomForStamps, IsMadeForTheWayFromPointToPoint) {
  const MotionEvent move = QeltTests::motionEvent(kActionMove, {{3.0f, 4.0f}, {NAN, 0.0f}, {3.0f, 16.0f}});
  EXPECT_EQ(stampsOfMove(move, {0.0f, -1.95f}, {0.0f, 0.0f}, 0.5f), 43);
  EXPECT_EQ(stampsOfMove(move, {0.0f, -1e6f}, {0.0f, 0.0f}, 0.5f), 8192);
  EXPECT_EQ(spacedStamps(10.5f, 1.0f, 10.0f), 0);
  EXPECT_EQ(spacedStamps(10.0f, 1.0f, 10.0f), 2);
  EXPECT_EQ(spacedStamps(0.0f, 1.0f, INFINITY), kMostStampsPerSegment);
}

// A batch that is allocated once an event needs room that does wherever a walk's rounding leads.
TEST(RoomForStamps, IsNeverLessThanAWalkTakes) {
  // Only how many stamps there are is looked at, not where they lie.
  SmPath path;
  path.moveTo(0.0f, 0.0f);
  path.lineTo(1.0f, 0.0f);
  path.resetPath(0);
  std::mt19937 random(24);
  const auto between = [&random](float low, float high) {
    return std::uniform_real_distribution<float>(low, high)(random);
  };
  int beyondTheQuotient = 0;
  for (int i = 0; i < 4000; ++i) {
    const float spacing = i % 2 == 0 ? 0.4f : std::exp(between(-12.0f, 6.0f));
    // So many stamps by the quotient; now and then from far out on, where a step is half again as long as
    // another.
    const float stamps = std::exp(between(0.0f, i % 8 == 0 ? 12.4f : 9.0f));
    const float first =
        i % 3 == 0 ? spacing * std::exp(between(12.0f, 17.5f)) : spacing * between(0.0f, 1.0f);
    const float length = first + stamps * spacing;
    const int room = spacedStamps(first, spacing, length);
    const int taken = walkSpaced(path, first, spacing, length, kMostStampsPerSegment, NotedRun()).stamps;
    ASSERT_LE(taken, room) << first << " " << spacing << " " << length;
    beyondTheQuotient += static_cast<float>(taken) > (length - first) / spacing + 2.0f ? 1 : 0;
  }
  EXPECT_GT(beyondTheQuotient, 100);
}

// Should the reckoning ever be short, room is made late rather than never.
TEST(RoomForStamps, GrowsWhereItIsShort) {
  std::vector<float> batch(7);
  {
    StampAppender<9> appender(&batch, 0);
    appender.take(2)[2 * 54 - 1] = 5.0f;
    std::fill_n(appender.take(40), 40 * 54, 6.0f);
  }
  ASSERT_EQ(batch.size(), 7u + 42 * 54);
  EXPECT_EQ(batch[7 + 107], 5.0f);
  EXPECT_EQ(batch.back(), 6.0f);
}

TEST(StampCounterTest, LetsTheShapesTakeTurnsEvenPastTheLargestCount) {
  constexpr int kMost = std::numeric_limits<std::int32_t>::max();  // 2147483646 = 3 * 715827882
  StampCounter one(kMost - 1);
  for (const int shape : {0, 1, 2, 0}) EXPECT_EQ(one.take(1), shape);
  EXPECT_EQ(one.count(), 4);  // after the largest count comes 2
  // Some at a time, the largest count passed at any of them.
  for (const int stamps : {1, 2, 3, 16}) {
    StampCounter some(kMost - 1);
    EXPECT_EQ(some.take(stamps), 0);
    EXPECT_EQ(some.take(1), stamps % 3);
  }
}

}  // namespace
}  // namespace Qelt
