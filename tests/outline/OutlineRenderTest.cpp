#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <fstream>
#include <iterator>
#include <string>
#include <utility>
#include <vector>

#include "support/DrawableBoard.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using testing::ElementsAre;

constexpr int kSide = 120;

// Kept: the colour is not queued with the stamps. Its alpha does not count.
TEST(OutlinePicture, AnOutlineThatStillWaitsTakesTheNewestColour) {
  OutlineBoard board({.version = 4, .size = 30.0f, .width = kSide, .height = kSide});
  board.drawable->SetOutlineSize(6.0f);
  for (const auto& [color, x] : {std::pair{0xFFFF0000u, 30.0f}, {0x400080FFu, 90.0f}}) {
    board.drawable->SetOutlineColor(static_cast<int>(color));
    board.outline({{x, 60.0f}});
  }
  int covered = 0;
  const std::vector<std::uint8_t> pixels = board.pixels();
  for (std::size_t i = 0; i < pixels.size(); i += 4) {
    if (pixels[i + 3] == 0) continue;
    ASSERT_EQ(pixels[i], 0) << "red";
    ASSERT_NEAR(pixels[i + 1], pixels[i + 3] * 128 / 255, 2);
    ASSERT_EQ(pixels[i + 2], pixels[i + 3]);
    covered += pixels[i + 3] == 255 ? 1 : 0;
  }
  EXPECT_GT(covered, 100);
}

// The rim runs round the whole stroke in the golden picture: here it has no width.
TEST(OutlinePicture, WithoutASizeTheInsideIsErasedToNothing) {
  OutlineBoard board({.version = 4, .size = 30.0f, .curve = false, .width = kSide, .height = kSide});
  const std::vector<Sample> stroke = {{30.3f, 60.0f}, {90.3f, 60.0f}};
  board.outline(stroke);  // brings the size up
  board.queue.finish();
  board.layer->clear();
  board.drawable->SetOutlineSize(0.0f);
  board.outline(stroke);
  const std::vector<std::uint8_t> erased = board.pixels();
  for (int i = 0; i < kSide * kSide; ++i) {
    const int column = i % kSide, row = i / kSide;
    // c * (1 - c) is left where the rim is half covered.
    const bool inside = row > 47 && row < 73 && column > 30 && column < 90;
    ASSERT_LE(erased[static_cast<std::size_t>(i) * 4 + 3], inside ? 0 : 70) << column << ", " << row;
  }
}

// Kept: of both streams it says 1. Of no stamps it says nothing.
TEST(Outline, NotesWhatItDoes) {
  LogCapture log;
  {
    OutlineBoard board({.version = 4, .size = 30.0f, .width = kSide, .height = kSide});
    board.outline({{60.0f, 60.0f}});
    board.outline({{NAN, 60.0f}});
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
                                 "Update(bool)", "RestoreGLObject()", "Release()"));
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
