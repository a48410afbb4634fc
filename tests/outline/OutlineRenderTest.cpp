#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "support/DrawableBoard.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using testing::ElementsAre;

constexpr int kSide = 120;

std::vector<std::uint8_t> outlinePicture(float outlineSize, const std::vector<Sample>& samples,
                                         float zoom = 1.0f) {
  OutlineBoard board(
      {.version = 4, .size = 30.0f, .curve = false, .width = kSide, .height = kSide, .tile = 64});
  board.outline({{0.0f, 0.0f}, {60.0f, 0.0f}});  // brings the size up to 30
  board.queue.finish();
  board.layer->clear();
  board.canvas.setMatrix(viewOf(zoom));
  board.drawable->SetOutlineSize(outlineSize);
  board.drawable->SetOutlineColor(static_cast<int>(0x40FF8000u));
  board.outline(samples);
  return board.pixels();
}

// How covered a pixel is: 0 to 255, taking colour and alpha together.
int alphaAt(const std::vector<std::uint8_t>& pixels, int column, int row) {
  return pixels[static_cast<std::size_t>(row * kSide + column) * 4 + 3];
}

TEST(OutlinePicture, OnlyARimIsLeftInTheOutlinesColour) {
  for (const float zoom : {1.0f, 0.5f}) {
    const float middle = 60.0f / zoom;
    const auto pixels = outlinePicture(6.0f / zoom, {{middle, middle}}, zoom);
    // A stamp of 31 across, in units, around the middle.
    const float inner = 15.5f * zoom;
    const float outer = inner + 6.0f;
    for (int i = 0; i < kSide * kSide; ++i) {
      const std::uint8_t* const pixel = &pixels[static_cast<std::size_t>(i) * 4];
      const float distance =
          std::hypot(static_cast<float>(i % kSide) - 59.5f, static_cast<float>(i / kSide) - 59.5f);
      if (distance < inner - 2.0f || distance > outer + 2.0f) {
        ASSERT_EQ(pixel[3], 0) << i % kSide << ", " << i / kSide;
      }
      if (distance > inner + 2.0f && distance < outer - 2.0f) {
        ASSERT_THAT(std::vector<int>(pixel, pixel + 4), ElementsAre(255, 128, 0, 255))
            << i % kSide << ", " << i / kSide;
      }
    }
  }
}

// Kept: the colour is not queued with the stamps.
TEST(OutlinePicture, AnOutlineThatStillWaitsTakesTheNewestColour) {
  OutlineBoard board({.version = 4, .size = 30.0f, .width = kSide, .height = kSide});
  for (const unsigned int color : {0xFFFF0000u, 0xFF0000FFu}) {
    board.drawable->SetOutlineSize(6.0f);
    board.drawable->SetOutlineColor(static_cast<int>(color));
    board.outline({{color == 0xFFFF0000u ? 30.0f : 90.0f, 60.0f}});
  }
  int inked = 0;
  const std::vector<std::uint8_t> pixels = board.pixels();
  for (std::size_t i = 0; i < pixels.size(); i += 4) {
    ASSERT_EQ(pixels[i], 0) << "red";
    inked += pixels[i + 2] > 0 ? 1 : 0;
  }
  EXPECT_GT(inked, 200);
}

// Stamps that cover each other are erased together: the rim runs round the whole stroke.
TEST(OutlinePicture, WithoutASizeTheInsideIsErasedToNothing) {
  const std::vector<Sample> stroke = {{30.3f, 60.0f}, {90.3f, 60.0f}};
  const auto rimmed = outlinePicture(6.0f, stroke);
  EXPECT_EQ(alphaAt(rimmed, 60, 60), 0);
  EXPECT_EQ(alphaAt(rimmed, 60, 41), 255);
  EXPECT_EQ(alphaAt(rimmed, 60, 79), 255);
  const auto erased = outlinePicture(0.0f, stroke);
  for (int row = 0; row < kSide; ++row) {
    for (int column = 0; column < kSide; ++column) {
      // c * (1 - c) is left where the rim is half covered.
      const bool inside = row > 47 && row < 73 && column > 30 && column < 90;
      ASSERT_LE(alphaAt(erased, column, row), inside ? 0 : 70) << column << ", " << row;
    }
  }
}

// Kept: of both streams it says 1.
TEST(Outline, NotesWhatItDoes) {
  LogCapture log;
  {
    OutlineBoard board({.version = 4, .size = 30.0f, .width = kSide, .height = kSide});
    board.outline({{60.0f, 60.0f}});
    board.queue.finish();
    board.queue.loseContext();
    board.queue.restoreContext();
  }
  std::vector<std::string> lines;
  const std::string name = "virtual void Qelt::Pencil2OutlineDrawableRTV1::";
  for (const LogLine& line : log.take()) {
    if (line.text.rfind(name, 0) != 0) continue;
    EXPECT_EQ(line.priority, 3);
    lines.push_back(line.text.substr(name.size()));
  }
  EXPECT_THAT(lines, ElementsAre("Update(bool)", "Update(bool) 1 size 42", "Update(bool) 1 size 42",
                                 "RestoreGLObject()", "Release()"));
}

// Kept: tools that show bitmaps by name find the outline's texture under another drawable's.
TEST(Outline, TheTexturesDebugNameNamesAnotherDrawable) {
  std::ifstream file(QELT_PLUGIN_PATH, std::ios::binary);
  const std::string library{std::istreambuf_iterator<char>(file), {}};
  EXPECT_NE(library.find("Marker4OutlineDrawableRTV1::CreatePenCanvas mPointTextureBitmap"),
            std::string::npos);
}

}  // namespace
}  // namespace QeltTests
