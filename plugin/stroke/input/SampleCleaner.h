#pragma once

#include <cmath>

#include "engine/MotionEvent.h"
#include "math/FloatRange.h"

namespace Qelt {

// Replaces a NaN.
inline void checkNan(float* value, float fallback) {
  if (std::isnan(*value)) *value = fallback;
}

// At most 1; a NaN stays.
inline float checkPressure(float pressure) {
  return pressure > 1.0f ? 1.0f : pressure;
}

// Replaces NaN and infinity, and caps what is too large, before any geometry sees a sample. The two numbers
// are a version's own.
struct SampleCleaner {
  float unknownPressure;  // for tools that report no pressure, and in place of a NaN
  float tiltCap;          // radians

  float pressure(float reported, int toolType) const {
    if (toolType == kToolFinger || toolType == kToolMouse || std::isnan(reported)) return unknownPressure;
    return checkPressure(reported);
  }

  // The tilt before it is capped.
  static float knownTilt(float reported) { return std::isfinite(reported) ? reported : 0.0f; }

  float tilt(float reported) const {
    const float known = knownTilt(reported);
    return known > tiltCap ? tiltCap : known;
  }

  bool exceedsCap(float reported) const { return knownTilt(reported) > tiltCap; }

  // An orientation that is not finite, or so large that a mean would not be finite, counts as 0.
  static float orientation(float reported) { return isUsableCoordinate(reported) ? reported : 0.0f; }
};

// Whether the tool is a stylus on a touch screen, which reports no pressure worth using.
inline bool isTouchStylus(int toolType, int source) {
  return toolType == kToolStylus && source == kSourceTouchScreen;
}

// Whether a tool's short moves are thinned out.
inline bool isCoarseTool(int toolType, int source) {
  return toolType == kToolFinger || toolType == kToolMouse || isTouchStylus(toolType, source);
}

}  // namespace Qelt
