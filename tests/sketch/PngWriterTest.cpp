#include "output/PngWriter.h"

#include <gtest/gtest.h>
#include <spng.h>

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "output/Picture.h"

namespace QeltDesktop {
namespace {

constexpr int kWidth = 301, kHeight = 400;

// Bare above, grain in the middle, all strengths of transparency below.
Picture motley() {
  Picture picture = plainPicture(kWidth, kHeight, 0xFFFFFF);
  std::uint32_t grain = 1;
  for (std::size_t i = picture.rgba.size() / 3; i < picture.rgba.size(); ++i) {
    grain = grain * 1664525u + 1013904223u;
    picture.rgba[i] = static_cast<std::uint8_t>(grain >> 24);
  }
  return picture;
}

TEST(PngWriter, MakesTheSameFileOfAPictureInParts) {
  const Picture picture = motley();
  const PictureText text{.keyword = "Note", .text = std::string(9999, 'x') + "\u00fc"};
  std::string file;
  PngWriter writer([&](std::string_view bytes) { file += bytes; }, text);
  writer.begin(kWidth, kHeight);
  const std::span<const std::uint8_t> all(picture.rgba);
  constexpr std::size_t kRow = kWidth * 4;
  writer.takeRows(all.first(kRow));
  // Most of the file is written before the last row comes.
  writer.takeRows(all.subspan(kRow, (kHeight - 2) * kRow));
  EXPECT_GT(file.size(), 200'000u);
  writer.takeRows(all.last(kRow));
  EXPECT_EQ(file, encodePng(picture, text));

  const std::unique_ptr<spng_ctx, void (*)(spng_ctx*)> decoder(spng_ctx_new(0), &spng_ctx_free);
  spng_set_png_buffer(decoder.get(), file.data(), file.size());
  std::vector<std::uint8_t> decoded(picture.rgba.size());
  EXPECT_EQ(spng_decode_image(decoder.get(), decoded.data(), decoded.size(), SPNG_FMT_RGBA8, 0), 0);
  EXPECT_TRUE(decoded == picture.rgba);
  spng_text found{};
  std::uint32_t count = 1;
  ASSERT_EQ(spng_get_text(decoder.get(), &found, &count), 0);
  EXPECT_EQ(std::string(found.text, found.length), text.text);
  EXPECT_EQ(std::string(found.keyword) + std::to_string(found.type == SPNG_ITXT), "Note1");
}

// A disk may be full at any byte.
TEST(PngWriter, HandsBackWhatWritingThrows) {
  const Picture picture = motley();
  const std::size_t all = encodePng(picture).size();
  for (const std::size_t room : {std::size_t{0}, std::size_t{40}, all / 2, all - 1}) {
    std::size_t written = 0;
    PngWriter writer([&](std::string_view bytes) {
      if ((written += bytes.size()) > room) throw std::runtime_error("full");
    });
    const auto write = [&] {
      writer.begin(picture.width, picture.height);
      writer.takeRows(picture.rgba);
    };
    EXPECT_THROW(write(), std::runtime_error) << room;
  }
}

}  // namespace
}  // namespace QeltDesktop
