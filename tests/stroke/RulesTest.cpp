#include "stroke/StrokeRules.h"

#include <gtest/gtest.h>

#include <bit>
#include <cstdint>
#include <limits>

namespace Qelt::rules {
namespace {

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInfinity = std::numeric_limits<float>::infinity();
constexpr int kLargest = std::numeric_limits<int>::max();

TEST(TiltBlendTest, BeginsAtItsThresholdAndIgnoresWhatIsNotAboveZero) {
  for (const float tilt : {0.0f, -0.5f, kNaN, 0.7499f, 0.75f}) EXPECT_EQ(adjustTiltV1(tilt), 0.0f) << tilt;
  for (const float tilt : {0.0f, -0.5f, kNaN, 0.0499f, 0.05f}) EXPECT_EQ(adjustTiltV5(tilt), 0.0f) << tilt;
}

// In units of 2^-24, the float nearest to 0.79 is 13254001 and 0.75 is 12582912: the difference is 671089.
// The divisor is 0x3DA3D710, 10737424 units of 2^-27. 8 * 671089 / 10737424 = 5368712 / 10737424 = 0.5,
// exactly; the float nearest to 0.08 (10737418 units) would give 0.50000027.
TEST(TiltBlendTest, DividesByThePromisedBits) {
  EXPECT_EQ(adjustTiltV1(0.79f), 0.5f);
  const float divisor = std::bit_cast<float>(std::uint32_t{0x3DA3D710});
  EXPECT_EQ(adjustTiltV1(0.77f), (0.77f - 0.75f) / divisor);
  EXPECT_NE(adjustTiltV1(0.79f), (0.79f - 0.75f) / 0.08f);
}

TEST(ColorAlphaTest, CountsTransparentAsTwoStepsOpaque) {
  EXPECT_EQ(getAlpha(0x00FFFFFFu), 2.0f);
  EXPECT_EQ(getAlpha(0x01FFFFFFu), 2.0f);
  EXPECT_EQ(getAlpha(0x03FFFFFFu), 3.0f);
  EXPECT_EQ(getAlpha(0xFF000000u), 255.0f);
}

TEST(PressureAlphaTest, SquaresAndClampsByVersion) {
  EXPECT_EQ(getPressureAlphaV1(0.1f, 255.0f, 10.0f), 0.09f);
  EXPECT_EQ(getPressureAlphaV1(0.5f, 255.0f, 10.0f), 0.25f);
  EXPECT_EQ(getPressureAlphaV1(1.0f, 255.0f, 10.0f), 0.36f);

  EXPECT_EQ(getPressureAlphaV2(0.1f, 80.0f, 10.0f), 0.16f);
  EXPECT_EQ(getPressureAlphaV2(0.5f, 255.0f, 10.0f), 0.796875f);  // 0.25 * 255 / 80
  EXPECT_EQ(getPressureAlphaV2(1.0f, 80.0f, 10.0f), 0.64f);
  EXPECT_EQ(getPressureAlphaV2(0.5f, 2.0f, 10.0f), 0.00625f);  // 0.25 * 2 / 80

  EXPECT_EQ(getPressureAlphaV8(0.5f, 255.0f, 10.0f), 1.1953125f);    // 0.25 * 255 / 80 * 15 / 10
  EXPECT_EQ(getPressureAlphaV8(0.1f, 80.0f, 15.0f), 0.25f);          // clamped, then 15 / 15
  EXPECT_FLOAT_EQ(getPressureAlphaV8(1.0f, 80.0f, 15.0f), 0.7f);     // clamped
  EXPECT_FLOAT_EQ(getPressureAlphaV8(0.75f, 80.0f, 5.0f), 1.6875f);  // 0.5625 * 15 / 5
}

TEST(StampCountTest, OfVersion1DropsWhatIsShorterThanOne) {
  EXPECT_EQ(getRepeatV1(0.5f, 10.0f), 0);
  EXPECT_EQ(getRepeatV1(0.999f, 1.0f), 0);
  EXPECT_EQ(getRepeatV1(1.0f, 10.0f), 4);   // trunc(40 / 10)
  EXPECT_EQ(getRepeatV1(1.5f, 80.0f), 1);   // trunc(0.5) = 0, raised
  EXPECT_EQ(getRepeatV1(1.99f, 10.0f), 4);  // the length counts from 2.0 on
  EXPECT_EQ(getRepeatV1(8.0f, 10.0f), 6);   // 8 / 4 + 4
  EXPECT_EQ(getRepeatV1(2.0f, 80.0f), 1);   // trunc(0.5 + 0) = 0, raised
  // The size's share is truncated on its own: 40 / 12 = 3.3 counts 3; 7 / 4 + 3 = 4.75 counts 4, where
  // 1.75 + 3.33 would have counted 5.
  EXPECT_EQ(getRepeatV1(7.0f, 12.0f), 4);
}

TEST(StampCountTest, OfVersion3IsEightAcrossTheWidth) {
  EXPECT_EQ(getRepeatV3(1.0f, 2.0f), 4);
  EXPECT_EQ(getRepeatV3(0.1f, 10.0f), 1);          // trunc(0.08) raised
  EXPECT_EQ(getRepeatV3(0.0f, 10.0f), 1);          // a point still gets its stamp
  EXPECT_EQ(getRepeatV3(20001.0f, 16.0f), 10000);  // trunc(10000.5)
  EXPECT_EQ(getRepeatV3(20001.0f, 8.0f), 20001);
  // Divided first: the float below 8 / 41, 0.195121944, times 41 falls short of 8.
  EXPECT_EQ(getRepeatV3(41.0f, 41.0f), 7);
}

TEST(StampCountTest, SaturatesInsteadOfOverflowing) {
  EXPECT_EQ(saturatedCount(3e9f), kLargest);
  EXPECT_EQ(saturatedCount(2147483648.0f), kLargest);
  EXPECT_EQ(saturatedCount(2147483520.0f), 2147483520);  // the largest float below 2^31
  EXPECT_EQ(saturatedCount(kInfinity), kLargest);
  EXPECT_EQ(saturatedCount(-kInfinity), 0);
  EXPECT_EQ(saturatedCount(kNaN), 0);
  EXPECT_EQ(saturatedCount(-1.5f), -1);
  EXPECT_EQ(incremented(kLargest), kLargest);
  EXPECT_EQ(incremented(9), 10);
  EXPECT_EQ(getRepeatV1(10.0f, 1e-30f), kLargest);
  EXPECT_EQ(getRepeatV3(1e30f, 1e-30f), kLargest);
}

TEST(ThinStampTest, IsWidenedUpToAWidthOfOne) {
  EXPECT_EQ(stampWidthV1(0.9f), 1.3f);
  EXPECT_EQ(stampWidthV1(1.0f), 1.3f);  // not above 1
  EXPECT_EQ(stampWidthV1(1.25f), 1.25f);
  EXPECT_EQ(stampReachV1(0.9f), 0.65f);
}

TEST(ScreenScaleTest, GoesByTheShorterSide) {
  EXPECT_EQ(getPixelScale(1440, 2960), 4.0f);
  EXPECT_EQ(getSpeedScale(1440, 2960, 1.0f), 1.0f);
  EXPECT_EQ(getPixelScale(2960, 720), 2.0f);
  EXPECT_EQ(getSpeedScale(2960, 720, 1.0f), 2.0f);
  EXPECT_EQ(getPixelScale(0, 2960), 1.0f);
  EXPECT_EQ(getSpeedScale(1440, 0, 0.5f), 0.5f);
}

}  // namespace
}  // namespace Qelt::rules
