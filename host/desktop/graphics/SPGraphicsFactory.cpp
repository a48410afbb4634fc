#include "graphics/SPGraphicsFactory.h"

#include <memory>
#include <mutex>
#include <new>
#include <unordered_map>

#include "desktop/gl/GlDevice.h"
#include "desktop/graphics/BitmapCanvas.h"
#include "desktop/graphics/GlBitmap.h"
#include "graphics/ISPBitmap.h"
#include "graphics/ISPCanvas.h"

namespace Qelt {

using QeltDesktop::BitmapCanvas;
using QeltDesktop::GlBitmap;
using QeltDesktop::GlDevice;

namespace {

// The bitmaps made here and not released yet. Drawables keep the addresses of released bitmaps, so a second
// release must find nothing.
struct LiveBitmaps {
  std::mutex lock;
  std::unordered_map<ISPBitmap*, GlBitmap*> all;
};

LiveBitmaps& liveBitmaps() {
  static LiveBitmaps* const instance = new LiveBitmaps;
  return *instance;
}

}  // namespace

ISPBitmap* SPGraphicsFactory::CreateBitmap(IGLMsgQueue*, int width, int height, const void* pixels, bool,
                                           int) {
  const GlDevice* const device = GlDevice::current();
  if (device == nullptr || width <= 0 || height <= 0) return nullptr;
  if (width > device->maxTextureSize() || height > device->maxTextureSize()) return nullptr;
  try {
    auto bitmap = std::make_unique<GlBitmap>(width, height, 0);
    if (pixels != nullptr) bitmap->SetPixels(pixels, width, height);
    LiveBitmaps& live = liveBitmaps();
    const std::lock_guard guard(live.lock);
    live.all.emplace(bitmap.get(), bitmap.get());
    return bitmap.release();
  } catch (const std::bad_alloc&) {
    return nullptr;
  }
}

void SPGraphicsFactory::ReleaseBitmap(ISPBitmap* bitmap) {
  LiveBitmaps& live = liveBitmaps();
  GlBitmap* made = nullptr;
  {
    const std::lock_guard guard(live.lock);
    const auto found = live.all.find(bitmap);
    if (found == live.all.end()) return;
    made = found->second;
    live.all.erase(found);
  }
  delete made;
}

ISPCanvas* SPGraphicsFactory::CreateCanvas(IGLMsgQueue*, ISPBitmap* bitmap, int) {
  auto* const target = dynamic_cast<GlBitmap*>(bitmap);
  if (target == nullptr || target->GetTileCount() > 0) return nullptr;
  try {
    return new BitmapCanvas(*target);
  } catch (const std::bad_alloc&) {
    return nullptr;
  }
}

void SPGraphicsFactory::ReleaseCanvas(ISPCanvas* canvas) {
  delete canvas;
}

}  // namespace Qelt
