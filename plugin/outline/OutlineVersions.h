#pragma once

#include "outline/OutlineGuards.h"
#include "stroke/StrokeRules.h"

// All outline versions side by side, in the form of the strokes' rows (StrokeVersions.h): every field
// written, rules named after the stroke version that brought them, released rows frozen. Versions 1 and 2 are
// the same and stay two rows.
namespace Qelt {

struct OutlineProfile {
  // Input. Pressure is carried along without effect.
  float unknownPressure;    // of finger, mouse, a stylus on a touch screen, and for NaN
  float touchSkipDistance;  // stroke units; shorter moves of those tools are taken every other time
  float tiltCap;            // radians
  // Mappings, see StrokeRules.h.
  float (*tiltFactor)(float meanTilt);
  float (*pointSize)(float size, float tiltFactor);
  // Placement: so many stamps a segment, evenly from its start.
  int (*stampCount)(float length, float size);
  float shortestSegment;  // stroke units; a shorter one places nothing and does not move the last point
  // Hand-over.
  float (*stampSize)(float size);
};

struct OutlineV1 {
  static constexpr const char* name = "Pencil2OutlineDrawableGLV1";
  static constexpr OutlineProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .tiltFactor = rules::tiltBlendV1,
      .pointSize = rules::pointSizeV1,
      .stampCount = rules::stampCountV1,
      .shortestSegment = 1.0f,
      .stampSize = rules::stampWidthV1,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using ReturnGuard = Pencil2OutlineV1ReturnCallback;
};

struct OutlineV2 {
  static constexpr const char* name = "Pencil2OutlineDrawableGLV2";
  static constexpr OutlineProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .tiltFactor = rules::tiltBlendV1,
      .pointSize = rules::pointSizeV1,
      .stampCount = rules::stampCountV1,
      .shortestSegment = 1.0f,
      .stampSize = rules::stampWidthV1,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using ReturnGuard = Pencil2OutlineV2ReturnCallback;
};

struct OutlineV3 {
  static constexpr const char* name = "Pencil2OutlineDrawableGLV3";
  static constexpr OutlineProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .tiltFactor = rules::tiltBlendV1,
      .pointSize = rules::pointSizeV1,
      .stampCount = rules::stampCountV3,
      .shortestSegment = 0.0f,
      .stampSize = rules::stampWidthV1,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using ReturnGuard = Pencil2OutlineV3ReturnCallback;
};

struct OutlineV4 {
  static constexpr const char* name = "Pencil2OutlineDrawableGLV4";
  static constexpr OutlineProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .tiltFactor = rules::tiltBlendV1,
      .pointSize = rules::pointSizeV1,
      .stampCount = rules::stampCountV3,
      .shortestSegment = 0.0f,
      .stampSize = rules::stampWidthV4,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using ReturnGuard = Pencil2OutlineV4ReturnCallback;
};

struct OutlineV5 {
  static constexpr const char* name = "Pencil2OutlineDrawableGLV5";
  static constexpr OutlineProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 1.0f,
      .tiltFactor = rules::tiltBlendV5,
      .pointSize = rules::pointSizeV5,
      .stampCount = rules::stampCountV3,
      .shortestSegment = 0.0f,
      .stampSize = rules::stampWidthV4,
  };
  static constexpr int tiltWindow = 3;
  static constexpr int orientationWindow = 3;
  using ReturnGuard = Pencil2OutlineV5ReturnCallback;
};

}  // namespace Qelt
