#pragma once

#include "base/RectF.h"
#include "gl/ITask.h"
#include "math/Matrix4.h"

namespace Qelt {

class ISPBitmap;
class ISPPenCanvas;
class PenDrawableRT;

// Draws a finished batch of stamps into every canvas tile that its rectangle meets, then has the drawable
// forget the batch. Nothing is owned.
class PenGLRenderMsg final : public ITask {
 public:
  // The message of a batch: the canvas's current transform, a rectangle in stroke units. Main thread.
  PenGLRenderMsg(PenDrawableRT* drawable, ISPPenCanvas* canvas, const RectF& rect, bool useCacheBuffer);

  void run() override;

  // The bounding box of the rectangle's four mapped corners, canvas pixels.
  RectF getTransformedRect() const;

  ISPBitmap* mReferenceBitmap = nullptr;  // handed to the drawable before each tile where set
  ISPBitmap* mDepthMapBitmap = nullptr;   // likewise
  PenDrawableRT* mDrawable;
  ISPPenCanvas* mCanvas;
  RectF mRect;
  Matrix4<float> mMatrix;  // stroke units to canvas pixels
  bool mUseCacheBuffer;
};

}  // namespace Qelt
