#pragma once

#include "desktop/graphics/PenCanvas.h"
#include "support/BlindLayer.h"

namespace QeltTests {

// With a layer a canvas like any other; without, one whose render messages have something to run through.
class BlindCanvas final : public QeltDesktop::PenCanvas {
 public:
  using PenCanvas::PenCanvas;
  Qelt::ISPLayer* GetLayer() override { return layer() != nullptr ? PenCanvas::GetLayer() : &mBlindLayer; }

 private:
  BlindLayer mBlindLayer;
};

}  // namespace QeltTests
