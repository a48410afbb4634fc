#pragma once

#include "base/PointF.h"
#include "math/FloatRange.h"

namespace Qelt {

// One input sample after cleaning.
struct PenSample {
  PointF at;          // stroke units
  float pressure;     // up to 1
  float tilt;         // radians from upright
  float orientation;  // radians, clockwise from up
};

// Whether segments are curves from mid point to mid point, or run straight from input point to input point.
enum class Smoothing { Curve, Straight };

// False for a point that is not finite, or too far off to draw to. Such points are dropped.
inline bool isUsable(PointF point) {
  return isUsableCoordinate(point.x) && isUsableCoordinate(point.y);
}

}  // namespace Qelt
