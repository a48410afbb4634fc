#include "stroke/StrokeRules.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

#include "outline/Pencil2OutlineDrawableGL.h"
#include "stroke/Pencil2StrokeDrawableGL.h"

// What frozen strokes do not come to: counts beyond int, tilts that hardly count, and scales that drawings do
// not use.
namespace Qelt::rules {
namespace {

constexpr int kLargest = std::numeric_limits<int>::max();

TEST(StampCountTest, SaturatesInsteadOfOverflowing) {
  EXPECT_EQ(saturatedCount(3e9f), kLargest);
  EXPECT_EQ(saturatedCount(2147483648.0f), kLargest);
  EXPECT_EQ(saturatedCount(2147483520.0f), 2147483520);  // the largest float below 2^31
  EXPECT_EQ(saturatedCount(INFINITY), kLargest);
  EXPECT_EQ(saturatedCount(-2147483648.0f), 0);
  EXPECT_EQ(saturatedCount(-INFINITY), 0);
  EXPECT_EQ(saturatedCount(std::numeric_limits<float>::quiet_NaN()), 0);
  EXPECT_EQ(saturatedCount(-1.5f), -1);
  EXPECT_EQ(incremented(kLargest), kLargest);
  EXPECT_EQ(incremented(9), 10);
  EXPECT_EQ(getRepeatV1(10.0f, 1e-30f), kLargest);
  EXPECT_EQ(getRepeatV3(1e30f, 1e-30f), kLargest);
}

// 0.005 / 0.08 and 0.0005 / 1.9.
TEST(TiltBlendTest, BeginsAtItsLeastTilt) {
  EXPECT_EQ(adjustTiltV1(0.7499f), 0.0f);
  EXPECT_NEAR(adjustTiltV1(0.755f), 0.0625f, 1e-5f);
  EXPECT_EQ(adjustTiltV5(0.0499f), 0.0f);
  EXPECT_NEAR(adjustTiltV5(0.0505f), 2.6316e-4f, 1e-7f);
}

// A host may ask a drawable as well.
TEST(SampleChecksTest, ReplaceNaNAndCapPressure) {
  for (const auto check : {Pencil2StrokeDrawableGL::checkNan, Pencil2OutlineDrawableGL::checkNan}) {
    float number = NAN;
    check(&number, 0.25f);
    EXPECT_EQ(number, 0.25f);
  }
  EXPECT_EQ(Pencil2StrokeDrawableGL::checkPressure(1.5f), 1.0f);
  EXPECT_EQ(Pencil2OutlineDrawableGL::checkPressure(1.5f), 1.0f);
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
