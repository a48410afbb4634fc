#pragma once

#include <cstdint>
#include <exception>
#include <functional>
#include <memory>
#include <span>
#include <string>
#include <string_view>

#include "output/Picture.h"
#include "output/PictureSink.h"

struct spng_ctx;

namespace QeltDesktop {

// A text that a picture carries: a keyword of Latin letters, at most 79, and UTF-8.
struct PictureText {
  const char* keyword = "";
  std::string text;  // none if it is empty
};

// Encodes a picture as a PNG file while its rows come, so that there need be no copy of it: 8 bits of red,
// green, blue and alpha, with the text in an iTXt chunk before the pixels, compressed where that pays.
class PngWriter final : public PictureSink {
 public:
  // `write` takes the file's bytes in order. What it throws is thrown by the call that needed it.
  explicit PngWriter(std::function<void(std::string_view)> write, PictureText text = {});

  // Both throw Refusal when the picture cannot be encoded. With the last row the file is complete.
  void begin(int width, int height) override;
  void takeRows(std::span<const std::uint8_t> rows) override;

 private:
  static int take(spng_ctx* encoder, void* writer, void* bytes, std::size_t size);
  void check(int error);

  const std::function<void(std::string_view)> mWrite;
  PictureText mText;
  std::string mNone;
  std::exception_ptr mThrown;
  std::size_t mRowBytes = 0;
  const std::unique_ptr<spng_ctx, void (*)(spng_ctx*)> mEncoder;
};

// The bytes of a whole picture's file. Throws Refusal when it cannot be encoded.
std::string encodePng(const Picture& picture, PictureText text = {});

}  // namespace QeltDesktop
