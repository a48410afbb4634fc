// Strokes drawn as a host draws them: events into the built library, batches and pixels out of it.

#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "support/LiveStroke.h"
#include "support/Stamps.h"
#include "support/Versions.h"

namespace QeltTests {
namespace {

using Pixels = std::vector<std::uint8_t>;

constexpr int kSide = 256;  // of the picture

int alphaAt(const Pixels& pixels, int x, int y) {
  return pixels[(static_cast<std::size_t>(y) * kSide + static_cast<std::size_t>(x)) * 4 + 3];
}

// A wavy line to the right of (x, y).
void drawWave(LiveStroke& stroke, float x, float y) {
  std::vector<Sample> wave;
  for (float along = 0.0f; along <= 140.0f; along += 7.0f) {
    wave.push_back({x + along, y + 10.0f * std::sin(along * 0.05f), 0.8f});
  }
  stroke.stroke(wave, 2);
}

TEST(WholeStroke, OfEveryVersionRunsOnEvenlyAcrossEvents) {
  for (const int version : allVersions()) {
    LiveStroke stroke({.renderingVersion = version});
    drawWave(stroke, 20.2f, 60.1f);
    std::vector<Stamp> stamps;
    for (const std::vector<float>& batch : stroke.takeBatches()) {
      const std::vector<Stamp> more = stampsOf(batch, strideOf(version));
      stamps.insert(stamps.end(), more.begin(), more.end());
    }
    ASSERT_GT(stamps.size(), 100u) << "version " << version;
    if (version != 8) continue;
    for (std::size_t i = 1; i < stamps.size(); ++i) {
      EXPECT_NEAR(std::hypot(stamps[i].x - stamps[i - 1].x, stamps[i].y - stamps[i - 1].y), 0.4f, 0.03f) << i;
      EXPECT_EQ(stamps[i].tile, static_cast<int>(i % 3)) << i;
    }
  }
}

TEST(Picture, HasTheStrokeOnItsLineAndNothingElse) {
  LiveStroke stroke({.picture = true});
  drawWave(stroke, 40.3f, 100.7f);
  const Pixels pixels = stroke.pixels();
  int inked = 0;
  for (int x = 50; x < 170; ++x) {
    const int y = static_cast<int>(std::lround(100.7 + 10.0 * std::sin((x - 40.3) * 0.05)));
    if (alphaAt(pixels, x, y) > 60) ++inked;
  }
  EXPECT_GT(inked, 90) << "of 120 columns along the line";
  for (int y = 0; y < kSide; ++y) {
    if (y > 80 && y < 121) continue;
    for (int x = 0; x < kSide; ++x) ASSERT_EQ(alphaAt(pixels, x, y), 0) << x << ", " << y;
  }
}

}  // namespace
}  // namespace QeltTests
