#pragma once

#include "pencommon/PenDrawableGL.h"

namespace Qelt {

class List;
class MotionEvent;
class ObjectStroke;
class RectF;

// Redraws a list of page objects. Chosen here: the second interface of a stroke drawable.
class QELT_HOST_API IPenListRedrawable {
 public:
  virtual bool RedrawPen(const List* list, RectF* rect) = 0;

 protected:
  virtual ~IPenListRedrawable();
};

// Draws strokes. Each call sets `rect` to the rectangle of what it changed, in stroke units, and returns true
// when something was drawn or begun. Null arguments set the host error 7 and return false. Main thread.
class QELT_HOST_API PenStrokeDrawableGL : public PenDrawableGL, public IPenListRedrawable {
 public:
  explicit PenStrokeDrawableGL(PenGLDataManager* manager);
  ~PenStrokeDrawableGL() override;

  // One live event.
  virtual bool Draw(const MotionEvent* event, RectF* rect) = 0;
  // A whole recorded stroke, every point in the event's history.
  virtual bool RedrawPen(const MotionEvent* event, RectF* rect) = 0;
  // A stored stroke.
  virtual bool RedrawPen(const ObjectStroke* stroke, RectF* rect) = 0;
  bool RedrawPen(const List* list, RectF* rect) override = 0;
};

}  // namespace Qelt
