#pragma once

#include "graphics/ISPCanvas.h"

namespace QeltDesktop {

class GlBitmap;

// Draws shapes in the program's own memory and uploads them to a bitmap, which holds premultiplied colours
// afterwards. The bitmap keeps these pixels, so that they are there again after a context loss. Render
// thread.
class BitmapCanvas final : public Qelt::ISPCanvas {
 public:
  // `bitmap` outlives the canvas. The canvas's first drawing replaces whatever was uploaded to the bitmap
  // before. Throws std::bad_alloc.
  explicit BitmapCanvas(GlBitmap& bitmap);

  void Clear(unsigned int argb) override;
  void DrawShape(float x, float y, float size, const Qelt::SPPaint& paint) override;

 private:
  GlBitmap& mBitmap;
};

}  // namespace QeltDesktop
