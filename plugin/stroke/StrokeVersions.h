#pragma once

#include "render/RenderDrawables.h"
#include "stroke/StrokeGuards.h"
#include "stroke/StrokeRules.h"

// All stroke versions side by side: each row writes every field, in one order, so that rows compare like
// columns. A rule is named after the version that brought it, which shows who shares whose formula. A
// released row is frozen, since documents drawn with it must look the same for ever; new behaviour is a new
// row, and no row derives from another. (There is no version 6: pens of rendering version 6 draw with
// version 4.)
namespace Qelt {

struct StrokeProfile {
  // Input.
  float unknownPressure;    // of finger, mouse, a stylus on a touch screen, and for NaN
  float touchSkipDistance;  // stroke units; shorter moves of those tools are taken every other time
  float tiltCap;            // radians
  // Mappings, see StrokeRules.h.
  float (*tiltBlend)(float meanTilt);
  float (*pointSize)(float size, float tiltBlend);
  float (*pressureAlpha)(float pressure, float colorAlpha, float size);
  // Placement: so many stamps a segment, evenly from its start; or (count null) at a fixed spacing carried
  // from segment to segment.
  int (*stampCount)(float length, float size);
  float stampSpacing;     // stroke units
  float shortestSegment;  // stroke units; a shorter one places nothing and does not move the last point
  bool logsLargeCounts;   // above 10000 stamps a segment
  // Hand-over.
  float (*stampSize)(float width);
  float (*stampAlpha)(float alpha);
  float (*stampReach)(float width);
  // Bookkeeping.
  bool shiftsPattern;     // moves the pattern offset every 300 segments
  bool publishes;         // tells Pencil2Data where the stroke stands
  bool followsViewScale;  // smooths stamps by the view's scale, and caches by it
};

struct StrokeV1 {
  static constexpr const char* name = "Pencil2StrokeDrawableGLV1";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .tiltBlend = rules::tiltBlendV1,
      .pointSize = rules::pointSizeV1,
      .pressureAlpha = rules::pressureAlphaV1,
      .stampCount = rules::stampCountV1,
      .stampSpacing = 0.0f,
      .shortestSegment = 1.0f,
      .logsLargeCounts = false,
      .stampSize = rules::stampWidthV1,
      .stampAlpha = rules::stampAlphaV1,
      .stampReach = rules::stampReachV1,
      .shiftsPattern = true,
      .publishes = false,
      .followsViewScale = false,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using RenderDrawable = Pencil2StrokeDrawableRTV1;
  using ReturnGuard = Pencil2V1ReturnCallback;
  using CacheGuard = Pencil2V1CacheRedrawCallback;
};

struct StrokeV2 {
  static constexpr const char* name = "Pencil2StrokeDrawableGLV2";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .tiltBlend = rules::tiltBlendV1,
      .pointSize = rules::pointSizeV1,
      .pressureAlpha = rules::pressureAlphaV2,
      .stampCount = rules::stampCountV1,
      .stampSpacing = 0.0f,
      .shortestSegment = 1.0f,
      .logsLargeCounts = false,
      .stampSize = rules::stampWidthV1,
      .stampAlpha = rules::stampAlphaV1,
      .stampReach = rules::stampReachV1,
      .shiftsPattern = true,
      .publishes = false,
      .followsViewScale = false,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using RenderDrawable = Pencil2StrokeDrawableRTV1;
  using ReturnGuard = Pencil2V2ReturnCallback;
  using CacheGuard = Pencil2V2CacheRedrawCallback;
};

struct StrokeV3 {
  static constexpr const char* name = "Pencil2StrokeDrawableGLV3";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .tiltBlend = rules::tiltBlendV1,
      .pointSize = rules::pointSizeV1,
      .pressureAlpha = rules::pressureAlphaV2,
      .stampCount = rules::stampCountV3,
      .stampSpacing = 0.0f,
      .shortestSegment = 0.0f,
      .logsLargeCounts = false,
      .stampSize = rules::stampWidthV1,
      .stampAlpha = rules::stampAlphaV1,
      .stampReach = rules::stampReachV1,
      .shiftsPattern = true,
      .publishes = false,
      .followsViewScale = false,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using RenderDrawable = Pencil2StrokeDrawableRTV1;
  using ReturnGuard = Pencil2V3ReturnCallback;
  using CacheGuard = Pencil2V3CacheRedrawCallback;
};

struct StrokeV4 {
  static constexpr const char* name = "Pencil2StrokeDrawableGLV4";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .tiltBlend = rules::tiltBlendV1,
      .pointSize = rules::pointSizeV1,
      .pressureAlpha = rules::pressureAlphaV2,
      .stampCount = rules::stampCountV3,
      .stampSpacing = 0.0f,
      .shortestSegment = 0.0f,
      .logsLargeCounts = true,
      .stampSize = rules::stampWidthV4,
      .stampAlpha = rules::stampAlphaV1,
      .stampReach = rules::stampReachV4,
      .shiftsPattern = false,
      .publishes = true,
      .followsViewScale = false,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using RenderDrawable = Pencil2StrokeDrawableRTV1;
  using ReturnGuard = Pencil2V4ReturnCallback;
  using CacheGuard = Pencil2V4CacheRedrawCallback;
};

struct StrokeV5 {
  static constexpr const char* name = "Pencil2StrokeDrawableGLV5";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 1.0f,
      .tiltBlend = rules::tiltBlendV5,
      .pointSize = rules::pointSizeV5,
      .pressureAlpha = rules::pressureAlphaV2,
      .stampCount = rules::stampCountV3,
      .stampSpacing = 0.0f,
      .shortestSegment = 0.0f,
      .logsLargeCounts = false,
      .stampSize = rules::stampWidthV1,
      .stampAlpha = rules::stampAlphaV1,
      .stampReach = rules::stampReachV1,
      .shiftsPattern = true,
      .publishes = false,
      .followsViewScale = false,
  };
  static constexpr int tiltWindow = 3;
  static constexpr int orientationWindow = 3;
  using RenderDrawable = Pencil2StrokeDrawableRTV1;
  using ReturnGuard = Pencil2V5ReturnCallback;
  using CacheGuard = Pencil2V5CacheRedrawCallback;
};

