#include "output/PngWriter.h"

#include <cstddef>
#include <cstdio>
#include <new>
#include <utility>

#include <spng.h>

#include "text/Refusal.h"

namespace QeltDesktop {

PngWriter::PngWriter(std::function<void(std::string_view)> write, PictureText text)
    : mWrite(std::move(write)),
      mText(std::move(text)),
      mEncoder(spng_ctx_new(SPNG_CTX_ENCODER), &spng_ctx_free) {
  if (!mEncoder) throw std::bad_alloc();
}

void PngWriter::begin(int width, int height) {
  spng_ctx* const encoder = mEncoder.get();
  mRowBytes = static_cast<std::size_t>(width) * 4;
  check(spng_set_png_stream(encoder, &PngWriter::take, this));
  // A page is bare stretches and grain. No filter makes either smaller at usual zooms, and looking for the
  // best one takes longer than all the rest; higher levels of compression gain a hundredth.
  constexpr int kCompressionLevel = 4;
  check(spng_set_option(encoder, SPNG_FILTER_CHOICE, SPNG_DISABLE_FILTERING));
  check(spng_set_option(encoder, SPNG_IMG_COMPRESSION_LEVEL, kCompressionLevel));
  spng_ihdr header{};
  header.width = static_cast<std::uint32_t>(width);
  header.height = static_cast<std::uint32_t>(height);
  header.bit_depth = 8;
  header.color_type = SPNG_COLOR_TYPE_TRUECOLOR_ALPHA;
  check(spng_set_ihdr(encoder, &header));
  if (!mText.text.empty()) {
    constexpr std::size_t kWorthCompressing = 4096;
    spng_text chunk{};
    std::snprintf(chunk.keyword, sizeof chunk.keyword, "%s", mText.keyword);
    chunk.type = SPNG_ITXT;
    // The encoder reads them while it encodes.
    chunk.text = mText.text.data();
    chunk.length = mText.text.size();
    chunk.compression_flag = mText.text.size() > kWorthCompressing ? 1 : 0;
    chunk.language_tag = mNone.data();
    chunk.translated_keyword = mNone.data();
    check(spng_set_text(encoder, &chunk, 1));
  }
  check(spng_encode_image(encoder, nullptr, 0, SPNG_FMT_PNG, SPNG_ENCODE_PROGRESSIVE | SPNG_ENCODE_FINALIZE));
}

void PngWriter::takeRows(std::span<const std::uint8_t> rows) {
  for (; !rows.empty(); rows = rows.subspan(mRowBytes)) {
    const int error = spng_encode_row(mEncoder.get(), rows.data(), mRowBytes);
    if (error != SPNG_EOI) check(error);  // which the last row answers
  }
}

// Nothing may be thrown through the encoder.
int PngWriter::take(spng_ctx*, void* writer, void* bytes, std::size_t size) {
  auto& self = *static_cast<PngWriter*>(writer);
  try {
    self.mWrite({static_cast<const char*>(bytes), size});
    return 0;
  } catch (...) {
    self.mThrown = std::current_exception();
    return SPNG_IO_ERROR;
  }
}

void PngWriter::check(int error) {
  if (mThrown) std::rethrow_exception(std::exchange(mThrown, nullptr));
  if (error != 0) throw Refusal(std::string("the picture cannot be encoded: ") + spng_strerror(error));
}

std::string encodePng(const Picture& picture, PictureText text) {
  std::string bytes;
  PngWriter writer([&bytes](std::string_view part) { bytes += part; }, std::move(text));
  writer.begin(picture.width, picture.height);
  writer.takeRows(picture.rgba);
  return bytes;
}

}  // namespace QeltDesktop
