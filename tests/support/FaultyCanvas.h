#pragma once

#include <climits>
#include <stdexcept>

#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/PenCanvas.h"
#include "graphics/ISPBitmap.h"
#include "graphics/ISPPenCanvas.h"
#include "math/Matrix4.h"

namespace QeltTests {

// Says which of a host's calls that may fail does so: a test's stand-ins for the host ask at each. For one
// thread; elsewhere nothing may be armed.
class HostFaults {
 public:
  // Which of the calls from now on fail: the `number`th from 1, or all from it on.
  static void fail(long number, bool andAllAfter) {
    sAsked = 0;
    sFrom = number;
    sTo = andAllAfter ? LONG_MAX : number;
  }
  // Nothing fails from here on. Returns how many calls have asked since `fail`.
  static long open() {
    sFrom = LONG_MAX;
    return sAsked;
  }
  // True when the call that asks is to fail.
  static bool strikes() {
    if (sFrom == LONG_MAX) return false;
    ++sAsked;
    return sAsked >= sFrom && sAsked <= sTo;
  }
  static void mayThrow() {
    if (strikes()) throw std::runtime_error("a call of the host's that was made to fail");
  }

 private:
  static inline long sAsked = 0, sFrom = LONG_MAX, sTo = 0;
};

// A tile that nothing is drawn into, and a layer of it: enough for a render message to run through its batch.
class FakeTile : public Qelt::ISPSubBitmap {
 public:
  int GetX() const override { return 0; }
  int GetY() const override { return 0; }
  int GetWidth() const override { return 4096; }
  int GetHeight() const override { return 4096; }
  const Qelt::Matrix4<float>& GetProjection() const override { return mProjection; }
  void BeginRender(int) override {}
  void EndRender(int) override {}

 private:
  Qelt::Matrix4<float> mProjection;
};

class FakeLayer : public Qelt::ISPLayer, public Qelt::ISPBitmap {
 public:
  Qelt::ISPBitmap* GetBitmap() override { return this; }
  int GetWidth() const override { return 0; }
  int GetHeight() const override { return 0; }
  Qelt::ISPTexture* GetTexture() override { return nullptr; }
  void SetDebugName(const char*) override {}
  void SetPixels(const void*, int, int) override {}
  int GetTileCount() const override { return 1; }
  Qelt::ISPSubBitmap* GetSubBitmap(int) override { return &mTile; }

 private:
  FakeTile mTile;
};

// What a canvas has to draw into. Boundless tiles say that each is the whole page, so that every rectangle
// meets them.
enum class Target { Whole, NoLayer, NoBitmap, NoTiles, BoundlessTiles };

// A canvas any call of which may fail, and any part of which may be missing. Without a layer it has one tile
// without GL, enough for render messages to run through their batch.
class FaultyCanvas final : public QeltDesktop::PenCanvas {
 public:
  FaultyCanvas(Qelt::IGLMsgQueue* queue, QeltDesktop::CanvasLayer* layer, Target target = Target::Whole)
      : PenCanvas(queue, layer) {
    setTarget(target);
    mLayer.real = layer != nullptr ? PenCanvas::GetLayer() : &mBlindLayer;
  }
  // From here on. Render thread, but before anything is posted.
  void setTarget(Target target) { mLayer.target = target; }
  // Tiles that were begun and not ended, of the canvas and of its bitmap. Render thread.
  int openTiles() const { return mOpen + mLayer.tile.open; }

  Qelt::IGLMsgQueue* GetMsgQueue() override {
    return HostFaults::strikes() ? nullptr : PenCanvas::GetMsgQueue();
  }
  Qelt::ISPLayer* GetLayer() override {
    return mLayer.target == Target::NoLayer || HostFaults::strikes() ? nullptr : &mLayer;
  }
  void BeginTile(int) override {
    HostFaults::mayThrow();
    ++mOpen;
  }
  void EndTile(int) override { --mOpen; }

 private:
  struct Tile final : Qelt::ISPSubBitmap {
    int GetX() const override { return boundless ? -4096 : real->GetX(); }
    int GetY() const override { return boundless ? -4096 : real->GetY(); }
    int GetWidth() const override { return boundless ? 8192 : real->GetWidth(); }
    int GetHeight() const override { return boundless ? 8192 : real->GetHeight(); }
    const Qelt::Matrix4<float>& GetProjection() const override {
      HostFaults::mayThrow();
      return real->GetProjection();
    }
    void BeginRender(int mode) override {
      HostFaults::mayThrow();
      real->BeginRender(mode);
      ++open;
    }
    void EndRender(int mode) override {
      --open;
      real->EndRender(mode);
    }
    Qelt::ISPSubBitmap* real = nullptr;
    bool boundless = false;
    int open = 0;
  };
  struct Layer final : Qelt::ISPLayer, Qelt::ISPBitmap {
    Qelt::ISPBitmap* GetBitmap() override {
      if (target == Target::NoBitmap || HostFaults::strikes()) return nullptr;
      bitmap = real->GetBitmap();
      return this;
    }
    int GetWidth() const override { return bitmap->GetWidth(); }
    int GetHeight() const override { return bitmap->GetHeight(); }
    Qelt::ISPTexture* GetTexture() override { return bitmap->GetTexture(); }
    void SetDebugName(const char*) override {}
    void SetPixels(const void*, int, int) override {}
    int GetTileCount() const override {
      return target == Target::NoTiles || HostFaults::strikes() ? 0 : bitmap->GetTileCount();
    }
    Qelt::ISPSubBitmap* GetSubBitmap(int index) override {
      if (HostFaults::strikes()) return nullptr;
      tile.real = bitmap->GetSubBitmap(index);
      tile.boundless = target == Target::BoundlessTiles;
      return &tile;
    }
    Qelt::ISPLayer* real = nullptr;
    Qelt::ISPBitmap* bitmap = nullptr;
    Target target = Target::Whole;
    Tile tile;
  };

  FakeLayer mBlindLayer;
  Layer mLayer;
  int mOpen = 0;
};

}  // namespace QeltTests
