#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <fstream>
#include <iterator>
#include <memory>
#include <string>
#include <vector>

#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/pencommon/PenDataManager.h"
#include "graphics/ISPBitmap.h"
#include "math/Matrix4.h"
#include "outline/Pencil2OutlineDrawableRTV1.h"
#include "support/DrawableBoard.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

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

TEST(OutlinePicture, ATiltedPenLeavesASlabThatIsErasedThinner) {
  // Factor 0.5: half a quarter of the stamp's width to each side in colour, 1 / 6.5 erased.
  const Sample tilted{60.3f, 60.0f, 0.5f, 0.79f, 0.0f};
  const auto pixels = outlinePicture(0.0f, {tilted});
  // Along the y axis, the stamp is (30 * 1.75 + 1) across: 1 / 4 of it to each side is coloured, 2 / 13
  // erased.
  EXPECT_EQ(alphaAt(pixels, 60 + 10, 60), 255);
  EXPECT_EQ(alphaAt(pixels, 60 + 4, 60), 0);
  EXPECT_EQ(alphaAt(pixels, 60 + 18, 60), 0);
  EXPECT_EQ(alphaAt(pixels, 60, 60 + 20), 0);
}

// The drawable alone, on a queue of its own.
class OutlineRenderer : public testing::Test {
 protected:
  OutlineRenderer() {
    const Qelt::Vector2<float> stamp[2] = {{60.0f, 60.0f}, {0.0f, 1.0f}};
    drawable->SetOutlineSize(5.0f);
    drawable->SetOutlineColor(0xFF00FF00u);
    drawable->SetBuffer(&inner, &outer);
    drawable->AddPoint(stamp, 40.0f, 0.0f);
    drawable->SetBuffer(nullptr, nullptr);
    drawable->AddPoint(stamp, 40.0f, 0.0f);  // goes nowhere
  }
  ~OutlineRenderer() override {
    queue.run([this] { drawable.reset(); });
  }

  void draw() {
    queue.run([this] {
      Qelt::Matrix4<float> identity;
      drawable->Draw(layer.GetBitmap()->GetSubBitmap(0), identity);
    });
  }
  int rim() { return alphaAt(layer.readPixels(), 60 + 22, 60); }

  std::vector<float> inner, outer;
  QeltDesktop::RenderQueue queue{QeltDesktop::RenderQueue::Mode::Caller,
                                 QeltDesktop::RenderQueue::GL::Context};
  QeltDesktop::CanvasLayer layer{queue, kSide, kSide};
  QeltDesktop::PenDataManager data{&queue};
  std::unique_ptr<Qelt::Pencil2OutlineDrawableRTV1> drawable =
      std::make_unique<Qelt::Pencil2OutlineDrawableRTV1>(&data);
};

TEST_F(OutlineRenderer, DrawsOnlyWhenThereIsSomethingToDrawWith) {
  EXPECT_EQ(inner.size(), 42u);
  EXPECT_EQ(outer[0], inner[0] - 5.0f);
  queue.run([this] { drawable->SendDataToGPU(&inner, &outer); });
  draw();  // before Init
  EXPECT_EQ(rim(), 0);
  queue.run([this] {
    for (int twice = 0; twice < 2; ++twice) drawable->CreatePenCanvas(0, 0, nullptr);
    drawable->Update(true);
    Qelt::Matrix4<float> identity;
    drawable->Draw(nullptr, identity);
  });
  EXPECT_EQ(rim(), 0);
  draw();
  EXPECT_EQ(rim(), 255);

  layer.clear();
  std::vector<float> none;
  queue.run([&] { drawable->SendDataToGPU(&inner, &none); });
  draw();
  queue.run([&] { drawable->SendDataToGPU(nullptr, &outer); });
  draw();
  EXPECT_EQ(rim(), 0);  // one stream alone draws nothing

  queue.run([&] {
    drawable->SendDataToGPU(&inner, &outer);
    drawable->Clear();
    drawable->Update(false);
  });
  EXPECT_THAT(inner, IsEmpty());
  EXPECT_THAT(outer, IsEmpty());
  draw();
  EXPECT_EQ(rim(), 0);
  queue.run([this] { drawable->Release(); });
  draw();
  queue.run([this] { drawable->Release(); });
}

TEST_F(OutlineRenderer, NotesWhatItDoes) {
  LogCapture log;
  queue.run([this] {
    drawable->CreatePenCanvas(0, 0, nullptr);
    drawable->SendDataToGPU(&inner, &outer);
    drawable->Update(false);
    drawable->RestoreGLObject();
    drawable->Release();
  });
  std::vector<std::string> lines;
  for (const LogLine& line : log.take()) {
    EXPECT_EQ(line.priority, 3);
    if (line.text.find("Pencil2OutlineDrawableRTV1::") != std::string::npos) lines.push_back(line.text);
  }
  const std::string name = "virtual void Qelt::Pencil2OutlineDrawableRTV1::";
  // Kept: both streams say 1.
  EXPECT_THAT(lines,
              ElementsAre(name + "Update(bool)", name + "Update(bool) 1 size 42",
                          name + "Update(bool) 1 size 42", name + "RestoreGLObject()", name + "Release()"));
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
