#pragma once

#include "base/PointF.h"
#include "base/Vector.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "prediction/PredictionVersions.h"
#include "stroke/parts/PenSettings.h"
#include "stroke/parts/SegmentPath.h"
#include "stroke/parts/StampCounter.h"
#include "stroke/parts/StampLimits.h"
#include "stroke/parts/ViewScale.h"

namespace Qelt {

struct Pencil2Data;

// Continues the live stroke through predicted points, under one opacity. Begins where the stroke drawable
// left off, with the looks of its last stamp, all from the pen's record; of the predicted samples only the
// positions count. Main thread.
class Pencil2PredictionDrawableGL final : public PenPredictionDrawableGL {
 public:
  Pencil2PredictionDrawableGL(Pencil2Data* penData, PenGLDataManager* manager);
  ~Pencil2PredictionDrawableGL() override;

  // False when memory ran out for the render-thread half.
  bool hasPartner() const { return mRender != nullptr; }

  // 0 to 1; what is no finite number changes nothing.
  void SetOpacity(float opacity) override;
  // Predicts from a move event, once from each state of the live stroke. Any other event uses that state up
  // all the same, and answers false.
  bool Draw(const MotionEvent* event, RectF* rect) override;

 private:
  using Version = PredictionVersion;
  using RenderDrawable = Version::RenderDrawable;

  // Takes the live stroke over; false where nothing can be continued from what the record holds.
  bool startPen();
  bool movePen(const MotionEvent& event, RectF* rect);
  // `last`: the path ends at the point itself, not half way to it. True when it placed a stamp.
  bool drawLine(PointF at, bool last, RectF* rect);
  Vector2<float> getInverseScale();
  PenSettings settings() const { return PenSettings(mPenData); }

  Pencil2Data* mPenData;    // the pen's; may be null when its allocation failed
  RenderDrawable* mRender;  // owned by the host's base; null when its allocation failed
  SegmentPath mPath;
  StampCounter mStamps;
  ViewScale mViewScale;
  StampLimits mLimits;
  float mCarried = 0.0f;  // where the next stamp lies on the next segment
  // The live stroke's last values.
  float mWidth = 0.0f;
  float mAlpha = -1.0f;
  float mOrientation = 0.0f;  // radians
  float mTiltBlend = 0.0f;
};

}  // namespace Qelt
