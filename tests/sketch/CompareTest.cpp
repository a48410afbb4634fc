#include "commands/Compare.h"

#include <gtest/gtest.h>
#include <spng.h>
#include <unistd.h>

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "output/Picture.h"
#include "output/PngReader.h"
#include "output/PngWriter.h"
#include "support/TestFolder.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

namespace fs = std::filesystem;
using Bytes = std::vector<std::uint8_t>;

class CompareTest : public QeltTests::InFolder {
 protected:
  // Two pixels beside each other, each RGBA.
  void writePair(const std::string& name, const Bytes& rgba) const {
    write(name, encodePng(Picture(2, 1, rgba), {.keyword = "InkML", .text = name}));
  }
  Bytes pixelsOf(const std::string& name) const {
    std::ifstream file(path(name), std::ios::binary);
    const std::string png(std::istreambuf_iterator<char>(file), {});
    PngReader reader(name, png, 1000);
    Bytes pixels;
    for (int y = 0; y < reader.height(); ++y) {
      const auto row = reader.nextRow();
      pixels.insert(pixels.end(), row.begin(), row.end());
    }
    return pixels;
  }

  // What it says on standard output, without the folder, and its status or refusal.
  std::string said(const std::string& before, const std::string& after, int tolerance = 0,
                   const std::string& output = {}) const {
    CompareOptions options{path(before), path(after), tolerance, std::nullopt};
    if (!output.empty()) options.output = path(output);
    testing::internal::CaptureStdout();
    testing::internal::CaptureStderr();
    std::string end;
    try {
      end = "= " + std::to_string(compare(options));
    } catch (const Refusal& refusal) {
      end = refusal.what();
    }
    std::string all = testing::internal::GetCapturedStdout() + testing::internal::GetCapturedStderr() + end;
    const std::string prefix = folder().string() + '/';
    for (std::size_t at; (at = all.find(prefix)) != std::string::npos;) all.erase(at, prefix.size());
    return all;
  }
};

// What can be told apart counts: opacity, and colours as they are seen through it, rounded up.
TEST_F(CompareTest, MeasuresWhatCanBeSeen) {
  writePair("a.png", {10, 20, 30, 255, 200, 0, 0, 1});
  writePair("same.png", {10, 20, 30, 255, 200, 0, 0, 1});
  writePair("darker.png", {10, 17, 31, 255, 200, 0, 0, 1});
  writePair("faint.png", {10, 20, 30, 255, 201, 0, 0, 1});
  writePair("clear.png", {10, 20, 30, 255, 200, 0, 0, 0});
  writePair("gone.png", {90, 20, 30, 0, 200, 0, 0, 1});
  writePair("gone-otherwise.png", {0, 0, 0, 0, 200, 0, 0, 1});
  write("wide.png", encodePng(plainPicture(3, 1, 0)));
  EXPECT_EQ(said("a.png", "same.png"), "same.png: alike\n= 0");
  EXPECT_EQ(said("a.png", "darker.png"), "darker.png: 1 of 2 pixels differs, by 3 of 255 at most\n= 1");
  EXPECT_EQ(said("a.png", "darker.png", 2).back(), '1');
  EXPECT_EQ(said("a.png", "darker.png", 3).back(), '0');
  EXPECT_EQ(said("a.png", "faint.png"), "faint.png: 1 of 2 pixels differs, by 1 of 255 at most\n= 1");
  EXPECT_EQ(said("a.png", "clear.png"), "clear.png: 1 of 2 pixels differs, by 1 of 255 at most\n= 1");
  EXPECT_EQ(said("a.png", "gone.png"), "gone.png: 1 of 2 pixels differs, by 255 of 255 at most\n= 1");
  EXPECT_EQ(said("gone.png", "gone-otherwise.png"), "gone-otherwise.png: alike\n= 0");
  EXPECT_EQ(said("a.png", "wide.png", 255), "wide.png: 2x1 pixels before, 3x1 after\n= 1");
}

