#include "output/PackedRows.h"

#include <gtest/gtest.h>

#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

namespace QeltDesktop {
namespace {

// Runs of every length that may matter, alike and not, beside each other and at both ends.
TEST(PackedRows, ComeBackAsTheyWere) {
  std::uint32_t grain = 1;
  const auto noise = [&grain] { return grain = grain * 1664525u + 1013904223u; };
  for (std::size_t pixels = 0; pixels < 600; ++pixels) {
    std::vector<std::uint32_t> rows;
    while (rows.size() < pixels) {
      const std::uint32_t kind = noise() >> 30, length = (noise() >> 16) % 20;
      const std::uint32_t colour = kind == 0 ? 0 : noise();
      for (std::uint32_t i = 0; i < length && rows.size() < pixels; ++i)
        rows.push_back(kind == 3 ? noise() : colour);
    }
    std::vector<std::uint32_t> again(pixels, 0x01020304u);
    const auto bytesOf = [](std::vector<std::uint32_t>& all) {
      return std::span(reinterpret_cast<std::uint8_t*>(all.data()), all.size() * sizeof all[0]);
    };
    PackedRows(bytesOf(rows)).unpack(bytesOf(again));
    EXPECT_TRUE(again == rows) << pixels;
  }
}

}  // namespace
}  // namespace QeltDesktop
