#pragma once

#include "base/PointF.h"
#include "base/Vector.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenPredictionDrawableRT.h"
#include "render/BatchGuard.h"
#include "render/RenderDrawables.h"
#include "stroke/StrokeRules.h"
#include "stroke/input/PenSettings.h"
#include "stroke/placing/SegmentPlacer.h"
#include "stroke/placing/StampRun.h"
#include "stroke/placing/ViewScale.h"

namespace Qelt {

class Pencil2PredictionReturnCallback final : public BatchGuard<PenPredictionDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

struct PredictionProfile {
  float repeatDistance;  // from stamp to stamp, stroke units
  // Hand-over.
  float (*stampSize)(float width);
  float (*stampAlpha)(float alpha);
  float (*stampReach)(float width);

  static constexpr bool isOutline = false;
};

// The row of the prediction, in the form of StrokeVersions.h. There is one, which continues the strokes of
// all versions that predict.
struct PredictionVersion {
  static constexpr const char* name = "Pencil2PredictionDrawableGL";
  static constexpr PredictionProfile profile{
      .repeatDistance = 1.0f,
      .stampSize = rules::stampHalfWidthV8,
      .stampAlpha = rules::stampAlphaPrediction,
      .stampReach = rules::stampReachV8,
  };
  using RenderDrawable = Pencil2PredictionDrawableRT;
  using ReturnGuard = Pencil2PredictionReturnCallback;
};

// Continues the live stroke through predicted points, under one opacity. Begins where the stroke drawable
// left off, with the look of its last stamp, both from the pen's record. Of the predicted samples only the
// positions count. Main thread.
class Pencil2PredictionDrawableGL final : public PenPredictionDrawableGL {
 public:
  Pencil2PredictionDrawableGL(Pencil2Data* penData, PenGLDataManager* manager);
  ~Pencil2PredictionDrawableGL() override;

  // False when memory ran out for the render drawable.
  bool hasRenderDrawable() const { return mRenderDrawable != nullptr; }

  // 0 to 1. A value that is not finite changes nothing.
  void SetOpacity(float opacity) override;
  // Predicts from a move event, once from each state of the live stroke. Any other event returns false, but
  // uses that state up all the same.
  bool Draw(const MotionEvent* event, RectF* rect) override;

 private:
  using Version = PredictionVersion;
  using RenderDrawable = Version::RenderDrawable;

  // Takes the live stroke over. Returns false where the record holds nothing that could be continued.
  bool startPen();
  bool movePen(const MotionEvent& event, RectF* rect);
  // `last`: the path ends at the point itself, not half way to it.
  void drawLine(PointF at, bool last, RectF* rect);
  Vector2<float> getInverseScale();
  PenSettings settings() const { return PenSettings(mPenData); }

  Pencil2Data* mPenData;            // the pen's; may be null when its allocation failed
  RenderDrawable* mRenderDrawable;  // owned by the host's base; null when its allocation failed
  SegmentPlacer<Version> mPlacer;
  ViewScale mViewScale;
  SegmentLook mLook{};  // of all stamps; the live stroke's last
};

}  // namespace Qelt
