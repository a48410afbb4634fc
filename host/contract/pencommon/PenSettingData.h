#pragma once

#include <cstdint>

namespace Qelt {

// A pen's settings, read live by its drawables. Size and colour lead the record; the rest of the order is
// chosen here. Main thread.
struct PenSettingData {
  float size = 0.0f;        // stroke units
  std::uint32_t color = 0;  // ARGB, alpha in the top byte
  int particleDensity = 0;
  float particleSize = 0.0f;
  int renderingLevel = 0;
  bool enhancedAntiAlias = false;
  std::int32_t screenWidth = 0;   // pixels
  std::int32_t screenHeight = 0;  // pixels
};

}  // namespace Qelt
