#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace QeltDesktop {

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

// A text that a picture carries: a keyword of Latin letters, at most 79, and UTF-8.
struct PictureText {
  const char* keyword = "";
  std::string text;  // none if it is empty
};

// The bytes of the picture as a PNG file, with the text in an iTXt chunk before the pixels, compressed where
// that pays. Throws Refusal when it cannot be encoded.
std::string encodePng(const Picture& picture, const PictureText& text = {});

}  // namespace QeltDesktop
