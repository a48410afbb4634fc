#pragma once

#include "pencommon/PenStrokeDrawableRT.h"
#include "render/BatchGuard.h"
#include "render/RenderDrawables.h"
#include "stroke/StrokeRules.h"

// All stroke versions side by side: each row writes every field, in one order, so that rows compare like
// columns. A rule is named after the version that brought it, which shows who shares whose formula. A
// released row is frozen, since documents drawn with it must look the same for ever; new behaviour is a new
// row, and no row derives from another. (There is no row 6: strokes of version 6 are drawn by version 4.)
namespace Qelt {

// How the stamps of a segment lie.
enum class Placement {
  Even,            // getRepeat() stamps, evenly from the segment's start; nothing is carried over
  Spaced,          // every getRepeatDistance(); the leftover is carried from segment to segment
  SpacedOnCurves,  // on curves as Spaced, else as Even; getRepeat() gives the steps of the ramps in both
};

struct StrokeProfile {
  // Input.
  float unknownPressure;    // for finger, mouse and a stylus on a touch screen, and in place of a NaN
  float touchSkipDistance;  // stroke units; shorter moves of those tools are taken every other time
  float tiltCap;            // radians
  // Mappings, see StrokeRules.h.
  float (*adjustTilt)(float meanTilt);
  float (*getPointSize)(float size, float tiltBlend);
  float (*getPressureAlpha)(float pressure, float colorAlpha, float size);
  // Placement. A rule that the placement does not ask for is null.
  Placement placement;
  // Stamps on a segment; at 0 the segment is dropped, and the next move is measured from the same point.
  int (*getRepeat)(float length, float size);
  float (*getRepeatDistance)(float size);  // stroke units from stamp to stamp; read when a stroke begins
  // Hand-over.
  float (*stampSize)(float width);
  float (*stampAlpha)(float alpha);
  float (*stampReach)(float width);
  // Bookkeeping.
  bool shiftsPattern;     // moves the pattern offset every 300 segments
  bool publishes;         // tells Pencil2Data where the stroke stands
  bool followsViewScale;  // smooths stamps by the view's scale; cached ones are used at that scale only

  // What all stroke versions have in common, and other drawables do not.
  static constexpr bool isOutline = false;
  static constexpr float startAlpha = 0.0f;            // the first segment fades in
  static constexpr bool postsStraightStarts = false;   // Kept: the grain stays where the stroke before had it
  static constexpr bool restartsPatternShift = false;  // Kept: the shift goes on from stroke to stroke
  // By how much the rectangle is grown, stroke units: after a move or a replay; at a stroke's end; and, on
  // top of that, where the end has a closing segment.
  static constexpr float growth = 5.0f, endGrowth = 5.0f, closeGrowth = 1.0f;
  // Logged when stamps are spaced but the distance is 0 or negative; null logs nothing.
  static constexpr const char *wrongDistanceInDrawLine = nullptr, *wrongDistanceInEndPen = nullptr;
};

// --- Guards: one class per version, all alike. Kept: version 8 uses version 7's cache guard ---

class Pencil2V1ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2V2ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2V3ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2V4ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2V5ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2V7ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2V8ReturnCallback final : public BatchGuard<PenStrokeDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2V1CacheRedrawCallback final : public CacheGuard<PenStrokeDrawableRT> {
 public:
  using CacheGuard::CacheGuard;
};

class Pencil2V2CacheRedrawCallback final : public CacheGuard<PenStrokeDrawableRT> {
 public:
  using CacheGuard::CacheGuard;
};

class Pencil2V3CacheRedrawCallback final : public CacheGuard<PenStrokeDrawableRT> {
 public:
  using CacheGuard::CacheGuard;
};

class Pencil2V4CacheRedrawCallback final : public CacheGuard<PenStrokeDrawableRT> {
 public:
  using CacheGuard::CacheGuard;
};

class Pencil2V5CacheRedrawCallback final : public CacheGuard<PenStrokeDrawableRT> {
 public:
  using CacheGuard::CacheGuard;
};

class Pencil2V7CacheRedrawCallback final : public CacheGuard<PenStrokeDrawableRT> {
 public:
  using CacheGuard::CacheGuard;
};

// --- The rows ---

struct StrokeV1 {
  static constexpr int number = 1;
  static constexpr const char* name = "Pencil2StrokeDrawableGLV1";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .adjustTilt = rules::adjustTiltV1,
      .getPointSize = rules::getPointSizeV1,
      .getPressureAlpha = rules::getPressureAlphaV1,
      .placement = Placement::Even,
      .getRepeat = rules::getRepeatV1,
      .getRepeatDistance = nullptr,
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
  static constexpr int number = 2;
  static constexpr const char* name = "Pencil2StrokeDrawableGLV2";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .adjustTilt = rules::adjustTiltV1,
      .getPointSize = rules::getPointSizeV1,
      .getPressureAlpha = rules::getPressureAlphaV2,
      .placement = Placement::Even,
      .getRepeat = rules::getRepeatV1,
      .getRepeatDistance = nullptr,
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
  static constexpr int number = 3;
  static constexpr const char* name = "Pencil2StrokeDrawableGLV3";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .adjustTilt = rules::adjustTiltV1,
      .getPointSize = rules::getPointSizeV1,
      .getPressureAlpha = rules::getPressureAlphaV2,
      .placement = Placement::Even,
      .getRepeat = rules::getRepeatV3,
      .getRepeatDistance = nullptr,
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
  static constexpr int number = 4;
  static constexpr const char* name = "Pencil2StrokeDrawableGLV4";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .adjustTilt = rules::adjustTiltV1,
      .getPointSize = rules::getPointSizeV1,
      .getPressureAlpha = rules::getPressureAlphaV2,
      .placement = Placement::Even,
      .getRepeat = rules::getRepeatV4,
      .getRepeatDistance = nullptr,
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
  static constexpr int number = 5;
  static constexpr const char* name = "Pencil2StrokeDrawableGLV5";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 1.0f,
      .adjustTilt = rules::adjustTiltV5,
      .getPointSize = rules::getPointSizeV5,
      .getPressureAlpha = rules::getPressureAlphaV2,
      .placement = Placement::Even,
      .getRepeat = rules::getRepeatV3,
      .getRepeatDistance = nullptr,
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
  static constexpr int number = 7;
  static constexpr const char* name = "Pencil2StrokeDrawableGLV7";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .adjustTilt = rules::adjustTiltV1,
      .getPointSize = rules::getPointSizeV1,
      .getPressureAlpha = rules::getPressureAlphaV2,
      .placement = Placement::Even,
      .getRepeat = rules::getRepeatV4,
      .getRepeatDistance = nullptr,
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
  static constexpr int number = 8;
  static constexpr const char* name = "Pencil2StrokeDrawableGLV8";
  static constexpr StrokeProfile profile{
      .unknownPressure = 0.6f,
      .touchSkipDistance = 20.0f,
      .tiltCap = 0.79f,
      .adjustTilt = rules::adjustTiltV1,
      .getPointSize = rules::getPointSizeV1,
      .getPressureAlpha = rules::getPressureAlphaV8,
      .placement = Placement::Spaced,
      .getRepeat = nullptr,
      .getRepeatDistance = rules::getRepeatDistanceV8,
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
