#include "desktop/graphics/Compose.h"

#include <GLES3/gl3.h>
#include <gmock/gmock.h>

#include <array>
#include <cmath>
#include <cstdint>
#include <optional>
#include <span>
#include <stdexcept>
#include <vector>

#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/Presenter.h"
#include "graphics/ISPBitmap.h"

namespace {

using Pixels = std::vector<std::uint8_t>;
using QeltDesktop::CanvasLayer;
using QeltDesktop::composeLayers;
using QeltDesktop::Presenter;
using QeltDesktop::RenderQueue;
using QeltDesktop::ShownLayer;

constexpr std::array<std::uint8_t, 3> kWhite{255, 255, 255};
constexpr int kWidth = 40, kHeight = 30;

Pixels at(const Pixels& pixels, int x, int y) {
  const auto pixel = pixels.begin() + (y * kWidth + x) * 4;
  return Pixels(pixel, pixel + 4);
}

void expectNear(const Pixels& some, const Pixels& others) {
  EXPECT_THAT(some, testing::Pointwise(testing::FloatNear(1.0f), others));
}

TEST(Compose, LayersMeetPremultipliedAndWithoutABackgroundComeOutStraight) {
  // Half black over white: 0 + (1 - 128/255) * 255 = 127.
  EXPECT_EQ(composeLayers({{0, 0, 0, 128}}, kWhite), (Pixels{127, 127, 127, 255}));
  // Half red over opaque blue.
  EXPECT_EQ(composeLayers({{0, 0, 255, 255}, {128, 0, 0, 128}}, kWhite), (Pixels{128, 0, 127, 255}));
  // Untouched pixels show the background as it is.
  EXPECT_EQ(composeLayers({{0, 0, 0, 0}}, std::array<std::uint8_t, 3>{1, 2, 3}), (Pixels{1, 2, 3, 255}));
  EXPECT_THROW(composeLayers({{0, 0, 0, 0}, {}}, kWhite), std::invalid_argument) << "of different sizes";
  // 64 of 128 is half: 0.50196 * 255 = 127.5 within float, so 127 or 128; red 128 of 128 is full.
  expectNear(composeLayers({{128, 64, 0, 128}}, std::nullopt), {255, 127, 0, 128});
  EXPECT_EQ(composeLayers({{0, 0, 0, 0}}, std::nullopt), (Pixels{0, 0, 0, 0}));
}

// Every strength of ink, alone among bare pixels and beside others, by the definition.
TEST(Compose, RoundsEveryStrengthToTheNearest) {
  Pixels layer;
  for (int alpha = 0; alpha < 256; ++alpha) {
    for (int color = 0; color <= alpha; ++color) {
      const auto c = static_cast<std::uint8_t>(color), a = static_cast<std::uint8_t>(alpha);
      layer.insert(layer.end(), {c, 0, a, a});
      // Long and short stretches without ink in between, of odd lengths.
      if (color % 23 == 0) layer.resize(layer.size() + static_cast<std::size_t>(color % 41) * 4);
    }
  }
  constexpr std::array<std::uint8_t, 3> kPaper{200, 3, 90};
  const Pixels onPaper = composeLayers({layer}, kPaper), straight = composeLayers({layer}, std::nullopt);
  for (std::size_t at = 0; at < layer.size(); at += 4) {
    const auto share = [&](std::size_t i) { return static_cast<float>(layer[at + i]) / 255.0f; };
    const float alpha = share(3), kept = 1.0f - alpha;
    for (std::size_t i = 0; i < 3; ++i) {
      const float paper = static_cast<float>(kPaper[i]) / 255.0f;
      EXPECT_EQ(onPaper[at + i], std::lround(std::min(share(i) + kept * paper, 1.0f) * 255.0f)) << at;
      EXPECT_EQ(straight[at + i], alpha > 0.0f ? std::lround(share(i) / alpha * 255.0f) : 0) << at;
    }
    EXPECT_EQ(onPaper[at + 3], 255);
    EXPECT_EQ(straight[at + 3], layer[at + 3]);
  }
  // In place, and in parts.
  Pixels inPlace = layer;
  const std::span<std::uint8_t> all(inPlace);
  for (const std::span<std::uint8_t> part : {all.first(1000), all.subspan(1000)}) {
    const std::span<const std::uint8_t> below(part);
    composeLayers(std::span(&below, 1), kPaper, part);
  }
  EXPECT_EQ(inPlace, onPaper);
}

// What is shown is what is written to files; here on a surface off screen.
TEST(Presenter, ShowsWhatComposingGives) {
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context, {"", kWidth, kHeight});
  CanvasLayer lowest(queue, kWidth, kHeight), middle(queue, kWidth, kHeight), highest(queue, kWidth, kHeight);
  // Bands of all strengths, in each layer another colour, along or across.
  const auto fill = [&] {
    int number = 0;
    for (CanvasLayer* const layer : {&lowest, &middle, &highest}) {
      queue.run([&] {
        auto& tile = *layer->GetBitmap()->GetSubBitmap(0);
        tile.BeginRender(0);
        for (int band = 0; band < kWidth / 2; ++band) {
          const auto alpha = static_cast<float>(band * (number + 1) % 16) / 15.0f;
          layer == &middle ? glScissor(0, 2 * band, kWidth, 2) : glScissor(2 * band, 0, 2, kHeight);
          glClearColor(alpha * 0.3f, alpha * static_cast<float>(number) * 0.5f, alpha, alpha);
          glClear(GL_COLOR_BUFFER_BIT);
        }
        tile.EndRender(0);
      });
      ++number;
    }
  };
  fill();
  Presenter presenter(queue);
  const auto screen = [&](const std::vector<ShownLayer>& layers, const auto& paper) {
    Pixels rows(kWidth * kHeight * 4), pixels;
    presenter.present(layers, paper, kWidth, kHeight);
    queue.run([&] { glReadPixels(0, 0, kWidth, kHeight, GL_RGBA, GL_UNSIGNED_BYTE, rows.data()); });
    // A surface's rows are counted from its lowest.
    for (auto row = rows.end(); row != rows.begin(); row -= kWidth * 4)
      pixels.insert(pixels.end(), row - kWidth * 4, row);
    return pixels;
  };
  constexpr std::array<std::uint8_t, 3> kPaper{250, 240, 200};
  const std::vector<ShownLayer> all{{&lowest}, {&middle}, {&highest}};
  const Pixels shown = screen(all, kPaper), layer = highest.readPixels();
  expectNear(shown, composeLayers({lowest.readPixels(), middle.readPixels(), layer}, kPaper));
  EXPECT_EQ(screen({{&middle}}, std::nullopt), middle.readPixels()) << "premultiplied, without paper";

