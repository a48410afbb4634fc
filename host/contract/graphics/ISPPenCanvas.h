#pragma once

#include "base/HostApi.h"
#include "base/Matrix.h"

namespace Qelt {

class IGLMsgQueue;
class ISPBitmap;

// What a canvas draws into. Render thread.
class QELT_HOST_API ISPLayer {
 public:
  // The tiled bitmap; null when there is none yet.
  virtual ISPBitmap* GetBitmap() = 0;

 protected:
  virtual ~ISPLayer();
};

// The view that a pen draws into: a transform, a queue and a layer. Slots chosen here.
class QELT_HOST_API ISPPenCanvas {
 public:
  // Main thread: the queue of the render thread that owns the layer; null when there is none.
  virtual IGLMsgQueue* GetMsgQueue() = 0;
  // Main thread: stroke units to canvas pixels, column-major. Borrowed until the view changes.
  virtual const Matrix3<float>& GetMatrix() = 0;
  // Render thread: null when the canvas has no layer.
  virtual ISPLayer* GetLayer() = 0;
  // Render thread: called around each tile of the layer's bitmap, drawn into or not.
  virtual void BeginTile(int index) = 0;
  virtual void EndTile(int index) = 0;

 protected:
  virtual ~ISPPenCanvas();
};

}  // namespace Qelt
