#include "desktop/graphics/Compose.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <stdexcept>

namespace QeltDesktop {

namespace {

std::uint8_t toByte(float share) {
  return static_cast<std::uint8_t>(std::lround(std::clamp(share, 0.0f, 1.0f) * 255.0f));
}

}  // namespace

std::vector<std::uint8_t> composeLayers(const std::vector<std::vector<std::uint8_t>>& layers,
                                        const std::optional<std::array<std::uint8_t, 3>>& background) {
  const std::size_t size = layers.empty() ? 0 : layers.front().size();
  for (const auto& layer : layers) {
    if (layer.size() != size || size % 4 != 0) throw std::invalid_argument("layers of different sizes");
  }
  std::vector<std::uint8_t> result(size);
  for (std::size_t at = 0; at < size; at += 4) {
    std::array<float, 4> below{};
    if (background) {
      for (std::size_t i = 0; i < 3; ++i) below[i] = static_cast<float>((*background)[i]) / 255.0f;
      below[3] = 1.0f;
    }
    for (const auto& layer : layers) {
      const float kept = 1.0f - static_cast<float>(layer[at + 3]) / 255.0f;
      for (std::size_t i = 0; i < 4; ++i) {
        below[i] = static_cast<float>(layer[at + i]) / 255.0f + kept * below[i];
      }
    }
    const float alpha = std::min(below[3], 1.0f);
    const float divisor = !background && alpha > 0.0f ? alpha : 1.0f;
    for (std::size_t i = 0; i < 3; ++i) result[at + i] = toByte(below[i] / divisor);
    result[at + 3] = toByte(alpha);
  }
  return result;
}

}  // namespace QeltDesktop
