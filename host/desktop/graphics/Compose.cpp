#include "desktop/graphics/Compose.h"

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <stdexcept>

namespace QeltDesktop {

namespace {

using Layers = std::span<const std::span<const std::uint8_t>>;
using Background = std::optional<std::array<std::uint8_t, 3>>;
using Pixel = std::array<std::uint8_t, 4>;

// Rounded to the nearest, halves up. The sum is exact in double.
std::uint8_t toByte(float share) {
  const float level = std::clamp(share, 0.0f, 1.0f) * 255.0f;
  const double raised = static_cast<double>(level) + 0.5;  // NOLINT(bugprone-incorrect-roundings)
  return static_cast<std::uint8_t>(static_cast<int>(raised));
}

// Byte / 255, for each byte.
std::array<float, 256> sharesOfBytes() {
  std::array<float, 256> shares{};
  for (std::size_t i = 0; i < shares.size(); ++i) shares[i] = static_cast<float>(i) / 255.0f;
  return shares;
}

Pixel composePixel(Layers layers, const Background& background, std::size_t at) {
  static const std::array<float, 256> shares = sharesOfBytes();
  std::array<float, 4> below{};
  if (background) {
    for (std::size_t i = 0; i < 3; ++i) below[i] = shares[(*background)[i]];
    below[3] = 1.0f;
  }
  for (const std::span<const std::uint8_t> layer : layers) {
    const float kept = 1.0f - shares[layer[at + 3]];
    for (std::size_t i = 0; i < 4; ++i) below[i] = shares[layer[at + i]] + kept * below[i];
  }
  const float alpha = std::min(below[3], 1.0f);
  const float divisor = !background && alpha > 0.0f ? alpha : 1.0f;
  return {toByte(below[0] / divisor), toByte(below[1] / divisor), toByte(below[2] / divisor), toByte(alpha)};
}

// True when no layer has anything in the `size` bytes from `at` on.
bool areClear(Layers layers, std::size_t at, std::size_t size) {
  std::uint64_t any = 0;
  for (const std::span<const std::uint8_t> layer : layers) {
    for (std::size_t i = 0; i < size; i += sizeof any) {
      std::uint64_t word = 0;
      std::memcpy(&word, layer.data() + at + i, sizeof word);
      any |= word;
    }
  }
  return any == 0;
}

}  // namespace

void composeLayers(Layers layers, const Background& background, std::span<std::uint8_t> result) {
  for (const std::span<const std::uint8_t> layer : layers) {
    if (layer.size() != result.size()) throw std::invalid_argument("layers of different sizes");
  }
  if (result.size() % 4 != 0) throw std::invalid_argument("layers of broken pixels");
  // Most of a page is bare, and bare pixels are all the same.
  constexpr std::size_t kRun = 64;  // bytes
  const Pixel bare = composePixel({}, background, 0);
  std::array<std::uint8_t, kRun> bareRun{};
  for (std::size_t i = 0; i < kRun; ++i) bareRun[i] = bare[i % bare.size()];
  for (std::size_t at = 0; at < result.size(); at += kRun) {
    const std::size_t size = std::min(kRun, result.size() - at);
    if (size == kRun && areClear(layers, at, kRun)) {
      std::memcpy(result.data() + at, bareRun.data(), kRun);
      continue;
    }
    for (std::size_t i = at; i < at + size; i += 4) {
      const Pixel pixel = composePixel(layers, background, i);
      std::memcpy(result.data() + i, pixel.data(), pixel.size());
    }
  }
}

std::vector<std::uint8_t> composeLayers(const std::vector<std::vector<std::uint8_t>>& layers,
                                        const Background& background) {
  std::vector<std::span<const std::uint8_t>> spans(layers.begin(), layers.end());
  std::vector<std::uint8_t> result(layers.empty() ? 0 : layers.front().size());
  composeLayers(spans, background, result);
  return result;
}

}  // namespace QeltDesktop
