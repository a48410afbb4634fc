#pragma once

#include "desktop/graphics/PenCanvas.h"
#include "graphics/ISPBitmap.h"
#include "support/FakeLayer.h"
#include "support/HostFaults.h"

namespace QeltTests {

// A tile of another layer's bitmap, whose calls may fail.
class StageTile final : public Qelt::ISPSubBitmap {
 public:
  int GetX() const override { return real->GetX(); }
  int GetY() const override { return real->GetY(); }
  int GetWidth() const override { return real->GetWidth(); }
  int GetHeight() const override { return real->GetHeight(); }
  const Qelt::Matrix4<float>& GetProjection() const override { return real->GetProjection(); }
  void BeginRender(int mode) override {
    HostFaults::mayThrow();
    real->BeginRender(mode);
  }
  void EndRender(int mode) override { real->EndRender(mode); }

  Qelt::ISPSubBitmap* real = nullptr;
};

// What a canvas has to draw into.
enum class Target { Whole, NoLayer, NoBitmap, NoTiles };

// Another layer and its bitmap, any part of which may be missing.
class StageLayer final : public Qelt::ISPLayer, public Qelt::ISPBitmap {
 public:
  Qelt::ISPBitmap* GetBitmap() override {
    if (target == Target::NoBitmap || HostFaults::strikes()) return nullptr;
    mBitmap = real->GetBitmap();
    return this;
  }
  int GetWidth() const override { return mBitmap->GetWidth(); }
  int GetHeight() const override { return mBitmap->GetHeight(); }
  Qelt::ISPTexture* GetTexture() override { return mBitmap->GetTexture(); }
  void SetDebugName(const char*) override {}
  void SetPixels(const void*, int, int) override {}
  int GetTileCount() const override {
    return target == Target::NoTiles || HostFaults::strikes() ? 0 : mBitmap->GetTileCount();
  }
  Qelt::ISPSubBitmap* GetSubBitmap(int index) override {
    if (HostFaults::strikes()) return nullptr;
    mTile.real = mBitmap->GetSubBitmap(index);
    return &mTile;
  }

  Qelt::ISPLayer* real = nullptr;
  Target target = Target::Whole;

 private:
  Qelt::ISPBitmap* mBitmap = nullptr;
  StageTile mTile;
};

// A canvas any call of which may fail. Without a layer it has one tile without GL, enough for render messages
// to run through their batch.
class StageCanvas final : public QeltDesktop::PenCanvas {
 public:
  StageCanvas(Qelt::IGLMsgQueue* queue, QeltDesktop::CanvasLayer* layer, Target target = Target::Whole)
      : PenCanvas(queue, layer) {
    setTarget(target);
    mLayer.real = PenCanvas::GetLayer();
    if (mLayer.real == nullptr) mLayer.real = &mBlindLayer;
  }
  // From here on. Render thread, but before anything is posted.
  void setTarget(Target target) { mLayer.target = target; }
  Qelt::IGLMsgQueue* GetMsgQueue() override {
    return HostFaults::strikes() ? nullptr : PenCanvas::GetMsgQueue();
  }
  Qelt::ISPLayer* GetLayer() override {
    return mLayer.target == Target::NoLayer || HostFaults::strikes() ? nullptr : &mLayer;
  }
  void BeginTile(int) override { HostFaults::mayThrow(); }

 private:
  FakeLayer mBlindLayer{FakeTile(0, 4096)};
  StageLayer mLayer;
};

}  // namespace QeltTests
