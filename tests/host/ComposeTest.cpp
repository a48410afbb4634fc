#include "desktop/graphics/Compose.h"

#include <gtest/gtest.h>

#include <array>
#include <cstdint>
#include <optional>
#include <stdexcept>
#include <vector>

namespace {

using Pixels = std::vector<std::uint8_t>;
using QeltDesktop::composeLayers;

constexpr std::array<std::uint8_t, 3> kWhite{255, 255, 255};

TEST(Compose, LayersMeetPremultiplied) {
  // Half black over white: 0 + (1 - 128/255) * 255 = 127.
  EXPECT_EQ(composeLayers({{0, 0, 0, 128}}, kWhite), (Pixels{127, 127, 127, 255}));
  // Half red over opaque blue.
  EXPECT_EQ(composeLayers({{0, 0, 255, 255}, {128, 0, 0, 128}}, kWhite), (Pixels{128, 0, 127, 255}));
  // Untouched pixels show the background as it is.
  EXPECT_EQ(composeLayers({{0, 0, 0, 0}}, std::array<std::uint8_t, 3>{1, 2, 3}), (Pixels{1, 2, 3, 255}));
  EXPECT_THROW(composeLayers({{0, 0, 0, 0}, {}}, kWhite), std::invalid_argument) << "of different sizes";
}

TEST(Compose, WithoutABackgroundColoursComeOutStraight) {
  // 64 of 128 is half: 0.50196 * 255 = 127.5 within float, so 127 or 128; red 128 of 128 is full.
  const Pixels straight = composeLayers({{128, 64, 0, 128}}, std::nullopt);
  EXPECT_EQ(straight[0], 255);
  EXPECT_NEAR(straight[1], 127.5, 0.5);
  EXPECT_EQ(straight[2], 0);
  EXPECT_EQ(straight[3], 128);
  EXPECT_EQ(composeLayers({{0, 0, 0, 0}}, std::nullopt), (Pixels{0, 0, 0, 0}));
}

}  // namespace
