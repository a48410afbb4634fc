#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace QeltDesktop {

// An RGBA8 picture of straight colour, first row at the top, rows tightly packed.
struct Picture {
  // Pixels that are not given are zero.
  Picture(int pictureWidth, int pictureHeight, std::vector<std::uint8_t> pixels);

  std::uint8_t* pixelAt(int x, int y);

  int width, height;
  std::vector<std::uint8_t> rgba;
};

// One opaque colour, 0xRRGGBB.
Picture plainPicture(int width, int height, std::uint32_t rgb);

// Copies `part` to (x, y); what lies outside is left out.
void paste(Picture& picture, const Picture& part, int x, int y);

// As a PNG file's bytes.
std::string encodePng(const Picture& picture);

}  // namespace QeltDesktop
