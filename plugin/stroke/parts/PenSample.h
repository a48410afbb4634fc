#pragma once

#include <cmath>

#include "base/PointF.h"

namespace Qelt {

// One input sample after cleaning.
struct PenSample {
  PointF at;          // stroke units
  float pressure;     // up to 1
  float tilt;         // radians from upright
  float orientation;  // radians, clockwise from up
};

// Farther off, in stroke units, sums and differences of points would no longer fit into a float.
inline constexpr float kFarthest = 1e30f;

// False for a point that is not finite, or too far off to draw to: such points are dropped.
inline bool isUsable(PointF point) {
  return std::fabs(point.x) <= kFarthest && std::fabs(point.y) <= kFarthest;
}

}  // namespace Qelt
