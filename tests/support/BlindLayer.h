#pragma once

#include "graphics/ISPBitmap.h"
#include "graphics/ISPPenCanvas.h"
#include "math/Matrix4.h"

namespace QeltTests {

// A layer of one tile that nothing is drawn into: enough for a render message to run through its batch.
class BlindLayer final : public Qelt::ISPLayer, public Qelt::ISPBitmap, public Qelt::ISPSubBitmap {
 public:
  Qelt::ISPBitmap* GetBitmap() override { return this; }
  int GetWidth() const override { return 4096; }
  int GetHeight() const override { return 4096; }
  Qelt::ISPTexture* GetTexture() override { return nullptr; }
  void SetDebugName(const char*) override {}
  void SetPixels(const void*, int, int) override {}
  int GetTileCount() const override { return 1; }
  Qelt::ISPSubBitmap* GetSubBitmap(int) override { return this; }
  int GetX() const override { return 0; }
  int GetY() const override { return 0; }
  const Qelt::Matrix4<float>& GetProjection() const override { return mProjection; }
  void BeginRender(int) override {}
  void EndRender(int) override {}

 private:
  Qelt::Matrix4<float> mProjection;
};

}  // namespace QeltTests
