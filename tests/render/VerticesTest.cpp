#include <gmock/gmock.h>

#include "render/StampVertices.h"

namespace Qelt {
namespace {

// What the worked-out strokes of each version leave open: unequal axes, and every kind of thinness.
TEST(AntialiasedExtentTest, AddsHalfADevicePixelAndWidensThinStampsAndDimsThem) {
  const struct {
    float radius;
    Vector2<float> scale;  // units a pixel
    float halfWidth, halfHeight, innerRadius, alphaByWidth;
  } cases[] = {
      // a' = 10 + 0.5; inner radius (10.5 - 1) / 10.5 / 2.
      {10.0f, {1.0f, 1.0f}, 10.5f, 10.5f, 9.5f / 10.5f * 0.5f, 1.0f},
      // k = 0.5 / 0.2 = 2.5: half a pixel wide, 0.4 as strong, all of it rim.
      {0.2f, {1.0f, 1.0f}, 1.0f, 1.0f, 0.0f, 0.4f},
      // Exactly half a pixel is taken as it is.
      {0.5f, {1.0f, 1.0f}, 1.0f, 1.0f, 0.0f, 1.0f},
      // 4 units are 8 pixels in x (half a unit a pixel) and 2 in y: a' = 8.5, b' = 2.5, the inner radius by
      // the larger: 7.5 / 8.5 / 2; half extents 0.5 * 8.5 and 2 * 2.5.
      {4.0f, {0.5f, 2.0f}, 4.25f, 5.0f, 7.5f / 8.5f * 0.5f, 1.0f},
      // 0.5 units are 1 pixel in x and 0.25 in y. The thinner axis decides: k = 2, so a' = 2.5 and b' = 1.
      {0.5f, {0.5f, 2.0f}, 1.25f, 2.0f, 1.5f / 2.5f * 0.5f, 0.5f},
      {0.5f, {2.0f, 0.5f}, 2.0f, 1.25f, 1.5f / 2.5f * 0.5f, 0.5f},
      // Nothing, and next to nothing, cannot be widened: as small as a stamp gets, and invisible.
      {0.0f, {1.0f, 2.0f}, 1.0f, 2.0f, 0.0f, 0.0f},
      {1e-40f, {1.0f, 1.0f}, 1.0f, 1.0f, 0.0f, 0.0f},
  };
  for (const auto& [radius, scale, halfWidth, halfHeight, innerRadius, alphaByWidth] : cases) {
    SCOPED_TRACE(testing::Message() << radius << " at " << scale.x << ", " << scale.y);
    const StampExtent extent = antialiasedExtent(radius, scale);
    EXPECT_FLOAT_EQ(extent.x, halfWidth);
    EXPECT_FLOAT_EQ(extent.y, halfHeight);
    EXPECT_FLOAT_EQ(extent.innerRadius, innerRadius);
    EXPECT_FLOAT_EQ(extent.alphaByWidth, alphaByWidth);
  }
}

}  // namespace
}  // namespace Qelt
