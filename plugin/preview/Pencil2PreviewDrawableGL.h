#pragma once

#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenPreviewDrawableRT.h"
#include "render/BatchGuard.h"
#include "render/RenderDrawables.h"
#include "stroke/StampPen.h"
#include "stroke/StrokeRules.h"
#include "stroke/StrokeVersions.h"
#include "stroke/input/PenSettings.h"

namespace Qelt {

class Pencil2PreviewReturnCallback final : public BatchGuard<PenPreviewDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

struct PreviewProfile {
  // As in StrokeProfile.
  float unknownPressure;
  float touchSkipDistance;
  float tiltCap;
  float (*adjustTilt)(float meanTilt);
  float (*getPointSize)(float size, float tiltBlend);
  float (*getPressureAlpha)(float pressure, float colorAlpha, float size);
  Placement placement;
  int (*getRepeat)(float length, float size);
  float (*getRepeatDistance)(float size);
  float (*stampSize)(float width);
  float (*stampAlpha)(float alpha);
  float (*stampReach)(float width);

  // What sets the preview apart from strokes; see StrokeProfile.
  static constexpr bool isOutline = false, publishes = false;
  // No alpha yet: the first segment begins with its own and does not fade in.
  static constexpr float startAlpha = -1.0f;
  static constexpr bool postsStraightStarts = true;
  static constexpr bool shiftsPattern = true, restartsPatternShift = true;
  static constexpr float growth = 1.0f, endGrowth = 1.0f, closeGrowth = 0.0f;
  static constexpr const char* wrongDistanceInDrawLine =
      "Pencil2PreviewDrawableGL::drawLine, mRepeatDistance is a wrong value(%f).";
  // Kept: the message names another class.
  static constexpr const char* wrongDistanceInEndPen =
      "Pencil3GL::EndPen, mRepeatDistance is a wrong value(%f).";
};

// The row of the preview, in the form of StrokeVersions.h. There is one, whatever version the pen draws with.
struct PreviewVersion {
  static constexpr const char* name = "Pencil2PreviewDrawableGL";
  static constexpr PreviewProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 1.0f,
      .adjustTilt = rules::adjustTiltV5,
      .getPointSize = rules::getPointSizeV5,
      .getPressureAlpha = rules::getPressureAlphaV2,
      .placement = Placement::SpacedOnCurves,
      .getRepeat = rules::getRepeatV3,
      .getRepeatDistance = rules::getRepeatDistancePreview,
      .stampSize = rules::stampWidthPreview,
      .stampAlpha = rules::stampAlphaPreview,
      .stampReach = rules::stampReachPreview,
  };
  static constexpr int tiltWindow = 3;
  static constexpr int orientationWindow = 3;
  using RenderDrawable = Pencil2PreviewDrawableRT;
  using ReturnGuard = Pencil2PreviewReturnCallback;
};

// Draws the sample stroke of a settings panel: live, while somebody drags in the panel, or a whole stroke
// that one event carries as its history. Its stamp pen is that of strokes, with a row of its own. Main
// thread.
class Pencil2PreviewDrawableGL final : public PenPreviewDrawableGL {
 public:
  Pencil2PreviewDrawableGL(Pencil2Data* penData, PenGLDataManager* manager);
  ~Pencil2PreviewDrawableGL() override;

  // False when memory ran out for the render drawable.
  bool hasRenderDrawable() const { return mRenderDrawable != nullptr; }

  bool Draw(const MotionEvent* event, RectF* rect) override;
  bool RedrawPen(const MotionEvent* event, RectF* rect) override;
  // Does nothing and returns true.
  bool RedrawPen(const List* list, RectF* rect) override;

 private:
  using Version = PreviewVersion;
  using RenderDrawable = Version::RenderDrawable;

  bool canDraw() const;
  void report(Version::ReturnGuard& guard, const RectF& rect);
  PenSettings settings() const { return PenSettings(mPenData); }

  Pencil2Data* mPenData;            // the pen's; may be null when its allocation failed
  RenderDrawable* mRenderDrawable;  // owned by the host's base; null when its allocation failed
  StampPen<Version> mPen;
};

}  // namespace Qelt
