#pragma once

#include <cstddef>
#include <memory>

#include "base/HostApi.h"
#include "base/RectF.h"

namespace QeltDesktop {

class CanvasLayer;
class GlBitmap;
class RenderQueue;

// The pixels of an area of a layer, kept on the GPU. Made and used by the thread that made the queue, which
// outlives it. A context loss takes the pixels, and they do not come back.
class QELT_HOST_API LayerBackup {
 public:
  // Copies the area, which has pixels and lies in the layer, after everything posted so far. Throws
  // std::runtime_error when the queue has been shut down, std::bad_alloc.
  LayerBackup(RenderQueue& queue, CanvasLayer& layer, const Qelt::Rect& area);
  ~LayerBackup();
  LayerBackup(const LayerBackup&) = delete;
  LayerBackup& operator=(const LayerBackup&) = delete;

  const Qelt::Rect& area() const { return mArea; }
  std::size_t bytes() const;
  // Exchanges the kept pixels and the layer's, after everything posted so far. The layer is as large as the
  // first one. Nothing has changed when it throws, as the constructor does.
  void swapWith(CanvasLayer& layer);

 private:
  std::unique_ptr<GlBitmap> copyOf(CanvasLayer& layer) const;

  RenderQueue& mQueue;
  const Qelt::Rect mArea;
  std::unique_ptr<GlBitmap> mPixels;
};

}  // namespace QeltDesktop
