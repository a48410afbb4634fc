#include "output/Picture.h"

#include <algorithm>
#include <cstddef>
#include <utility>

namespace QeltDesktop {

Picture::Picture(int pictureWidth, int pictureHeight, std::vector<std::uint8_t> pixels)
    : width(pictureWidth), height(pictureHeight), rgba(std::move(pixels)) {
  rgba.resize(static_cast<std::size_t>(width) * static_cast<std::size_t>(height) * 4);
}

std::uint8_t* Picture::pixelAt(int x, int y) {
  return rgba.data() +
         (static_cast<std::size_t>(y) * static_cast<std::size_t>(width) + static_cast<std::size_t>(x)) * 4;
}

Picture plainPicture(int width, int height, std::uint32_t rgb) {
  Picture picture(width, height, {});
  for (std::size_t i = 0; i < picture.rgba.size(); i += 4) {
    picture.rgba[i] = static_cast<std::uint8_t>(rgb >> 16);
    picture.rgba[i + 1] = static_cast<std::uint8_t>(rgb >> 8);
    picture.rgba[i + 2] = static_cast<std::uint8_t>(rgb);
    picture.rgba[i + 3] = 255;
  }
  return picture;
}

void paste(Picture& picture, const Picture& part, int x, int y) {
  const int left = std::max(x, 0), right = std::min(x + part.width, picture.width);
  const int top = std::max(y, 0), bottom = std::min(y + part.height, picture.height);
  if (left >= right) return;
  for (int row = top; row < bottom; ++row) {
    const std::size_t from = (static_cast<std::size_t>(row - y) * static_cast<std::size_t>(part.width) +
                              static_cast<std::size_t>(left - x)) *
                             4;
    std::copy_n(part.rgba.begin() + static_cast<std::ptrdiff_t>(from), (right - left) * 4,
                picture.pixelAt(left, row));
  }
}

}  // namespace QeltDesktop
