#pragma once

#include "outline/Pencil2OutlineDrawableRTV1.h"
#include "pencommon/PenOutlineDrawableRT.h"
#include "render/BatchGuard.h"
#include "stroke/StrokeRules.h"
#include "stroke/StrokeVersions.h"

// All outline versions side by side, in the form of the strokes' rows (StrokeVersions.h): every field
// written, rules named after the stroke version that brought them, released rows frozen. Versions 1 and 2 are
// the same and stay two rows.
namespace Qelt {

// Each version hands its two streams over with a guard of its own, all alike.
class Pencil2OutlineV1ReturnCallback final : public BatchGuard<PenOutlineDrawableRT, 2> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2OutlineV2ReturnCallback final : public BatchGuard<PenOutlineDrawableRT, 2> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2OutlineV3ReturnCallback final : public BatchGuard<PenOutlineDrawableRT, 2> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2OutlineV4ReturnCallback final : public BatchGuard<PenOutlineDrawableRT, 2> {
 public:
  using BatchGuard::BatchGuard;
};

class Pencil2OutlineV5ReturnCallback final : public BatchGuard<PenOutlineDrawableRT, 2> {
 public:
  using BatchGuard::BatchGuard;
};

struct OutlineProfile {
  // Input. Pressure is carried along without effect.
  float unknownPressure;    // for finger, mouse and a stylus on a touch screen, and in place of a NaN
  float touchSkipDistance;  // stroke units; shorter moves of those tools are taken every other time
  float tiltCap;            // radians
  // Mappings, see StrokeRules.h.
  float (*adjustTilt)(float meanTilt);
  float (*getPointSize)(float size, float tiltBlend);
  // Placement.
  // Stamps on a segment; at 0 the segment is dropped, and the next move is measured from the same point.
  int (*getRepeat)(float length, float size);
  // Hand-over.
  float (*stampSize)(float width);
  float (*stampReach)(float width);

  // What all outline versions have in common; see StrokeProfile.
  static constexpr bool isOutline = true;
  static constexpr Placement placement = Placement::Even;
  static constexpr bool shiftsPattern = false, publishes = false;
  static constexpr float growth = 5.0f, endGrowth = 1.0f, closeGrowth = 0.0f;
  static constexpr const char *wrongDistanceInDrawLine = nullptr, *wrongDistanceInEndPen = nullptr;
};

struct OutlineV1 {
  static constexpr int number = 1;
  static constexpr const char* name = "Pencil2OutlineDrawableGLV1";
  static constexpr OutlineProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .adjustTilt = rules::adjustTiltV1,
      .getPointSize = rules::getPointSizeV1,
      .getRepeat = rules::getRepeatV1,
      .stampSize = rules::stampWidthV1,
      .stampReach = rules::stampReachV1,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using RenderDrawable = Pencil2OutlineDrawableRTV1;
  using ReturnGuard = Pencil2OutlineV1ReturnCallback;
};

struct OutlineV2 {
  static constexpr int number = 2;
  static constexpr const char* name = "Pencil2OutlineDrawableGLV2";
  static constexpr OutlineProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .adjustTilt = rules::adjustTiltV1,
      .getPointSize = rules::getPointSizeV1,
      .getRepeat = rules::getRepeatV1,
      .stampSize = rules::stampWidthV1,
      .stampReach = rules::stampReachV1,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using RenderDrawable = Pencil2OutlineDrawableRTV1;
  using ReturnGuard = Pencil2OutlineV2ReturnCallback;
};

struct OutlineV3 {
  static constexpr int number = 3;
  static constexpr const char* name = "Pencil2OutlineDrawableGLV3";
  static constexpr OutlineProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .adjustTilt = rules::adjustTiltV1,
      .getPointSize = rules::getPointSizeV1,
      .getRepeat = rules::getRepeatV3,
      .stampSize = rules::stampWidthV1,
      .stampReach = rules::stampReachV1,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using RenderDrawable = Pencil2OutlineDrawableRTV1;
  using ReturnGuard = Pencil2OutlineV3ReturnCallback;
};

struct OutlineV4 {
  static constexpr int number = 4;
  static constexpr const char* name = "Pencil2OutlineDrawableGLV4";
  static constexpr OutlineProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 0.79f,
      .adjustTilt = rules::adjustTiltV1,
      .getPointSize = rules::getPointSizeV1,
      .getRepeat = rules::getRepeatV3,
      .stampSize = rules::stampWidthV4,
      .stampReach = rules::stampReachV4,
  };
  static constexpr int tiltWindow = 70;
  static constexpr int orientationWindow = 50;
  using RenderDrawable = Pencil2OutlineDrawableRTV1;
  using ReturnGuard = Pencil2OutlineV4ReturnCallback;
};

struct OutlineV5 {
  static constexpr int number = 5;
  static constexpr const char* name = "Pencil2OutlineDrawableGLV5";
  static constexpr OutlineProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 1.0f,
      .adjustTilt = rules::adjustTiltV5,
      .getPointSize = rules::getPointSizeV5,
      .getRepeat = rules::getRepeatV3,
      .stampSize = rules::stampWidthV4,
      .stampReach = rules::stampReachV4,
  };
  static constexpr int tiltWindow = 3;
  static constexpr int orientationWindow = 3;
  using RenderDrawable = Pencil2OutlineDrawableRTV1;
  using ReturnGuard = Pencil2OutlineV5ReturnCallback;
};

}  // namespace Qelt
