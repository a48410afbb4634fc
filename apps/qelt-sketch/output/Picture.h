#pragma once

#include <cstdint>
#include <vector>

namespace QeltDesktop {

// The most pixels that a picture has on a side and in all; the latter take 256 MiB per layer.
constexpr int kLongestSide = 32'767;
constexpr int kMostPixels = 67'108'864;

// An RGBA8 picture, its colour not premultiplied: the first row at the top, rows without padding.
struct Picture {
  // Pixels missing at the end of `pixels` are zero.
  Picture(int pictureWidth, int pictureHeight, std::vector<std::uint8_t> pixels);

  std::uint8_t* pixelAt(int x, int y);

  int width, height;
  std::vector<std::uint8_t> rgba;
};

// A picture of one opaque colour, 0xRRGGBB.
Picture plainPicture(int width, int height, std::uint32_t rgb);

// Copies `part` to (x, y); what would lie outside the picture is left out.
void paste(Picture& picture, const Picture& part, int x, int y);

}  // namespace QeltDesktop