TEST_F(CompareTest, ShowsWhereAPictureDiffers) {
  writePair("a.png", {0, 0, 0, 255, 60, 60, 60, 255});
  writePair("b.png", {0, 0, 0, 255, 60, 65, 60, 255});
  const Bytes within{255, 176, 0, 255}, beyond{224, 0, 32, 255};
  for (const auto& [tolerance, shown] : {std::pair(4, beyond), {5, within}}) {
    said("a.png", "b.png", tolerance, "marked.png");
    Bytes wanted{192, 192, 192, 255};  // a quarter of black's distance from white
    wanted.insert(wanted.end(), shown.begin(), shown.end());
    EXPECT_EQ(pixelsOf("marked.png"), wanted) << tolerance;
  }
  // Pictures of two sizes, in the frame of both: what only one has is beyond any tolerance.
  write("high.png", encodePng(Picture(1, 2, {0, 0, 0, 255, 0, 0, 0, 255})));
  for (const auto& [one, other] : {std::pair("a.png", "high.png"), {"high.png", "a.png"}}) {
    EXPECT_NE(said(one, other, 255, "marked.png").find(" pixels before, "), std::string::npos);
    Bytes wanted{192, 192, 192, 255};
    for (int i = 0; i < 2; ++i) wanted.insert(wanted.end(), beyond.begin(), beyond.end());
    wanted.resize(16);
    EXPECT_EQ(pixelsOf("marked.png"), wanted);
  }
  write("long.png", encodePng(Picture(32767, 1, {})));
  write("tall.png", encodePng(Picture(1, 32767, {})));
  EXPECT_EQ(said("long.png", "tall.png", 0, "marked.png"),
            "marked.png: cannot be written: too large, 32767 x 32767 pixels");
  EXPECT_EQ(said("a.png", "b.png", 0, "b.png"), "b.png: cannot be written: it is a picture to compare");
  EXPECT_EQ(said("a.png", "b.png", 0, "no/c.png"), "no/c.png: cannot be written: No such file or directory");
  EXPECT_FALSE(fs::exists(path("no")));
}

TEST_F(CompareTest, GoesThroughFolders) {
  const Bytes dark(8, 80), light{80, 80, 80, 80, 80, 80, 82, 80};
  for (const char* const name : {"before/a.png", "after/a.png", "before/deep/b.png", "before/c.png",
                                 "after/c.png", "before/d.png", "after/e.png"})
    writePair(name, dark);
  writePair("after/deep/b.png", light);
  write("after/c.png", "no picture");
  write("before/f.png", encodePng(plainPicture(3, 1, 0)));
  writePair("after/f.png", dark);
  write("after/notes.txt", "no picture either");
  EXPECT_EQ(
      said("before", "after", 0, "marked"),
      "d.png: only in before\ndeep/b.png: 1 of 2 pixels differs, by 1 of 255 at most\ne.png: only in after\n"
      "f.png: 3x1 pixels before, 2x1 after\n"
      "6 pictures: 1 alike, 0 within the tolerance, 2 different, 2 in one folder only, 1 not compared\n"
      "after/c.png: not a sound PNG picture: end of stream\n= 1");
  EXPECT_TRUE(fs::exists(path("marked/deep/b.png")));
  EXPECT_TRUE(fs::exists(path("marked/f.png")));
  EXPECT_FALSE(fs::exists(path("marked/a.png")));
  for (const char* const name :
       {"before/c.png", "before/d.png", "after/c.png", "after/e.png", "before/f.png", "after/f.png"})
    fs::remove(path(name));
  EXPECT_EQ(
      said("before", "after", 1),
      "deep/b.png: 1 of 2 pixels differs, by 1 of 255 at most\n"
      "2 pictures: 1 alike, 1 within the tolerance, 0 different, 0 in one folder only, 0 not compared\n= 0");
  for (const char* const folder : {"before/deep", "after/deep"}) fs::remove_all(path(folder));
  EXPECT_EQ(
      said("before", "after"),
      "1 picture: 1 alike, 0 within the tolerance, 0 different, 0 in one folder only, 0 not compared\n= 0");
  fs::create_directory(path("empty"));
  EXPECT_EQ(said("empty", "empty"), "empty, empty: no picture (*.png) in either");
  for (const char* const other : {"before/a.png", "nowhere"})
    EXPECT_EQ(said("before", other), "before, " + std::string(other) +
                                         ": a folder compares with a folder, a picture with a picture");
  EXPECT_EQ(said("nowhere", "before/a.png"), "nowhere: cannot be read: No such file or directory");
}

