// Makes the two pattern pictures of the pencil: the paper grain and the three stamp shapes.
//
//   make-patterns DIRECTORY      writes DIRECTORY/paper-grain.pgm and DIRECTORY/stamp-shapes.pgm
//
// Every step is integer arithmetic with a generator of its own, so the same bytes come out on every machine.
// What the numbers mean for the look of a stroke is told in docs/grain.md.

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <exception>
#include <fstream>
#include <iostream>
#include <numeric>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "Facts.h"

namespace {

// SplitMix64: small, and its output is fixed by arithmetic modulo 2^64 alone.
class Random {
 public:
  explicit Random(std::uint64_t seed) : mState(seed) {}

  std::uint64_t next() {
    std::uint64_t z = (mState += 0x9E3779B97F4A7C15u);
    z = (z ^ (z >> 30)) * 0xBF58476D1CE4E5B9u;
    z = (z ^ (z >> 27)) * 0x94D049BB133111EBu;
    return z ^ (z >> 31);
  }

  // Nearly normal around 0: eight 16-bit numbers added up.
  std::int64_t bell() {
    std::int64_t sum = 0;
    for (int half = 0; half < 2; ++half) {
      const std::uint64_t bits = next();
      for (int part = 0; part < 4; ++part)
        sum += static_cast<std::int64_t>((bits >> (16 * part)) & 0xFFFF) - 0x8000;
    }
    return sum;
  }

 private:
  std::uint64_t mState;
};

std::int64_t squareRoot(std::int64_t value) {
  std::int64_t root = 0;
  for (std::int64_t bit = std::int64_t{1} << 31; bit > 0; bit >>= 1) {
    const std::int64_t trial = root + bit;
    if (trial * trial <= value) root = trial;
  }
  return root;
}

// A square of numbers on a torus: whatever is done to it wraps, so no edge is special.
class Field {
 public:
  static constexpr std::int64_t kUnit = 4096;  // one standard deviation of a normalised field

  explicit Field(int side) : mSide(side), mCells(static_cast<std::size_t>(side) * side) {}

  static Field noise(int side, std::uint64_t seed) {
    Random random(seed);
    Field field(side);
    for (auto& cell : field.mCells) cell = random.bell() * kUnit;
    return field;
  }

  int side() const { return mSide; }
  const std::vector<std::int64_t>& cells() const { return mCells; }
  std::int64_t at(int x, int y) const {
    const int column = (x % mSide + mSide) % mSide;
    const int row = (y % mSide + mSide) % mSide;
    return mCells[static_cast<std::size_t>(row) * mSide + column];
  }

  // Passes of the 1 2 1 kernel along both axes; n passes blur like a Gaussian of deviation sqrt(n / 2).
  Field blurred(int passes) const {
    Field from = *this;
    Field to(mSide);
    for (int pass = 0; pass < passes; ++pass) {
      for (int y = 0; y < mSide; ++y)
        for (int x = 0; x < mSide; ++x)
          to.cell(x, y) = from.at(x - 1, y) + 2 * from.at(x, y) + from.at(x + 1, y);
      for (int y = 0; y < mSide; ++y)
        for (int x = 0; x < mSide; ++x)
          from.cell(x, y) = (to.at(x, y - 1) + 2 * to.at(x, y) + to.at(x, y + 1)) >> 4;
    }
    return from;
  }

  // This field and `factor` / 100 times the other.
  Field plus(const Field& other, int factor) const {
    Field result = *this;
    for (std::size_t i = 0; i < mCells.size(); ++i) result.mCells[i] += other.mCells[i] * factor / 100;
    return result;
  }

  // Mean 0, standard deviation kUnit.
  Field normalised() const {
    const auto count = static_cast<std::int64_t>(mCells.size());
    const std::int64_t mean = std::accumulate(mCells.begin(), mCells.end(), std::int64_t{0}) / count;
    // Squares of numbers below 2^31 stay within 64 bits only a few at a time: sum them already divided.
    std::int64_t variance = 0;
    for (const auto value : mCells) variance += (value - mean) / 64 * ((value - mean) / 64) / count;
    const std::int64_t deviation = std::max<std::int64_t>(squareRoot(variance) * 64, 1);
    Field result(mSide);
    for (std::size_t i = 0; i < mCells.size(); ++i) result.mCells[i] = (mCells[i] - mean) * kUnit / deviation;
    return result;
  }

  // The cells' numbers from the lowest to the highest; equal ones keep their order in the field.
  std::vector<int> ranked() const {
    std::vector<int> order(mCells.size());
    std::iota(order.begin(), order.end(), 0);
    std::stable_sort(order.begin(), order.end(), [this](int a, int b) { return mCells[a] < mCells[b]; });
    return order;
  }

 private:
  std::int64_t& cell(int x, int y) { return mCells[static_cast<std::size_t>(y) * mSide + x]; }

