#pragma once

#include "base/RectF.h"
#include "gl/ITask.h"
#include "math/Matrix4.h"

namespace Qelt {

class ISPBitmap;
class ISPPenCanvas;
class PenDrawableRT;

// Draws a finished batch of stamps into every canvas tile that its rectangle meets, then has the render
// drawable forget the batch. Owns nothing.
//
// The rectangle is the area that the call reports, in stroke units: what it placed stamps around, grown by a
// share of their size and by a margin that each kind of drawable fixes. It is not grown here, only mapped to
// canvas pixels and boxed, and a tile is drawn into if it overlaps that box. In such a tile every stamp of
// the batch is drawn, cut by the tile's own edges, and since all tiles show one picture, stamps meet at their
// borders. But the growth does not follow every stamp to its rim: wide ones of version 8 and of predictions,
// and those of curved outlines, can reach further than their rectangle. What reaches into a tile that the
// rectangle does not meet is missing there. docs/reliability.md says how much of which drawable that is.
class PenGLRenderMsg final : public ITask {
 public:
  // Takes the canvas's transform as it is now; `rect` is in stroke units. Main thread.
  PenGLRenderMsg(PenDrawableRT* drawable, ISPPenCanvas* canvas, const RectF& rect, bool useCacheBuffer);

  void run() override;

  // The bounding box of the rectangle's four mapped corners, canvas pixels.
  RectF getTransformedRect() const;

  ISPBitmap* mReferenceBitmap = nullptr;  // if set, handed to the render drawable before each tile
  ISPBitmap* mDepthMapBitmap = nullptr;   // likewise
  PenDrawableRT* mDrawable;
  ISPPenCanvas* mCanvas;
  RectF mRect;
  Matrix4<float> mMatrix;  // stroke units to canvas pixels
  bool mUseCacheBuffer;
};

}  // namespace Qelt
