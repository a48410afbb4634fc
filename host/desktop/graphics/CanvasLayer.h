#pragma once

#include <cstdint>
#include <limits>
#include <memory>
#include <span>
#include <vector>

#include "base/HostApi.h"
#include "base/RectF.h"
#include "graphics/ISPPenCanvas.h"

namespace QeltDesktop {

class GlBitmap;
class RenderQueue;

// A layer that pens draw into: one RGBA8 texture whose first row is the top of the page, in tiles that are
// windows into one framebuffer, numbered row by row. It starts transparent and holds premultiplied colour.
// Made, cleared, read and destroyed by the thread that made the queue, which outlives the layer; drawn into
// on the render thread.
//
// A context loss takes the pixels: when the context is restored the layer is transparent, and `timesEmptied`
// has gone up. Whoever owns the layer then has its strokes drawn again; nobody else knows what was on it.
class QELT_HOST_API CanvasLayer : public Qelt::ISPLayer {
 public:
  static constexpr int kTileSize = 512;
  // Makes the whole layer one tile. Overlays that predictions are drawn into want it: a prediction's stamps
  // reach further than the rectangle that it reports, and a pen draws only into the tiles that this meets.
  static constexpr int kOneTile = std::numeric_limits<int>::max();

  // Sizes in pixels. Throws std::runtime_error with one clear line when the page, or one tile of it, is
  // larger than GL can draw, or the queue has no GL; a layer of one tile is refused too, never split.
  CanvasLayer(RenderQueue& queue, int width, int height, int tileSize = kTileSize);
  ~CanvasLayer() override;
  CanvasLayer(const CanvasLayer&) = delete;
  CanvasLayer& operator=(const CanvasLayer&) = delete;

  Qelt::ISPBitmap* GetBitmap() override;

  int width() const { return mWidth; }
  int height() const { return mHeight; }
  // Divides the layer into other tiles, which leaves its pixels as they are. Nothing that is to draw into it
  // may still wait. Throws as the constructor does, and the tiles are then the old ones.
  void setTileSize(int tileSize);
  // Makes every pixel transparent, after everything posted so far.
  void clear();
  // The same for the pixels of an area; what of it lies outside the layer is left out.
  void clear(const Qelt::Rect& area);
  // Copies the pixels of an area from another layer of the queue, after everything posted so far. What of it
  // lies outside of either layer is left out.
  void copyFrom(CanvasLayer& source, const Qelt::Rect& area);
  // How often the layer has come back empty after a context loss. Any thread.
  int timesEmptied() const;
  // width x height x 4 bytes, red first, premultiplied, first row = top, after everything posted so far.
  // Throws std::runtime_error while there is no context.
  std::vector<std::uint8_t> readPixels();
  // The same for as many whole rows as `pixels` has room for, from row `top` on. Throws std::invalid_argument
  // when the layer has no such rows.
  void readRows(int top, std::span<std::uint8_t> pixels);

 private:
  friend class LayerBackup;

  // Throws for the constructor. Render thread.
  void checkSize(int tileSize) const;

  RenderQueue& mQueue;
  int mWidth;
  int mHeight;
  std::unique_ptr<GlBitmap> mBitmap;
};

}  // namespace QeltDesktop