  int mSide;
  std::vector<std::int64_t> mCells;
};

// Structure between two scales and nothing coarser or finer: a field blurred little, less the same blurred
// much.
Field band(int side, std::uint64_t seed, int fine, int coarse) {
  const Field noise = Field::noise(side, seed);
  return noise.blurred(fine).plus(noise.blurred(coarse), -100).normalised();
}

// ---- the paper grain ----

constexpr int kGrainSide = 150;
constexpr int kGrainPixels = kGrainSide * kGrainSide;
constexpr int kGrainLowest = 2;
constexpr int kGrainHighest = 243;
constexpr int kGrainSum = 2494125;  // mean 110.85

// How many of the pixels have each value. A lopsided bell: it falls steeply towards the high values and
// slowly towards the low ones, so that dense graphite leaves some pits of the paper white.
std::array<int, 256> grainHistogram() {
  constexpr int kCrest = 134;
  // Where the bell runs out there are fewer pixels than values. These stay unused.
  constexpr std::array<int, 13> kUnused = {224, 226, 228, 229, 231, 232, 234, 235, 236, 238, 239, 241, 242};

  // (1 - d^2)^power with d the distance to the crest in units of the reach, as a fraction of 2^20.
  const auto bell = [](int value) {
    const bool below = value < kCrest;
    const std::int64_t reach = below ? 206 : 122;
    const int power = below ? 5 : 8;
    const std::int64_t distance = value - kCrest;
    const std::int64_t base = ((reach * reach - distance * distance) << 20) / (reach * reach);
    std::int64_t weight = 1 << 20;
    for (int i = 0; i < power; ++i) weight = weight * base >> 20;
    return weight;
  };

  std::array<int, 256> counts{};
  std::int64_t whole = 0;
  for (int value = kGrainLowest; value <= kGrainHighest; ++value) whole += bell(value);
  for (int value = kGrainLowest; value <= kGrainHighest; ++value) {
    const bool unused = std::find(kUnused.begin(), kUnused.end(), value) != kUnused.end();
    counts[value] = unused ? 0 : std::max(1, static_cast<int>(bell(value) * kGrainPixels / whole));
  }

  // What rounding lost or added, and then what the mean still lacks, is spread one pixel a value over the
  // middle.
  constexpr int kMiddle = 70;
  constexpr int kMiddleWidth = 80;
  const auto spread = [](int turn) { return kMiddle + turn * 37 % kMiddleWidth; };
  int missing = kGrainPixels - std::accumulate(counts.begin(), counts.end(), 0);
  for (int turn = 0; missing != 0; ++turn) {
    const int step = missing > 0 ? 1 : -1;
    counts[spread(turn)] += step;
    missing -= step;
  }
  int sum = 0;
  for (int value = 0; value < 256; ++value) sum += counts[value] * value;
  for (int turn = 0; sum != kGrainSum; ++turn) {
    const int step = sum < kGrainSum ? 1 : -1;
    --counts[spread(turn)];
    ++counts[spread(turn) + step];
    sum += step;
  }
  return counts;
}

// Mean difference, in thousandths, between a column of the torus and the one before it.
std::int64_t columnDifference(const Field& field, int column, bool rows) {
  std::int64_t sum = 0;
  for (int i = 0; i < field.side(); ++i)
    sum += rows ? std::abs(field.at(i, column) - field.at(i, column - 1))
                : std::abs(field.at(column, i) - field.at(column - 1, i));
  return sum * 1000 / field.side();
}

// The torus may be cut open anywhere. The cut goes where two columns differ as much as columns do on average.
int bestCut(const Field& field, bool rows) {
  std::int64_t mean = 0;
  for (int column = 0; column < field.side(); ++column) mean += columnDifference(field, column, rows);
  mean /= field.side();
  int best = 0;
  for (int column = 1; column < field.side(); ++column)
    if (std::abs(columnDifference(field, column, rows) - mean) <
        std::abs(columnDifference(field, best, rows) - mean))
      best = column;
  return best;
}

std::vector<std::uint8_t> makeGrain() {
  // One of the handful, of 1,000 tried, whose blobs and streaks stand out least at every scale; among those
  // the most even to the eye. A single conspicuous pit or row would show where the grain repeats.
  constexpr std::uint64_t kSeed = 608;
  // Two texels are one stroke unit: tooth of one to three units, a slower swell under it, and a fine
  // roughness.
  const Field tooth = Field::noise(kGrainSide, kSeed + 0x7061706572);
  Field relief = tooth.blurred(1).plus(tooth.blurred(2), 100).plus(tooth.blurred(20), -200).normalised();
  relief = relief.plus(band(kGrainSide, kSeed + 0x7377656C6C, 5, 72), 45)
               .plus(Field::noise(kGrainSide, kSeed + 0x726F756768).normalised(), 30);

  const auto counts = grainHistogram();
  const auto order = relief.ranked();
  std::vector<std::uint8_t> values(kGrainPixels);
  std::size_t next = 0;
  for (int value = 0; value < 256; ++value)
    for (int i = 0; i < counts[value]; ++i) values[order[next++]] = static_cast<std::uint8_t>(value);

  const int left = bestCut(relief, false);
  const int top = bestCut(relief, true);
  std::vector<std::uint8_t> pixels;
  pixels.reserve(kGrainPixels);
  for (int y = 0; y < kGrainSide; ++y)
    for (int x = 0; x < kGrainSide; ++x)
      pixels.push_back(values[(y + top) % kGrainSide * kGrainSide + (x + left) % kGrainSide]);
  return pixels;
}

// ---- the stamp shapes ----

constexpr int kStampSide = 100;

struct Stamp {
  std::uint64_t seed;
  int core;         // value of the core
  int coreGrain;    // how far the core may fall below it
  int emptyPixels;  // how many pixels are 0
  int ruggedness;   // how deep the teeth of the rim go, in hundredths of a pixel for one deviation of the
                    // noise
};

// The first is nearly a whole disc; the others are bitten at the rim.
constexpr std::array<Stamp, 3> kStamps = {{
    {0x73746F6E65, 253, 0, 2800, 60},
    {0x6C656164, 248, 7, 3500, 290},
    {0x77656467, 254, 0, 3400, 270},
}};

std::vector<std::uint8_t> makeStamp(const Stamp& stamp) {
  // Teeth at three scales: single texels for thick pens, clumps of ten texels for thin ones.
  const Field rough = Field::noise(kStampSide, stamp.seed)
                          .blurred(1)
                          .normalised()
                          .plus(band(kStampSide, stamp.seed + 1, 5, 60), 130)
                          .plus(band(kStampSide, stamp.seed + 2, 30, 200), 130)
                          .normalised();

  // Distance from the centre in hundredths of a pixel; the centre lies between the four middle pixels.
  const auto radiusAt = [](int x, int y) {
    const std::int64_t dx = 2 * x - (kStampSide - 1);
    const std::int64_t dy = 2 * y - (kStampSide - 1);
    return static_cast<int>(squareRoot((dx * dx + dy * dy) * 2500));
  };
  constexpr int kCoreRadius = 3000;
  constexpr int kOuterRadius = 4820;

  std::vector<std::uint8_t> pixels(static_cast<std::size_t>(kStampSide) * kStampSide);
  std::vector<std::pair<std::int64_t, int>> rim;  // how firmly each pixel of the rim holds
  for (int y = 0; y < kStampSide; ++y) {
    for (int x = 0; x < kStampSide; ++x) {
      const int index = y * kStampSide + x;
      const int radius = radiusAt(x, y);
      if (radius > kOuterRadius) continue;
      const std::int64_t noise = rough.cells()[index];
      if (radius <= kCoreRadius) {
        // The grain of the core fades towards the centre, which has the full value.
        const std::int64_t dip = stamp.coreGrain * (2 * Field::kUnit - noise) / (4 * Field::kUnit);
        const std::int64_t fade = std::clamp(radius - 300, 0, 700);
        pixels[index] = static_cast<std::uint8_t>(
            stamp.core - std::clamp<std::int64_t>(dip * fade / 700, 0, stamp.coreGrain));
        continue;
      }
      const std::int64_t fall =
          static_cast<std::int64_t>(kOuterRadius - radius) * stamp.core / (kOuterRadius - kCoreRadius);
      const std::int64_t value = fall + noise * 45 / Field::kUnit;
      pixels[index] = static_cast<std::uint8_t>(std::clamp<std::int64_t>(value, 1, stamp.core));
      rim.emplace_back(kOuterRadius - radius + noise * stamp.ruggedness / Field::kUnit, index);
    }
  }

  // The weakest pixels of the rim break out, as many as the stamp's share of empty pixels asks for.
  std::sort(rim.begin(), rim.end());
  auto empty = std::count(pixels.begin(), pixels.end(), std::uint8_t{0});
  for (const auto& [hold, index] : rim) {
    if (empty >= stamp.emptyPixels) break;
    pixels[index] = 0;
    ++empty;
  }
  return pixels;
}

void writePicture(const std::string& path, int width, const std::vector<std::uint8_t>& pixels) {
  std::ofstream file(path, std::ios::binary);
  file << "P5\n" << width << " " << pixels.size() / width << "\n255\n";
  file.write(reinterpret_cast<const char*>(pixels.data()), static_cast<std::streamsize>(pixels.size()));
  file.close();
  if (!file) throw std::runtime_error(path + ": cannot be written");
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 2) {
    std::cerr << "usage: make-patterns DIRECTORY\n";
    return 2;
  }
  try {
    const std::string directory = argv[1];
    const auto grain = makeGrain();
    facts::checkGrain(grain, kGrainSide);
    writePicture(directory + "/paper-grain.pgm", kGrainSide, grain);
    std::vector<std::uint8_t> stamps;
    for (const auto& stamp : kStamps) {
      const auto tile = makeStamp(stamp);
      facts::checkStamp(tile, kStampSide, stamp.core - stamp.coreGrain, stamp.core, stamp.emptyPixels,
                        stamp.ruggedness < 100 ? 1.5 : 5.0);
      stamps.insert(stamps.end(), tile.begin(), tile.end());
    }
    writePicture(directory + "/stamp-shapes.pgm", kStampSide, stamps);
  } catch (const std::exception& error) {
    std::cerr << "make-patterns: " << error.what() << "\n";
    return 1;
  }
}
