#include "output/Picture.h"

#include <algorithm>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <new>
#include <utility>

#include <spng.h>

#include "text/Refusal.h"

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

std::string encodePng(const Picture& picture, const PictureText& text) {
  const std::unique_ptr<spng_ctx, void (*)(spng_ctx*)> encoder(spng_ctx_new(SPNG_CTX_ENCODER),
                                                               &spng_ctx_free);
  if (!encoder) throw std::bad_alloc();
  const auto check = [](int error) {
    if (error != 0) throw Refusal(std::string("the picture cannot be encoded: ") + spng_strerror(error));
  };
  check(spng_set_option(encoder.get(), SPNG_ENCODE_TO_BUFFER, 1));
  spng_ihdr header{};
  header.width = static_cast<std::uint32_t>(picture.width);
  header.height = static_cast<std::uint32_t>(picture.height);
  header.bit_depth = 8;
  header.color_type = SPNG_COLOR_TYPE_TRUECOLOR_ALPHA;
  check(spng_set_ihdr(encoder.get(), &header));
  // The encoder reads it while it encodes.
  std::string carried = text.text, none;
  spng_text chunk{};
  if (!carried.empty()) {
    constexpr std::size_t kWorthCompressing = 4096;
    std::snprintf(chunk.keyword, sizeof chunk.keyword, "%s", text.keyword);
    chunk.type = SPNG_ITXT;
    chunk.text = carried.data();
    chunk.length = carried.size();
    chunk.compression_flag = carried.size() > kWorthCompressing ? 1 : 0;
    chunk.language_tag = none.data();
    chunk.translated_keyword = none.data();
    check(spng_set_text(encoder.get(), &chunk, 1));
  }
  check(spng_encode_image(encoder.get(), picture.rgba.data(), picture.rgba.size(), SPNG_FMT_PNG,
                          SPNG_ENCODE_FINALIZE));
  std::size_t size = 0;
  int error = 0;
  const std::unique_ptr<void, void (*)(void*)> bytes(spng_get_png_buffer(encoder.get(), &size, &error),
                                                     &std::free);
  check(error);
  return std::string(static_cast<const char*>(bytes.get()), size);
}

}  // namespace QeltDesktop
