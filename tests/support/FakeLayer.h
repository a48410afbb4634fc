#pragma once

#include <cstddef>
#include <vector>

#include "graphics/ISPBitmap.h"
#include "graphics/ISPPenCanvas.h"
#include "math/Matrix4.h"

namespace QeltTests {

// One of a row of square tiles that nothing is drawn into.
class FakeTile : public Qelt::ISPSubBitmap {
 public:
  explicit FakeTile(int left, int side = 64) : mX(left), mSide(side) {}
  int GetX() const override { return mX; }
  int GetY() const override { return 0; }
  int GetWidth() const override { return mSide; }
  int GetHeight() const override { return mSide; }
  const Qelt::Matrix4<float>& GetProjection() const override { return mProjection; }
  void BeginRender(int) override {}
  void EndRender(int) override {}

 private:
  int mX, mSide;
  Qelt::Matrix4<float> mProjection;
};

// Enough for a render message to run through its batch.
class FakeLayer : public Qelt::ISPLayer, public Qelt::ISPBitmap {
 public:
  explicit FakeLayer(const FakeTile& first = FakeTile(0)) : tiles{first} {}
  Qelt::ISPBitmap* GetBitmap() override { return hasBitmap ? this : nullptr; }
  int GetWidth() const override { return 0; }
  int GetHeight() const override { return 0; }
  Qelt::ISPTexture* GetTexture() override { return nullptr; }
  void SetDebugName(const char*) override {}
  void SetPixels(const void*, int, int) override {}
  int GetTileCount() const override { return static_cast<int>(tiles.size()); }
  Qelt::ISPSubBitmap* GetSubBitmap(int index) override { return &tiles[static_cast<std::size_t>(index)]; }

  std::vector<FakeTile> tiles;
  bool hasBitmap = true;
};

}  // namespace QeltTests