// Every byte counts, even those behind the last row, but the checksum of the end mark, which holds nothing.
TEST_F(CompareTest, RefusesPicturesThatWereCut) {
  write("whole.png", encodePng(plainPicture(2, 2, 0)));
  write("wider.png", encodePng(plainPicture(3, 2, 0)));
  std::string png = encodePng(plainPicture(2, 2, 0));
  png.resize(png.size() - 4);
  write("marked.png", "older");
  while (!png.empty()) {
    png.pop_back();
    write("cut.png", png);
    for (const char* const other : {"whole.png", "wider.png"}) {
      EXPECT_EQ(said(other, "cut.png", 255, "marked.png").find("cut.png: not a sound PNG picture: "), 0u);
      EXPECT_EQ(said("cut.png", other).find("cut.png: not a sound PNG picture: "), 0u);
    }
  }
  EXPECT_EQ(fs::file_size(path("marked.png")), 5u);
}

// Pictures of other programs: a palette with one clear colour, 16 bits a channel, interlaced.
TEST_F(CompareTest, ReadsEveryFormOfPng) {
  const auto encoded = [](std::uint8_t type, std::uint8_t depth, bool isInterlaced, const Bytes& samples) {
    spng_ctx* const encoder = spng_ctx_new(SPNG_CTX_ENCODER);
    spng_set_option(encoder, SPNG_ENCODE_TO_BUFFER, 1);
    spng_ihdr header{.width = 2,
                     .height = 2,
                     .bit_depth = depth,
                     .color_type = type,
                     .compression_method = 0,
                     .filter_method = 0,
                     .interlace_method = static_cast<std::uint8_t>(isInterlaced ? 1 : 0)};
    spng_set_ihdr(encoder, &header);
    spng_plte palette{.n_entries = 2, .entries = {{1, 2, 3, 255}, {4, 5, 6, 255}}};
    spng_trns clear{};
    clear.n_type3_entries = 1;
    if (type == SPNG_COLOR_TYPE_INDEXED) {
      spng_set_plte(encoder, &palette);
      spng_set_trns(encoder, &clear);
    }
    EXPECT_EQ(spng_encode_image(encoder, samples.data(), samples.size(), SPNG_FMT_PNG, SPNG_ENCODE_FINALIZE),
              0);
    std::size_t size = 0;
    int error = 0;
    void* const png = spng_get_png_buffer(encoder, &size, &error);
    const std::string bytes(static_cast<const char*>(png), size);
    std::free(png);
    spng_ctx_free(encoder);
    return bytes;
  };
  write("palette.png", encoded(SPNG_COLOR_TYPE_INDEXED, 8, false, {0, 1, 1, 0}));
  EXPECT_EQ(pixelsOf("palette.png"), (Bytes{1, 2, 3, 0, 4, 5, 6, 255, 4, 5, 6, 255, 1, 2, 3, 0}));
  write("deep.png", encoded(SPNG_COLOR_TYPE_GRAYSCALE, 16, false, {1, 10, 2, 20, 3, 30, 4, 40}));
  const Bytes grey{10, 10, 10, 255, 20, 20, 20, 255, 30, 30, 30, 255, 40, 40, 40, 255};
  EXPECT_EQ(pixelsOf("deep.png"), grey);
  // They are compared with 8 bits.
  write("as-deep.png", encoded(SPNG_COLOR_TYPE_GRAYSCALE, 16, false, {9, 10, 2, 20, 3, 30, 4, 40}));
  EXPECT_EQ(said("deep.png", "as-deep.png"), "as-deep.png: alike\n= 0");
  write("interlaced.png", encoded(SPNG_COLOR_TYPE_GRAYSCALE, 8, true, {10, 20, 30, 40}));
  EXPECT_EQ(pixelsOf("interlaced.png"), grey);
}

}  // namespace
}  // namespace QeltDesktop
