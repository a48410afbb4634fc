#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "render/PatternTextures.h"
#include "support/Stamps.h"

namespace QeltTests {

// One stamp on an empty layer, worked out pixel by pixel from what the shaders are to do.
struct StampPicture {
  Stamp stamp;                             // stroke units
  float zoomX = 1.0f, zoomY = 1.0f;        // of the view
  float startX = 0.0f, startY = 0.0f;      // where the grain is fixed, pixels
  float grainX = 150.0f, grainY = 150.0f;  // what the grain's x and y are divided by, pixels
  bool grainMask = false;                  // masked by squares of paper grain, not by the stamp shapes
  bool ramp = false;                       // rim by the ramp of the vertices, else not looked at

  // The fragment's alpha, 0 where there is none.
  float alphaAt(int column, int row) const {
    const float x = static_cast<float>(column) + 0.5f;
    const float y = static_cast<float>(row) + 0.5f;
    const float u = (x / zoomX - (stamp.x - stamp.halfWidth)) / (2.0f * stamp.halfWidth);
    const float down = (y / zoomY - (stamp.y - stamp.halfHeight)) / (2.0f * stamp.halfHeight);
    if (u < 0.0f || u >= 1.0f || down < 0.0f || down >= 1.0f) return 0.0f;
    const int maskColumn = static_cast<int>(u * 100.0f);
    const int maskRow = static_cast<int>(down * 100.0f);
    const unsigned char mask = grainMask ? Qelt::g_backgroundPtn[maskRow * 100 + maskColumn]
                                         : Qelt::g_pointPtn[stamp.tile * 10000 + maskRow * 100 + maskColumn];
    if (mask == 0) return 0.0f;
    const auto texel = [](float coordinate) {
      return std::min(149, static_cast<int>((coordinate - std::floor(coordinate)) * 150.0f));
    };
    const int grainRow = texel((y - startY) / grainY);
    const int grainColumn = texel((x - startX) / grainX);
    const float grain = static_cast<float>(Qelt::g_backgroundPtn[grainRow * 150 + grainColumn]) / 255.0f;
    const float dx = u - 0.5f;
    const float dy = down - 0.5f;
    const float along = dx * stamp.directionX + dy * stamp.directionY;
    const float across = std::sqrt(std::max(dx * dx + dy * dy - along * along, 0.0f));
    const float half = 1.0f / (9.0f * stamp.narrowing + 1.0f);
    if (across > half) return 0.0f;
    const float shade = (1.0f - (along + 0.5f)) * ((half - across) / half);
    float alpha = std::clamp(grain * stamp.alpha * shade, 0.0f, 1.0f);
    if (ramp) {
      const float dist = std::sqrt(dx * dx + dy * dy);
      float smooth = stamp.alphaByWidth;
      if (dist > stamp.innerRadius) smooth *= 1.0f - (dist - stamp.innerRadius) / (0.5f - stamp.innerRadius);
      alpha *= smooth;
    }
    return std::clamp(alpha, 0.0f, 1.0f);
  }

  // The share of the pixels within `radius` (0 to 0.5, texture units) whose alpha is more than 3 of 255 off:
  // near 0 when the picture is this stamp, for renderers may cut texels a hair's breadth apart.
  double shareOff(const std::vector<std::uint8_t>& pixels, int width, int height, float radius) const {
    int seen = 0;
    int off = 0;
    for (int row = 0; row < height; ++row) {
      for (int column = 0; column < width; ++column) {
        const float dx = ((static_cast<float>(column) + 0.5f) / zoomX - stamp.x) / (2.0f * stamp.halfWidth);
        const float dy = ((static_cast<float>(row) + 0.5f) / zoomY - stamp.y) / (2.0f * stamp.halfHeight);
        if (dx * dx + dy * dy > radius * radius) continue;
        ++seen;
        const float drawn = pixels[static_cast<std::size_t>(row * width + column) * 4 + 3];
        if (std::fabs(drawn - alphaAt(column, row) * 255.0f) > 3.0f) ++off;
      }
    }
    return seen == 0 ? 1.0 : static_cast<double>(off) / seen;
  }
};

}  // namespace QeltTests
