#pragma once

#include "pencommon/PenDrawableGL.h"

namespace Qelt {

class MotionEvent;
class ObjectStroke;
class RectF;

// Draws whole strokes as outlines. Main thread.
class QELT_HOST_API PenOutlineDrawableGL : public PenDrawableGL {
 public:
  explicit PenOutlineDrawableGL(PenGLDataManager* manager);
  ~PenOutlineDrawableGL() override;

  virtual void SetOutlineSize(float size);  // stroke units
  virtual float GetOutlineSize();
  virtual void SetOutlineColor(int argb);
  virtual int GetOutlineColor();
  virtual bool DrawOutline(const MotionEvent* event, RectF* rect) = 0;
  virtual bool DrawOutline(const ObjectStroke* stroke, RectF* rect) = 0;

 private:
  float mOutlineSize = 0.0f;
  int mOutlineColor = 0;
};

}  // namespace Qelt
