#include "core/PageRecord.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstring>
#include <string>
#include <utility>

#include "core/PageStroke.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

constexpr std::array<std::uint8_t, 4> kMark{'Q', 'P', 's', 't'};
constexpr std::uint16_t kVersion = 1;
constexpr std::uint16_t kSmooth = 1, kOutline = 2;
constexpr std::size_t kHeaderBytes = 32, kSampleBytes = 28;

template <typename Bits, typename Value>
Bits bitsOf(Value value) {
  static_assert(sizeof(Bits) == sizeof(Value));
  Bits bits;
  std::memcpy(&bits, &value, sizeof bits);
  return bits;
}

class ByteWriter {
 public:
  explicit ByteWriter(std::size_t size) { mBytes.reserve(size); }

  template <typename Whole>
  void whole(Whole value) {
    for (std::size_t i = 0; i < sizeof value; ++i) {
      mBytes.push_back(static_cast<std::uint8_t>(static_cast<std::uint64_t>(value) >> (8 * i)));
    }
  }
  void number(float value) { whole(bitsOf<std::uint32_t>(value)); }
  void number(double value) { whole(bitsOf<std::uint64_t>(value)); }

  std::vector<std::uint8_t> take() { return std::move(mBytes); }

 private:
  std::vector<std::uint8_t> mBytes;
};

// Never reads beyond the bytes: their number is checked ahead.
class ByteReader {
 public:
  explicit ByteReader(std::span<const std::uint8_t> bytes) : mBytes(bytes) {}

  template <typename Whole>
  Whole whole() {
    std::uint64_t value = 0;
    for (std::size_t i = 0; i < sizeof(Whole); ++i) value |= std::uint64_t{mBytes[i]} << (8 * i);
    mBytes = mBytes.subspan(sizeof(Whole));
    return static_cast<Whole>(value);
  }
  float number() { return bitsOf<float>(whole<std::uint32_t>()); }
  double longNumber() { return bitsOf<double>(whole<std::uint64_t>()); }

 private:
  std::span<const std::uint8_t> mBytes;
};

[[noreturn]] void refuse(const std::string& why) {
  throw Refusal("a stored stroke cannot be read: " + why);
}

}  // namespace

std::vector<std::uint8_t> writeRecord(const PageStyle& style, std::span<const Sample> samples) {
  ByteWriter out(kHeaderBytes + samples.size() * kSampleBytes);
  for (const std::uint8_t byte : kMark) out.whole(byte);
  out.whole(kVersion);
  out.whole(static_cast<std::uint16_t>((style.smooth ? kSmooth : 0) | (style.outline ? kOutline : 0)));
  out.whole(static_cast<std::uint8_t>(style.look));
  out.whole(static_cast<std::uint8_t>(style.tool));
  out.whole(std::uint16_t{0});
  out.number(style.size);
  out.whole(style.argb);
  const PageOutline outline = style.outline.value_or(PageOutline{});
  out.number(outline.size);
  out.whole(outline.argb);
  out.whole(static_cast<std::uint32_t>(samples.size()));
  for (const Sample& sample : samples) {
    for (const float value : {sample.x, sample.y, sample.pressure, sample.tilt, sample.orientation}) {
      out.number(value);
    }
    out.number(sample.time);
  }
  return out.take();
}

StrokeRecord readRecord(std::span<const std::uint8_t> bytes) {
  if (bytes.size() < kMark.size() + 2 || !std::equal(kMark.begin(), kMark.end(), bytes.begin())) {
    refuse("these are not a stroke's bytes");
  }
  ByteReader in(bytes.subspan(kMark.size()));
  const auto version = in.whole<std::uint16_t>();
  if (version > kVersion) refuse("it was stored by a newer version of this page");
  if (version != kVersion) refuse("there was never a version " + std::to_string(version));
  if (bytes.size() < kHeaderBytes) refuse("it is cut short");

  StrokeRecord record;
  PageStyle& style = record.style;
  const auto flags = in.whole<std::uint16_t>();
  style.smooth = (flags & kSmooth) != 0;
  style.look = in.whole<std::uint8_t>();
  style.tool = in.whole<std::uint8_t>();
  const auto zero = in.whole<std::uint16_t>();
  style.size = in.number();
  style.argb = in.whole<std::uint32_t>();
  PageOutline outline;
  outline.size = in.number();
  outline.argb = in.whole<std::uint32_t>();
  const auto count = std::size_t{in.whole<std::uint32_t>()};
  if ((flags & ~(kSmooth | kOutline)) != 0 || zero != 0) refuse("it says what no version 1 says");
  if ((flags & kOutline) != 0) {
    style.outline = outline;
  } else if (outline != PageOutline{}) {
    refuse("it has no outline, but the outline's size or colour");
  }
  try {
    checkStyle(style);
  } catch (const Refusal& reason) {
    refuse(reason.what());
  }
  // Divided rather than multiplied: a count that lies must not run over.
  if (count == 0) refuse("it has no samples");
  const std::size_t rest = bytes.size() - kHeaderBytes;
  if (rest / kSampleBytes != count || rest % kSampleBytes != 0) {
    refuse("it should have " + std::to_string(count) + " samples, but has other bytes");
  }

  record.samples.reserve(count);
  for (std::size_t i = 0; i < count; ++i) {
    Sample sample;
    sample.x = in.number();
    sample.y = in.number();
    sample.pressure = in.number();
    sample.tilt = in.number();
    sample.orientation = in.number();
    sample.time = in.longNumber();
    if (!isUsable(sample)) refuse("sample " + std::to_string(i + 1) + " is no number or too far away");
    record.samples.push_back(sample);
  }
  return record;
}

}  // namespace QeltDesktop
