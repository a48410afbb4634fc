#include "stroke/parts/PenAttitude.h"

#include <gtest/gtest.h>

#include <array>
#include <bit>
#include <cmath>
#include <cstdint>
#include <numbers>
#include <random>

#include "stroke/parts/PatternShift.h"

namespace Qelt {
namespace {

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
  // -3.1 lies 0.083 beyond 3.1, as 3.1831853: (49 * 3.1 + 3.1831853) / 50 = 3.1016637.
  PenAttitude<70, 50> attitude;
  attitude.fill(0.0f, 3.1f);
  attitude.push(0.0f, -3.1f);
  EXPECT_NEAR(attitude.meanOrientation(), 3.1016637f, 1e-5f);

  // And the other way round.
  attitude.fill(0.0f, -3.1f);
  attitude.push(0.0f, 3.1f);
  EXPECT_NEAR(attitude.meanOrientation(), -3.1016637f, 1e-5f);

  // Samples on both sides settle half way between 3.1 and 3.1831853.
  attitude.fill(0.0f, 3.1f);
  for (int push = 0; push < 200; ++push) attitude.push(0.0f, push % 2 == 0 ? -3.1f : 3.1f);
  EXPECT_NEAR(attitude.meanOrientation(), 3.1415927f, 1e-4f);
}

TEST(PenAttitudeTest, LeavesTurnsOfUpToHalfATurnAlone) {
  PenAttitude<70, 50> attitude;
  attitude.fill(0.0f, 1.0f);
  attitude.push(0.0f, -1.0f);
  EXPECT_FLOAT_EQ(attitude.meanOrientation(), 0.96f);  // (49 - 1) / 50
  attitude.fill(0.0f, 1.0f);
  attitude.push(0.0f, 1.0f - kPi);  // exactly half a turn is not beyond
  EXPECT_FLOAT_EQ(attitude.meanOrientation(), 1.0f - kPi / 50.0f);
  attitude.fill(0.0f, 0.0f);  // from 0 there is no other side
  attitude.push(0.0f, -3.1f);
  EXPECT_FLOAT_EQ(attitude.meanOrientation(), -0.062f);
}

TEST(PatternShiftTest, MovesEvery300SegmentsAndRestarts) {
  PatternShift shift;
  for (int segment = 0; segment < 299; ++segment) shift.countSegment();
  EXPECT_EQ(shift.offset().x, 0.0f);
  shift.countSegment();
  EXPECT_EQ(shift.offset().x, 77.0f);
  EXPECT_EQ(shift.offset().y, 37.0f);
  EXPECT_EQ(shift.segments(), 0);
  for (int segment = 0; segment < 300; ++segment) shift.countSegment();
  EXPECT_EQ(shift.offset().x, 154.0f);
}

}  // namespace
}  // namespace Qelt
