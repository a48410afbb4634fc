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

// The mean as one would write it down: all slots from 0 upwards, in single precision.
template <int Size>
struct PlainRing {
  std::array<float, Size> slots{};
  int counter = 0;

  void fill(float value) {
    slots.fill(value);
    counter = 0;
  }
  void push(float value) { slots[counter++ % Size] = value; }
  float mean() const {
    float sum = 0.0f;
    for (const float slot : slots) sum += slot;
    return sum / static_cast<float>(Size);
  }
};

template <int Size>
void expectTheSameMeans(unsigned seed) {
  std::mt19937 random(seed);
  std::uniform_real_distribution<float> values(-4.0f, 4.0f);
  MeanRing<Size> ring;
  PlainRing<Size> plain;
  for (int push = 0; push < 4 * Size + 3; ++push) {
    // Now and then a new stroke, at any state of the ring.
    if (random() % 97 == 0) {
      const float value = values(random);
      ring.fill(value);
      plain.fill(value);
    }
    const float value = values(random) * ((random() % 8 == 0) ? 1000.0f : 1.0f);
    ring.push(value);
    plain.push(value);
    ASSERT_EQ(std::bit_cast<std::uint32_t>(ring.mean()), std::bit_cast<std::uint32_t>(plain.mean()))
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

TEST(PenAttitudeTest, AveragesOverItsWindows) {
  PenAttitude<70, 50> attitude;
  attitude.fill(0.0f, 1.0f);
  attitude.push(0.7f, 2.0f);
  EXPECT_FLOAT_EQ(attitude.meanTilt(), 0.01f);         // 0.7 / 70
  EXPECT_FLOAT_EQ(attitude.meanOrientation(), 1.02f);  // (49 + 2) / 50

  PenAttitude<3, 3> version5;
  version5.fill(0.0f, 0.0f);
  version5.push(0.3f, 0.6f);
  version5.push(0.3f, 0.6f);
  EXPECT_FLOAT_EQ(version5.meanTilt(), 0.2f);
  EXPECT_FLOAT_EQ(version5.meanOrientation(), 0.4f);
  version5.push(0.3f, 0.6f);
  version5.push(0.6f, 0.0f);  // overwrites the first
  EXPECT_FLOAT_EQ(version5.meanTilt(), 0.4f);
  EXPECT_FLOAT_EQ(version5.meanOrientation(), 0.4f);
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
