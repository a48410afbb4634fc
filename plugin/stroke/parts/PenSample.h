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

inline bool isFinite(PointF point) {
  return std::isfinite(point.x) && std::isfinite(point.y);
}

}  // namespace Qelt
