#include "ink/InkmlWriter.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <limits>
#include <numbers>
#include <optional>
#include <random>
#include <string>
#include <vector>

#include "ink/Ink.h"
#include "ink/InkmlReader.h"
#include "ink/SourceText.h"

namespace QeltDesktop {
namespace {

constexpr float kInfinity = std::numeric_limits<float>::infinity();
constexpr float kMost = std::numeric_limits<float>::max();

Strokes readBack(const std::string& text) {
  return readInkml(SourceText("written.inkml", text)).strokes;
}
Strokes writtenAndRead(const Strokes& strokes) {
  return readBack(writeInkml(strokes));
}

bool sameBits(const Sample& one, const Sample& other) {
  // To the last bit. NOLINTNEXTLINE(bugprone-suspicious-memory-comparison)
  const auto same = [](auto a, auto b) { return std::memcmp(&a, &b, sizeof a) == 0; };
  return same(one.x, other.x) && same(one.y, other.y) && same(one.pressure, other.pressure) &&
         same(one.tilt, other.tilt) && same(one.orientation, other.orientation) && same(one.time, other.time);
}

void expectSame(const Strokes& strokes, const Strokes& back) {
  ASSERT_EQ(back.size(), strokes.size());
  for (std::size_t i = 0; i < strokes.size(); ++i) {
    const Stroke wanted = strokes[i], read = back[i];
    EXPECT_EQ(read.brush, wanted.brush) << i;
    EXPECT_EQ(read.tool, wanted.tool) << i;
    ASSERT_EQ(read.samples.size(), wanted.samples.size()) << i;
    for (std::size_t k = 0; k < wanted.samples.size(); ++k) {
      const Sample a = wanted.samples[k], b = read.samples[k];
      ASSERT_TRUE(sameBits(a, b)) << "stroke " << i << " sample " << k << ": tilt " << a.tilt << " as "
                                  << b.tilt << ", orientation " << a.orientation << " as " << b.orientation
                                  << ", time " << a.time << " as " << b.time << ", x " << a.x << " as "
                                  << b.x;
    }
  }
}

// Any finite float, evenly over their bits.
class AnyFloat {
 public:
  float operator()() {
    for (;;) {
      const std::uint32_t bits = mBits();
      float value = 0.0f;
      std::memcpy(&value, &bits, sizeof value);
      if (std::isfinite(value)) return value;
    }
  }
  float between(float low, float high) { return std::uniform_real_distribution<float>(low, high)(mBits); }
  std::uint32_t below(std::uint32_t end) { return mBits() % end; }

