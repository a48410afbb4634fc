#include "desktop/graphics/LayerBackup.h"

#include <functional>
#include <stdexcept>
#include <utility>

#include "desktop/base/Log.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/GlBitmap.h"

namespace QeltDesktop {

namespace {

int widthOf(const Qelt::Rect& area) {
  return area.right - area.left;
}

int heightOf(const Qelt::Rect& area) {
  return area.bottom - area.top;
}

void runOrThrow(RenderQueue& queue, const std::function<void()>& call) {
  if (!queue.run(call)) throw std::runtime_error("pixels cannot be kept without a render thread");
}

}  // namespace

LayerBackup::LayerBackup(RenderQueue& queue, CanvasLayer& layer, const Qelt::Rect& area)
    : mQueue(queue), mArea(area) {
  runOrThrow(mQueue, [&] { mPixels = copyOf(layer); });
}

LayerBackup::~LayerBackup() {
  try {
    mQueue.run([this] { mPixels.reset(); });
  } catch (...) {
    logError("kept pixels could not be given back to OpenGL; they go with the context");
  }
}

std::size_t LayerBackup::bytes() const {
  return std::size_t{4} * static_cast<std::size_t>(widthOf(mArea)) *
         static_cast<std::size_t>(heightOf(mArea));
}

void LayerBackup::swapWith(CanvasLayer& layer) {
  runOrThrow(mQueue, [&] {
    std::unique_ptr<GlBitmap> there = copyOf(layer);
    layer.mBitmap->copyFrom(*mPixels, 0, 0, mArea.left, mArea.top, widthOf(mArea), heightOf(mArea));
    mPixels = std::move(there);
  });
}

std::unique_ptr<GlBitmap> LayerBackup::copyOf(CanvasLayer& layer) const {
  auto copy = std::make_unique<GlBitmap>(widthOf(mArea), heightOf(mArea), 0);
  copy->copyFrom(*layer.mBitmap, mArea.left, mArea.top, 0, 0, widthOf(mArea), heightOf(mArea));
  return copy;
}

}  // namespace QeltDesktop
