#pragma once

namespace Qelt {

// The range of coordinates, sizes and scales that the pen works with. Sums, products and quotients of what
// lies in it fit into a float; what lies outside is treated as bad input.
inline constexpr float kSmallest = 1e-30f;
inline constexpr float kLargest = 1e30f;

// Whether a size or a scale can be computed with: positive, and in range. False for a NaN.
inline constexpr bool isUsableScale(float scale) {
  return scale >= kSmallest && scale <= kLargest;
}

// Whether a coordinate, a distance or an angle can be computed with. False for a NaN.
inline constexpr bool isUsableCoordinate(float value) {
  return value >= -kLargest && value <= kLargest;
}

}  // namespace Qelt
