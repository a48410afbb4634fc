#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "text/Refusal.h"

struct spng_ctx;

namespace QeltDesktop {

// Reads a PNG picture row by row, whatever its own format. A damaged picture, or one larger than any that the
// program draws, is refused: every function throws Refusal, "name: what", or std::bad_alloc.
class PngReader {
 public:
  // The bytes must outlive the reader. Of text that the picture carries, at most `mostTextBytes` are
  // unpacked.
  PngReader(std::string name, std::string_view png, std::size_t mostTextBytes);

  int width() const { return mWidth; }
  int height() const { return mHeight; }

  // The next row from the top, RGBA8, its colour not premultiplied. It holds until the next call; there are
  // `height` of them.
  std::span<const std::uint8_t> nextRow();

  // Reads what is left, so that a picture that was cut is refused, even where its rows are complete.
  void finish();

  // The text with this keyword, from an iTXt chunk; none if there is no such chunk. Goes to the end of the
  // picture.
  std::optional<std::string> text(std::string_view keyword);

 private:
  void check(int error) const;
  Refusal refusal(const std::string& what) const;
  bool holdsDamaged(std::string_view keyword) const;

  const std::string mName;
  const std::string_view mPng;
  const std::size_t mMostTextBytes;
  const std::unique_ptr<spng_ctx, void (*)(spng_ctx*)> mDecoder;
  int mWidth = 0, mHeight = 0, mRow = 0;
  bool mIsInterlaced = false;
  std::vector<std::uint8_t> mPixels;  // a row; of an interlaced picture all of them
};

}  // namespace QeltDesktop