  const Pixels moved = screen({{&highest, 1.0f, 4.0f, -6.0f}}, std::nullopt);
  const Pixels twice = screen({{&highest, 2.0f}}, std::nullopt);
  for (int y = 0; y < kHeight; ++y) {
    for (int x = 0; x < kWidth; ++x) {
      const bool isInside = x >= 4 && y + 6 < kHeight;
      EXPECT_EQ(at(moved, x, y), isInside ? at(layer, x - 4, y + 6) : Pixels(4)) << x << ", " << y;
      // A band is four pixels wide now; its middle two are free of its neighbours.
      if (x % 4 == 1 || x % 4 == 2) expectNear(at(twice, x, y), at(layer, x / 2, y / 2));
    }
  }
  for (const float scale : {0.0f, -1.0f, NAN, INFINITY})
    EXPECT_EQ(screen({{&highest, scale}, {nullptr}}, std::nullopt), Pixels(layer.size()));
  EXPECT_THROW(presenter.present(std::vector<ShownLayer>(5), kPaper, 1, 1), std::invalid_argument);

  queue.loseContext();
  presenter.present(all, kPaper, kWidth, kHeight);
  queue.restoreContext();
  fill();
  EXPECT_EQ(screen(all, kPaper), shown);
  RenderQueue unseen(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  EXPECT_THROW(const Presenter none(unseen), std::runtime_error) << "no surface";
}

}  // namespace