 private:
  std::mt19937 mBits{2026};
};

TEST(InkmlWriter, WritesWhatReadsBackBitForBit) {
  AnyFloat any;
  constexpr float kPi = std::numbers::pi_v<float>, kUpright = 0x1p-29f;
  for (int page = 0; page < 200; ++page) {
    Strokes strokes;
    const std::uint32_t columns = any.below(16);
    const auto tilt = [&] {
      const float value = page % 2 == 0 ? any.between(0.0f, 1.5708f) : any();
      return value == 0.0f || std::fabs(value) >= kUpright ? std::fabs(value)
                                                           : 0x1p-52f * (1.0f + any.below(99));
    };
    for (std::uint32_t stroke = 0; stroke <= any.below(9); ++stroke) {
      std::vector<Sample> samples;
      for (std::size_t i = 0; i <= any.below(40); ++i) {
        Sample sample{.x = any(), .y = any.between(-1e4f, 1e4f), .time = usualTime(i)};
        if ((columns & 1) != 0) sample.pressure = page % 2 == 0 ? any.between(0.0f, 1.0f) : any();
        if ((columns & 2) != 0) sample.tilt = tilt();
        if ((columns & 4) != 0) sample.orientation = any.below(20) == 0 ? kPi : any.between(-3.1415925f, kPi);
        if ((columns & 8) != 0) sample.time = any.between(-1.0f, 1.0f) * std::pow(10.0, any.below(30)) / 3.0;
        samples.push_back(sample);
      }
      Brush brush;
      if (any.below(2) != 0) brush.width = std::fabs(any()) + 1e-30f;
      if (any.below(2) != 0) brush.rgb = any.below(0x1000000);
      if (any.below(2) != 0) brush.transparency = static_cast<std::uint8_t>(any.below(256));
      if (any.below(2) != 0) brush.renderingVersion = 1 + static_cast<int>(any.below(99));
      if (any.below(2) != 0) brush.curve = any.below(2) != 0;
      if (any.below(2) != 0) brush.outlineSize = any.between(0.1f, 50.0f);
      if (any.below(2) != 0) brush.outlineArgb = any.below(0xFFFFFFFF);
      const std::optional<int> tools[] = {std::nullopt, 1, 2, 3};
      strokes.add(samples, page % 3 == 0 ? Brush{} : brush, tools[any.below(4)]);
    }
    expectSame(strokes, writtenAndRead(strokes));
    if (HasFatalFailure()) return;
  }
}

TEST(InkmlWriter, WritesEdgesOfRanges) {
  constexpr float kPi = std::numbers::pi_v<float>;
  Strokes strokes;
  for (const float x : {0.0f, -0.0f, 0.1f, 16777217.0f, 8.5899346e9f, 1e-45f, -1e-38f, kMost, 9.9999994e-8f})
    strokes.add({{.x = x, .pressure = -x}});
  for (const float angle : {0.0f, -0.0f, kPi, std::nextafter(kPi, 0.0f), -std::nextafter(kPi, 0.0f), 1e-45f})
    strokes.add({{.orientation = angle}});
  for (const float tilt : {0.0f, 0x1p-52f, 0x1p-29f, 1.5707963f, 1.5707964f, kPi, -1.0f, -kMost})
    strokes.add({{.tilt = tilt}});
  for (const double time : {0.0, -0.0, 5e-324, 1.0 / 3.0, 1234.5999999046326, 3e38})
    strokes.add({{.time = time}, {.time = 1000.0 / 240.0}});
  expectSame(strokes, writtenAndRead(strokes));
}

TEST(InkmlWriter, WritesTheNearestWhereInkmlCannotSayIt) {
  Strokes strokes;
  Brush impossible;
  impossible.width = NAN;
  impossible.outlineSize = -1.0f;
  strokes.add({{.x = NAN, .pressure = NAN, .tilt = NAN, .orientation = NAN, .time = NAN},
               {.x = kInfinity, .pressure = -kInfinity, .tilt = 1e-12f, .orientation = 4.0f, .time = 1e300},
               {.tilt = -0.0f, .orientation = -std::numbers::pi_v<float>}},
              impossible, 4);
  const Strokes back = writtenAndRead(strokes);
  const Samples samples = back.at(0).samples;
  EXPECT_TRUE(sameBits(samples[0], Sample{}));
  EXPECT_EQ(samples[1].x, kMost);
  EXPECT_EQ(samples[1].pressure, -kMost);
  EXPECT_NEAR(samples[1].tilt, 1e-12f, 0x1p-53);
  EXPECT_NEAR(samples[1].orientation, 4.0 - 2.0 * std::numbers::pi, 1e-6);
  EXPECT_EQ(samples[1].time, static_cast<double>(kMost));
  EXPECT_EQ(samples[2].tilt, 0.0f);
  EXPECT_EQ(samples[2].orientation, std::numbers::pi_v<float>);
  EXPECT_EQ(back[0].brush, Brush{});
  EXPECT_EQ(back[0].tool, std::nullopt);
}

TEST(InkmlWriter, WritesNoMoreThanIsThere) {
  Strokes strokes;
  strokes.add({{.x = 1.5f, .y = -2.0f}, {.x = 0.1f, .y = 100.0f, .time = usualTime(1)}});
  const std::string plain = writeInkml(strokes);
  EXPECT_NE(plain.find("<trace>1.5 -2, 0.1 100</trace>"), std::string::npos) << plain;
  Brush thick;
  thick.width = 5.2f;
  for (int i = 0; i < 3; ++i) strokes.add({{.pressure = 0.25f}}, thick, 1);
  const std::string text = writeInkml(strokes);
  EXPECT_NE(text.find("<annotation type=\"tool\">finger</annotation>0 0 0.25</trace>"), std::string::npos)
      << text;
  std::size_t brushes = 0;
  for (std::size_t at = 0; (at = text.find("<brush ", at)) != std::string::npos; ++at) ++brushes;
  EXPECT_EQ(brushes, 2u) << text;
}

}  // namespace
}  // namespace QeltDesktop
