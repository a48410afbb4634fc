#include "desktop/graphics/CanvasLayer.h"

#include <algorithm>
#include <cstddef>
#include <stdexcept>
#include <string>

#include "desktop/base/Log.h"
#include "desktop/gl/GlDevice.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/GlBitmap.h"

namespace Qelt {

ISPLayer::~ISPLayer() = default;

}  // namespace Qelt

namespace QeltDesktop {

namespace {

std::size_t rowBytes(int width) {
  return static_cast<std::size_t>(width) * 4;
}

constexpr const char* kNoThread = "a page needs a render thread, and it has been shut down";

std::string sizeText(int width, int height) {
  return std::to_string(width) + " x " + std::to_string(height) + " pixels";
}

}  // namespace

CanvasLayer::CanvasLayer(RenderQueue& queue, int width, int height, int tileSize)
    : mQueue(queue), mWidth(width), mHeight(height) {
  const bool ran = mQueue.run([&] {
    checkSize(tileSize);
    mBitmap = std::make_unique<GlBitmap>(width, height, tileSize);
    if (!mBitmap->isRenderable()) {
      mBitmap.reset();
      throw std::runtime_error("OpenGL has no memory for a page of " + sizeText(width, height));
    }
  });
  if (!ran) throw std::runtime_error(kNoThread);
}

CanvasLayer::~CanvasLayer() {
  try {
    mQueue.run([this] { mBitmap.reset(); });
  } catch (...) {
    logError("a page could not be given back to OpenGL; it goes with the context");
  }
}

Qelt::ISPBitmap* CanvasLayer::GetBitmap() {
  return mBitmap.get();
}

void CanvasLayer::setTileSize(int tileSize) {
  const bool ran = mQueue.run([&] {
    checkSize(tileSize);
    mBitmap->setTiles(tileSize);
  });
  if (!ran) throw std::runtime_error(kNoThread);
}

void CanvasLayer::clear() {
  mQueue.run([this] { mBitmap->clear(0.0f, 0.0f, 0.0f, 0.0f); });
}

void CanvasLayer::clear(const Qelt::Rect& area) {
  const int left = std::max(area.left, 0), right = std::min(area.right, mWidth);
  const int top = std::max(area.top, 0), bottom = std::min(area.bottom, mHeight);
  if (left >= right || top >= bottom) return;
  mQueue.run([&] { mBitmap->clear(left, top, right - left, bottom - top); });
}

void CanvasLayer::copyFrom(CanvasLayer& source, const Qelt::Rect& area) {
  const int left = std::max(area.left, 0), right = std::min({area.right, mWidth, source.mWidth});
  const int top = std::max(area.top, 0), bottom = std::min({area.bottom, mHeight, source.mHeight});
  if (left >= right || top >= bottom) return;
  mQueue.run([&] { mBitmap->copyFrom(*source.mBitmap, left, top, left, top, right - left, bottom - top); });
}

int CanvasLayer::timesEmptied() const {
  return mBitmap->timesEmptied();
}

std::vector<std::uint8_t> CanvasLayer::readPixels() {
  std::vector<std::uint8_t> pixels(rowBytes(mWidth) * static_cast<std::size_t>(mHeight));
  readRows(0, pixels);
  return pixels;
}

void CanvasLayer::readRows(int top, std::span<std::uint8_t> pixels) {
  const std::size_t rows = pixels.size() / rowBytes(mWidth);
  if (top < 0 || top > mHeight || rows > static_cast<std::size_t>(mHeight - top) ||
      pixels.size() % rowBytes(mWidth) != 0) {
    throw std::invalid_argument("a page has no such rows");
  }
  bool read = false;
  mQueue.run([&] { read = mBitmap->readRows(top, pixels); });
  if (!read) throw std::runtime_error("a page cannot be read back without OpenGL");
}

void CanvasLayer::checkSize(int tileSize) const {
  if (mWidth < 1 || mHeight < 1 || tileSize < 1) {
    throw std::runtime_error("a page of " + sizeText(mWidth, mHeight) + " has no area");
  }
  const GlDevice* const device = GlDevice::live();
  if (device == nullptr) throw std::runtime_error("a page needs OpenGL, and there is none");
  // A tile is drawn into at once, a page is not.
  const bool drawable = std::min(std::max(mWidth, mHeight), tileSize) <= device->maxViewportSize();
  const int most =
      drawable ? device->maxTextureSize() : std::min(device->maxTextureSize(), device->maxViewportSize());
  if (mWidth > most || mHeight > most) {
    throw std::runtime_error("a page of " + sizeText(mWidth, mHeight) +
                             " is larger than OpenGL can draw here (" + std::to_string(most) + " x " +
                             std::to_string(most) + ")");
  }
}

}  // namespace QeltDesktop
