#include "output/PngReader.h"

#include <new>
#include <utility>

#include <spng.h>

#include "output/Picture.h"
#include "text/Refusal.h"

namespace QeltDesktop {

PngReader::PngReader(std::string name, std::string_view png, std::size_t mostTextBytes)
    : mName(std::move(name)),
      mPng(png),
      mMostTextBytes(mostTextBytes),
      mDecoder(spng_ctx_new(0), &spng_ctx_free) {
  if (!mDecoder) throw std::bad_alloc();
  check(spng_set_image_limits(mDecoder.get(), kLongestSide, kLongestSide));
  check(spng_set_crc_action(mDecoder.get(), SPNG_CRC_ERROR, SPNG_CRC_ERROR));
  // So that a small file cannot fill the memory. Of text that is unpacked, the room that is kept for it
  // counts, which is doubled whenever it is full.
  const std::size_t mostKept = 2 * mostTextBytes + mostTextBytes / 2;
  check(spng_set_chunk_limits(mDecoder.get(), mostKept, mostKept));
  check(spng_set_png_buffer(mDecoder.get(), png.data(), png.size()));
  spng_ihdr header{};
  check(spng_get_ihdr(mDecoder.get(), &header));
  if (std::uint64_t{header.width} * header.height > kMostPixels) throw refusal("the picture is too large");
  mWidth = static_cast<int>(header.width);
  mHeight = static_cast<int>(header.height);
  mIsInterlaced = header.interlace_method != SPNG_INTERLACE_NONE;
}

std::span<const std::uint8_t> PngReader::nextRow() {
  const std::size_t rowBytes = std::size_t{4} * static_cast<std::size_t>(mWidth);
  if (mRow == 0) {
    mPixels.resize(mIsInterlaced ? rowBytes * static_cast<std::size_t>(mHeight) : rowBytes);
    // The rows of an interlaced picture are complete only when all of it is read.
    check(mIsInterlaced ? spng_decode_image(mDecoder.get(), mPixels.data(), mPixels.size(), SPNG_FMT_RGBA8,
                                            SPNG_DECODE_TRNS)
                        : spng_decode_image(mDecoder.get(), nullptr, 0, SPNG_FMT_RGBA8,
                                            SPNG_DECODE_TRNS | SPNG_DECODE_PROGRESSIVE));
  }
  const int row = mRow++;
  if (mIsInterlaced) return std::span(mPixels).subspan(rowBytes * static_cast<std::size_t>(row), rowBytes);
  if (const int error = spng_decode_row(mDecoder.get(), mPixels.data(), rowBytes); error != SPNG_EOI)
    check(error);
  return mPixels;
}

void PngReader::finish() {
  while (mRow < mHeight) nextRow();
  check(spng_decode_chunks(mDecoder.get()));
}

std::optional<std::string> PngReader::text(std::string_view keyword) {
  finish();  // text may stand behind the rows
  std::uint32_t count = 0;
  std::vector<spng_text> texts;
  int error = spng_get_text(mDecoder.get(), nullptr, &count);
  if (error == 0) {
    texts.resize(count);
    error = spng_get_text(mDecoder.get(), texts.data(), &count);
  }
  if (error != SPNG_ECHUNKAVAIL) check(error);
  const spng_text* found = nullptr;
  for (const spng_text& text : texts) {
    if (std::string_view(text.keyword) != keyword) continue;
    if (found != nullptr) throw refusal("the picture carries ink twice");
    found = &text;
  }
  if (found == nullptr) {
    if (holdsDamaged(keyword)) throw refusal("the picture's ink is damaged");
    return std::nullopt;
  }
  if (found->type != SPNG_ITXT) throw refusal("the picture's ink is not in an iTXt chunk");
  if (found->length > mMostTextBytes) throw refusal("the picture's ink is too large");
  return std::string(found->text, found->length);
}

void PngReader::check(int error) const {
  if (error == SPNG_EMEM) throw std::bad_alloc();
  if (error != 0) throw refusal(std::string("not a sound PNG picture: ") + spng_strerror(error));
}

Refusal PngReader::refusal(const std::string& what) const {
  return Refusal(mName + ": " + what);
}

// The decoder passes over text that it cannot read.
bool PngReader::holdsDamaged(std::string_view keyword) const {
  return mPng.find("iTXt" + std::string(keyword) + '\0') != std::string_view::npos;
}

}  // namespace QeltDesktop
