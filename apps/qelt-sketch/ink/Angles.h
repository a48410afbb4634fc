#pragma once

#include <cmath>
#include <numbers>

namespace QeltDesktop {

// Between the angles that InkML records and those of a Sample, in radians. Reader and writer share them, so
// that what is written reads back bit for bit.

inline float tiltOf(double elevation) {
  return static_cast<float>(std::numbers::pi / 2.0 - elevation);
}

inline float orientationOf(double azimuth) {
  const auto angle = static_cast<float>(std::remainder(azimuth, 2.0 * std::numbers::pi));
  // The range is open below, so that half a turn is always +pi.
  constexpr float kHalfTurn = std::numbers::pi_v<float>;
  return angle <= -kHalfTurn ? kHalfTurn : angle;
}

}  // namespace QeltDesktop
