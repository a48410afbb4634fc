#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <complex>
#include <cstddef>
#include <fstream>
#include <iterator>
#include <numbers>
#include <set>
#include <string>
#include <vector>

#include "render/PatternTextures.h"

namespace Qelt {
namespace {

constexpr int kGrainSide = 150;
constexpr int kGrainPixels = kGrainSide * kGrainSide;
constexpr int kStampSide = 100;
constexpr int kStampPixels = kStampSide * kStampSide;

using Grain = std::vector<double>;

Grain grain() {
  return Grain(g_backgroundPtn, g_backgroundPtn + kGrainPixels);
}

double meanOf(const Grain& values) {
  double sum = 0.0;
  for (const double value : values) sum += value;
  return sum / static_cast<double>(values.size());
}

// Mean difference between column `a` and column `b`, or the two rows.
double difference(const Grain& g, int a, int b, bool rows) {
  double sum = 0.0;
  for (int i = 0; i < kGrainSide; ++i)
    sum += rows ? std::abs(g[a * kGrainSide + i] - g[b * kGrainSide + i])
                : std::abs(g[i * kGrainSide + a] - g[i * kGrainSide + b]);
  return sum / kGrainSide;
}

// One frequency of the grain: waves a texel and the power they carry.
struct Wave {
  double x, y, power;
  double frequency() const { return std::hypot(x, y); }
};

// Every frequency of the upper half plane but 0: the lower half mirrors it.
std::vector<Wave> spectrum(Grain g) {
  const double mean = meanOf(g);
  using Complex = std::complex<double>;
  std::array<Complex, kGrainSide> turn;
  for (int i = 0; i < kGrainSide; ++i) turn[i] = std::polar(1.0, -2.0 * std::numbers::pi * i / kGrainSide);

  std::vector<Complex> rows(kGrainPixels);
  for (int y = 0; y < kGrainSide; ++y)
    for (int u = 0; u < kGrainSide; ++u)
      for (int x = 0; x < kGrainSide; ++x)
        rows[y * kGrainSide + u] += (g[y * kGrainSide + x] - mean) * turn[u * x % kGrainSide];

  std::vector<Wave> waves;
  for (int u = 0; u < kGrainSide; ++u) {
    for (int v = 0; v <= kGrainSide / 2; ++v) {
      if (u == 0 && v == 0) continue;
      Complex sum;
      for (int y = 0; y < kGrainSide; ++y) sum += rows[y * kGrainSide + u] * turn[v * y % kGrainSide];
      const int across = u <= kGrainSide / 2 ? u : u - kGrainSide;
      waves.push_back(
          {static_cast<double>(across) / kGrainSide, static_cast<double>(v) / kGrainSide, std::norm(sum)});
    }
  }
  return waves;
}

// How far the strongest single wave stands above the mean of those of about its frequency. Random noise stays
// near 10; a repeated structure puts its power into one wave: one of a quarter of the deviation stands
// above 20.
double strongestPeak(const std::vector<Wave>& waves) {
  constexpr double kRing = 0.01;
  std::array<double, 80> power{};
  std::array<int, 80> count{};
  for (const Wave& wave : waves) {
    power[static_cast<std::size_t>(wave.frequency() / kRing)] += wave.power;
    ++count[static_cast<std::size_t>(wave.frequency() / kRing)];
  }
  double strongest = 0.0;
  for (const Wave& wave : waves) {
    const auto ring = static_cast<std::size_t>(wave.frequency() / kRing);
    if (count[ring] >= 30) strongest = std::max(strongest, wave.power * count[ring] / power[ring]);
  }
  return strongest;
}

TEST(PaperGrain, ValuesAreSpreadAsTheShaderNeedsThem) {
  const Grain g = grain();
  const double mean = meanOf(g);
  double variance = 0.0;
  for (const double value : g) variance += (value - mean) * (value - mean) / kGrainPixels;
  EXPECT_EQ(*std::min_element(g.begin(), g.end()), 2.0);
  EXPECT_EQ(*std::max_element(g.begin(), g.end()), 243.0);
  EXPECT_NEAR(mean, 110.85, 0.01);
  EXPECT_NEAR(std::sqrt(variance), 42.0, 0.3);
  EXPECT_EQ(std::set<double>(g.begin(), g.end()).size(), 229u);
}

TEST(PaperGrain, WrapsWithoutASeam) {
  const Grain g = grain();
  for (const bool rows : {false, true}) {
    double neighbours = 0.0;
    for (int i = 1; i < kGrainSide; ++i) neighbours += difference(g, i, i - 1, rows) / (kGrainSide - 1);
    EXPECT_NEAR(difference(g, 0, kGrainSide - 1, rows) / neighbours, 1.0, 0.1) << (rows ? "rows" : "columns");
  }
}

TEST(PaperGrain, ToothHasOneScaleNoDirectionAndNoPeriod) {
  const std::vector<Wave> waves = spectrum(grain());
  double all = 0.0, blotches = 0.0, tooth = 0.0;
  std::array<double, 4> direction{};
  for (const Wave& wave : waves) {
    all += wave.power;
    if (wave.frequency() < 1.0 / 40.0) blotches += wave.power;
    if (wave.frequency() > 1.0 / 25.0 && wave.frequency() < 1.0 / 4.0) tooth += wave.power;
    const double angle = std::atan2(wave.y, wave.x) + std::numbers::pi / 8.0;
    direction[static_cast<std::size_t>(angle / (std::numbers::pi / 4.0)) % 4] += wave.power;
  }
  // Blotches wider than 20 stroke units would show where the grain repeats, and so would white noise alias.
  EXPECT_LT(blotches / all, 0.005);
  EXPECT_GT(tooth / all, 0.8);
  for (const double power : direction) EXPECT_NEAR(power / all, 0.25, 0.03);

  EXPECT_LT(strongestPeak(waves), 14.0);
}

struct StampFacts {
  int coreLowest, coreHighest, centre;
  double emptyShare;
};
constexpr std::array<StampFacts, 3> kStamps = {{
    {253, 253, 253, 0.28},
    {241, 248, 248, 0.35},
    {254, 254, 254, 0.34},
}};

TEST(StampShapes, AreRoundBlotsWithAFlatCore) {
  for (std::size_t tile = 0; tile < kStamps.size(); ++tile) {
    SCOPED_TRACE(tile);
    const unsigned char* stamp = g_pointPtn + tile * kStampPixels;
    const StampFacts& facts = kStamps[tile];
    int empty = 0;
    double weight = 0.0, centreX = 0.0, centreY = 0.0;
    for (int i = 0; i < kStampPixels; ++i) {
      const double radius = std::hypot(i % kStampSide - 49.5, i / kStampSide - 49.5);
      if (radius <= 30.0) {
        EXPECT_GE(stamp[i], facts.coreLowest) << i;
        EXPECT_LE(stamp[i], facts.coreHighest) << i;
      }
      if (radius > 48.5) {
        EXPECT_EQ(stamp[i], 0) << i;
      }
      empty += stamp[i] == 0 ? 1 : 0;
      weight += stamp[i];
      centreX += stamp[i] * (i % kStampSide);
      centreY += stamp[i] * (i / kStampSide);
    }
    EXPECT_NEAR(static_cast<double>(empty) / kStampPixels, facts.emptyShare, 0.005);
    EXPECT_NEAR(centreX / weight, 49.5, 1.0);
    EXPECT_NEAR(centreY / weight, 49.5, 1.0);
    // The texel that a lookup at the centre hits, whichever way it rounds.
    for (const int i : {4949, 4950, 5049, 5050}) EXPECT_EQ(stamp[i], facts.centre);
  }
}

// The shader only asks whether a texel is 0, so the holes of the rim are the tooth of the stamp's edge.
TEST(StampShapes, RimsAreRaggedAndDiffer) {
  for (std::size_t tile = 0; tile < kStamps.size(); ++tile) {
    SCOPED_TRACE(tile);
    const unsigned char* stamp = g_pointPtn + tile * kStampPixels;
    // Walking inwards at 64 angles: where the stamp begins.
    double shallow = 50.0, deep = 0.0;
    for (int step = 0; step < 64; ++step) {
      const double angle = 2.0 * std::numbers::pi * step / 64;
      const auto at = [&](double radius) {
        const int x = static_cast<int>(std::lround(49.5 + radius * std::cos(angle)));
        const int y = static_cast<int>(std::lround(49.5 + radius * std::sin(angle)));
        return stamp[y * kStampSide + x];
      };
      double radius = 49.0;
      while (at(radius) == 0) radius -= 0.25;
      shallow = std::min(shallow, 49.0 - radius);
      deep = std::max(deep, 49.0 - radius);
    }
    EXPECT_GT(deep - shallow, tile == 0 ? 1.5 : 5.0);
    // Against the next one.
    const unsigned char* other = g_pointPtn + (tile + 1) % kStamps.size() * kStampPixels;
    int different = 0;
    for (int i = 0; i < kStampPixels; ++i) different += (stamp[i] == 0) != (other[i] == 0) ? 1 : 0;
    EXPECT_GT(different, kStampPixels / 25);
  }
}

TEST(Patterns, AreThePicturesInTheRepository) {
  const auto pixels = [](const char* name, std::size_t count) {
    std::ifstream file(std::string(QELT_SOURCE_DIR) + "/resources/" + name, std::ios::binary);
    const std::string all{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
    return all.size() < count ? std::string() : all.substr(all.size() - count);
  };
  const auto bytes = [](const unsigned char* begin, std::size_t count) {
    return std::string(reinterpret_cast<const char*>(begin), count);
  };
  EXPECT_TRUE(pixels("paper-grain.pgm", kGrainPixels) == bytes(g_backgroundPtn, sizeof g_backgroundPtn));
  EXPECT_TRUE(pixels("stamp-shapes.pgm", 3 * kStampPixels) == bytes(g_pointPtn, sizeof g_pointPtn));
}

}  // namespace
}  // namespace Qelt
