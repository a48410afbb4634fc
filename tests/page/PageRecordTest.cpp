#include "core/PageRecord.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <string>
#include <vector>

#include "page/PageBoard.h"

namespace QeltTests {
namespace {

using QeltDesktop::readRecord;
using QeltDesktop::Refusal;
using QeltDesktop::StrokeRecord;
using Bytes = std::vector<std::uint8_t>;

Bytes aRecord() {
  PageStyle style;
  style.look = 5;
  style.size = 2.5f;
  style.argb = 0x80112233u;
  style.smooth = false;
  style.outline = {1.5f, 0xFF445566u};
  style.tool = 3;
  return writeRecord(style, line(-3.5f, 7, 100, 200, 4));
}

std::string refusalOf(const Bytes& bytes) {
  try {
    readRecord(bytes);
  } catch (const Refusal& reason) {
    return reason.what();
  }
  return "read";
}

TEST(PageRecord, BringsAStrokeBackBitForBit) {
  const StrokeRecord record = readRecord(aRecord());
  EXPECT_EQ(record.style.look, 5);
  EXPECT_EQ(record.style.tool, 3);
  EXPECT_FALSE(record.style.smooth);
  EXPECT_EQ(record.style.outline->argb, 0xFF445566u);
  EXPECT_EQ(record.samples.size(), 4u);
  EXPECT_EQ(writeRecord(record.style, record.samples), aRecord());
  // What other versions and other machines will find: 2.5 and the second sample's time, 4.
  const Bytes bytes = aRecord();
  EXPECT_EQ(Bytes(bytes.begin(), bytes.begin() + 16),
            (Bytes{'Q', 'P', 's', 't', 1, 0, 2, 0, 5, 3, 0, 0, 0, 0, 0x20, 0x40}));
  EXPECT_EQ(Bytes(bytes.begin() + 28, bytes.begin() + 32), (Bytes{4, 0, 0, 0}));
  EXPECT_EQ(Bytes(bytes.begin() + 80, bytes.begin() + 88), (Bytes{0, 0, 0, 0, 0, 0, 0x10, 0x40}));
  EXPECT_EQ(bytes.size(), 32u + 4 * 28);
}

TEST(PageRecord, RefusesBytesThatLie) {
  const Bytes good = aRecord();
  for (std::size_t size = 0; size < good.size(); ++size) {
    EXPECT_NE(refusalOf(Bytes(good.begin(), good.begin() + static_cast<std::ptrdiff_t>(size))), "read")
        << size;
  }
  Bytes longer = good;
  longer.push_back(0);
  EXPECT_NE(refusalOf(longer), "read");
  Bytes newer = good;
  newer[4] = 2;
  EXPECT_NE(refusalOf(newer).find("newer version"), std::string::npos) << refusalOf(newer);
  struct Lie {
    std::size_t at;
    Bytes bytes;
  };
  for (const Lie& lie : {Lie{6, {0x82}},
                         {8, {0}},
                         {8, {9}},
                         {9, {0}},
                         {10, {1}},
                         {12, {0, 0, 0, 0}},
                         {12, {0, 0, 0xC0, 0x7F}},
                         {20, {0, 0, 0x80, 0xFF}},
                         {6, {0}},
                         {28, {0, 0, 0, 0}},
                         {28, {0xFF, 0xFF, 0xFF, 0xFF}},
                         {32, {0, 0, 0xC0, 0x7F}},
                         {52, {0, 0, 0, 0, 0, 0, 0xF8, 0x7F}}}) {
    Bytes bytes = good;
    std::copy(lie.bytes.begin(), lie.bytes.end(), bytes.begin() + static_cast<std::ptrdiff_t>(lie.at));
    EXPECT_NE(refusalOf(bytes), "read") << lie.at;
  }
}

// Whatever a flipped bit makes of it, it is refused or a stroke that a page draws.
TEST(PageRecord, AnyFlippedBitIsRefusedOrDrawn) {
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  InkPage page(plugin(), queue, 64, 64);
  int drawn = 0;
  for (std::size_t bit = 0; bit < 8 * (32 + 28); ++bit) {
    Bytes bytes = aRecord();
    bytes[bit / 8] ^= static_cast<std::uint8_t>(1u << (bit % 8));
    try {
      page.addRecord(bytes);
      ++drawn;
    } catch (const Refusal&) {
    }
    if (bit % 60 == 59) {
      settle(page);
      page.clear();
    }
  }
  EXPECT_GT(drawn, 100);
}

}  // namespace
}  // namespace QeltTests
