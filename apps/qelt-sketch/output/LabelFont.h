#pragma once

#include <cstdint>
#include <string_view>

#include "output/Picture.h"

namespace QeltDesktop {

// A tiny bitmap font for labels: digits and capital letters; anything else is a space.

constexpr int kGlyphHeight = 7;
// Dots per character, the gap to the next one included.
constexpr int kGlyphAdvance = 6;

// Writes text with its top left corner at (x, y), each dot of the font `scale` pixels wide, in an opaque
// colour (0xRRGGBB). What lies outside the picture is left out.
void writeLabel(Picture& picture, int x, int y, int scale, std::uint32_t rgb, std::string_view text);

}  // namespace QeltDesktop
