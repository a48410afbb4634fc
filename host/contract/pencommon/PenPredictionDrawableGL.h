#pragma once

#include "pencommon/PenDrawableGL.h"

namespace Qelt {

class MotionEvent;
class RectF;

// Draws the predicted continuation of the live stroke. Main thread.
class QELT_HOST_API IPenPredictionDrawableGL : public PenDrawableGL {
 public:
  explicit IPenPredictionDrawableGL(PenGLDataManager* manager);
  ~IPenPredictionDrawableGL() override;

  virtual void SetOpacity(float opacity) = 0;  // 0 to 1
  virtual bool Draw(const MotionEvent* event, RectF* rect) = 0;
};

class QELT_HOST_API PenPredictionDrawableGL : public IPenPredictionDrawableGL {
 public:
  explicit PenPredictionDrawableGL(PenGLDataManager* manager);
  ~PenPredictionDrawableGL() override;
};

}  // namespace Qelt
