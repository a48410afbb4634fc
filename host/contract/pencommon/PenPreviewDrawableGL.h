#pragma once

#include "pencommon/PenDrawableGL.h"

namespace Qelt {

class List;
class MotionEvent;
class RectF;

// Draws the sample stroke of a settings panel. Main thread.
class QELT_HOST_API PenPreviewDrawableGL : public PenDrawableGL {
 public:
  explicit PenPreviewDrawableGL(PenGLDataManager* manager);
  ~PenPreviewDrawableGL() override;

  virtual bool Draw(const MotionEvent* event, RectF* rect) = 0;
  virtual bool RedrawPen(const MotionEvent* event, RectF* rect) = 0;
  virtual bool RedrawPen(const List* list, RectF* rect) = 0;
};

}  // namespace Qelt
