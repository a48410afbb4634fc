#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

#include "base/HostApi.h"

namespace QeltDesktop {

// Lays layers over each other and onto a background, pixel by pixel. Each layer holds 4 bytes per pixel, red
// first, premultiplied, the lowest layer first; all have the size of the result. With a background (red,
// green, blue) the result is opaque; without one it keeps its transparency, not premultiplied. 4 bytes per
// pixel again. The result may lie where one of the layers does. What becomes of a pixel depends on nothing
// beside it, so a page may be composed in parts. Sizes that differ throw std::invalid_argument. Any thread.
QELT_HOST_API void composeLayers(std::span<const std::span<const std::uint8_t>> layers,
                                 const std::optional<std::array<std::uint8_t, 3>>& background,
                                 std::span<std::uint8_t> result);

// The same into new memory.
QELT_HOST_API std::vector<std::uint8_t> composeLayers(
    const std::vector<std::vector<std::uint8_t>>& layers,
    const std::optional<std::array<std::uint8_t, 3>>& background);

}  // namespace QeltDesktop
