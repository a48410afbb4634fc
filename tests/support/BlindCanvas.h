#pragma once

#include "desktop/graphics/PenCanvas.h"
#include "support/FakeLayer.h"

namespace QeltTests {

// With a layer a canvas like any other; without, one whose render messages have something to run through.
class BlindCanvas final : public QeltDesktop::PenCanvas {
 public:
  using PenCanvas::PenCanvas;
  Qelt::ISPLayer* GetLayer() override { return layer() != nullptr ? PenCanvas::GetLayer() : &mBlindLayer; }

 private:
  FakeLayer mBlindLayer{FakeTile(0, 4096)};
};

}  // namespace QeltTests
