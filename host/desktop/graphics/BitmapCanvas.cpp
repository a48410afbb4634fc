#include "desktop/graphics/BitmapCanvas.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "desktop/graphics/GlBitmap.h"

namespace Qelt {

SPPaint::SPPaint() = default;
SPPaint::~SPPaint() = default;

void SPPaint::SetColor(unsigned int argb) {
  mColor = argb;
}

void SPPaint::SetStyle(int style) {
  mStyle = style;
}

void SPPaint::SetAntiAlias(bool on) {
  mAntiAlias = on;
}

unsigned int SPPaint::GetColor() const {
  return mColor;
}

bool SPPaint::IsAntiAlias() const {
  return mAntiAlias;
}

ISPCanvas::~ISPCanvas() = default;

}  // namespace Qelt

namespace QeltDesktop {

namespace {

// Red, green, blue and alpha, premultiplied, 0 to 1.
std::array<float, 4> premultiplied(unsigned int argb) {
  const auto channel = [argb](int shift) { return static_cast<float>((argb >> shift) & 0xFFu) / 255.0f; };
  const float alpha = channel(24);
  return {channel(16) * alpha, channel(8) * alpha, channel(0) * alpha, alpha};
}

// Lays a colour that covers a share of the pixel over it.
void blend(std::uint8_t* pixel, const std::array<float, 4>& color, float coverage) {
  const float kept = 1.0f - color[3] * coverage;
  for (std::size_t i = 0; i < 4; ++i) {
    pixel[i] = static_cast<std::uint8_t>(
        std::lround(color[i] * coverage * 255.0f + kept * static_cast<float>(pixel[i])));
  }
}

}  // namespace

BitmapCanvas::BitmapCanvas(GlBitmap& bitmap) : mBitmap(bitmap) {
  mBitmap.canvasPixels();
}

void BitmapCanvas::Clear(unsigned int argb) {
  std::vector<std::uint8_t>& pixels = mBitmap.canvasPixels();
  std::fill(pixels.begin(), pixels.end(), std::uint8_t{0});
  const std::array<float, 4> color = premultiplied(argb);
  for (std::size_t at = 0; at < pixels.size(); at += 4) blend(&pixels[at], color, 1.0f);
  mBitmap.showCanvasPixels();
}

void BitmapCanvas::DrawShape(float x, float y, float size, const Qelt::SPPaint& paint) {
  if (!std::isfinite(x) || !std::isfinite(y) || !std::isfinite(size) || size <= 0.0f) return;
  const auto width = static_cast<float>(mBitmap.GetWidth());
  const auto height = static_cast<float>(mBitmap.GetHeight());
  const float left = std::clamp(x, 0.0f, width), right = std::clamp(x + size, 0.0f, width);
  const float top = std::clamp(y, 0.0f, height), bottom = std::clamp(y + size, 0.0f, height);
  const std::array<float, 4> color = premultiplied(paint.GetColor());
  std::uint8_t* const pixels = mBitmap.canvasPixels().data();
  // The share of a pixel that lies between two edges; without anti-aliasing, whether at least half of it
  // does.
  const auto share = [&paint](float low, float high, int pixel) {
    const auto begin = static_cast<float>(pixel);
    const float part = std::min(high, begin + 1.0f) - std::max(low, begin);
    return paint.IsAntiAlias() ? part : part >= 0.5f ? 1.0f : 0.0f;
  };
  for (int row = static_cast<int>(top); row < static_cast<int>(std::ceil(bottom)); ++row) {
    const float ofRow = share(top, bottom, row);
    for (int column = static_cast<int>(left); column < static_cast<int>(std::ceil(right)); ++column) {
      const std::size_t at = static_cast<std::size_t>(row) * static_cast<std::size_t>(mBitmap.GetWidth()) +
                             static_cast<std::size_t>(column);
      blend(pixels + 4 * at, color, ofRow * share(left, right, column));
    }
  }
  mBitmap.showCanvasPixels();
}

}  // namespace QeltDesktop