struct StrokeV7 {
  static constexpr const char* name = "Pencil2StrokeDrawableGLV7";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .tiltBlend = rules::tiltBlendV1,
      .pointSize = rules::pointSizeV1,
      .pressureAlpha = rules::pressureAlphaV2,
      .stampCount = rules::stampCountV3,
      .stampSpacing = 0.0f,
      .shortestSegment = 0.0f,
      .logsLargeCounts = true,
      .stampSize = rules::stampWidthV4,
      .stampAlpha = rules::stampAlphaV1,
      .stampReach = rules::stampReachV4,
      .shiftsPattern = false,
      .publishes = true,
      .followsViewScale = false,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using RenderDrawable = Pencil2StrokeDrawableRTV2;
  using ReturnGuard = Pencil2V7ReturnCallback;
  using CacheGuard = Pencil2V7CacheRedrawCallback;
};

struct StrokeV8 {
  static constexpr const char* name = "Pencil2StrokeDrawableGLV8";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.6f,
      .touchSkipDistance = 20.0f,
      .tiltCap = 0.79f,
      .tiltBlend = rules::tiltBlendV1,
      .pointSize = rules::pointSizeV1,
      .pressureAlpha = rules::pressureAlphaV8,
      .stampCount = nullptr,
      .stampSpacing = 0.4f,
      .shortestSegment = 0.0f,
      .logsLargeCounts = false,
      .stampSize = rules::stampHalfWidthV8,
      .stampAlpha = rules::stampAlphaV8,
      .stampReach = rules::stampReachV8,
      .shiftsPattern = false,
      .publishes = true,
      .followsViewScale = true,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using RenderDrawable = Pencil2StrokeDrawableRTV3;
  using ReturnGuard = Pencil2V8ReturnCallback;
  using CacheGuard = Pencil2V7CacheRedrawCallback;
};

}  // namespace Qelt
