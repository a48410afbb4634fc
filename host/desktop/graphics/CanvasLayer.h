#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "base/HostApi.h"
#include "graphics/ISPPenCanvas.h"

namespace QeltDesktop {

class GlBitmap;
class RenderQueue;

// A layer that pens draw into: one RGBA8 texture whose first row is the top of the page, in tiles that are
// windows into one framebuffer, numbered row by row. It starts transparent, holds premultiplied colour and
// keeps its pixels over a context loss. Made, cleared, read and destroyed by the thread that made the
// queue, which outlives the layer; drawn into on the render thread.
class QELT_HOST_API CanvasLayer : public Qelt::ISPLayer {
 public:
  // Sizes in pixels. Throws std::runtime_error with one clear line when the page is larger than GL can
  // draw, or the queue has no GL.
  CanvasLayer(RenderQueue& queue, int width, int height, int tileSize = 512);
  ~CanvasLayer() override;
  CanvasLayer(const CanvasLayer&) = delete;
  CanvasLayer& operator=(const CanvasLayer&) = delete;

  Qelt::ISPBitmap* GetBitmap() override;

  int width() const { return mWidth; }
  int height() const { return mHeight; }
  // Makes every pixel transparent, after everything posted so far.
  void clear();
  // width x height x 4 bytes, red first, premultiplied, first row = top, after everything posted so far.
  // Throws std::runtime_error while there is no context.
  std::vector<std::uint8_t> readPixels();

 private:
  RenderQueue& mQueue;
  int mWidth;
  int mHeight;
  std::unique_ptr<GlBitmap> mBitmap;
};

}  // namespace QeltDesktop
