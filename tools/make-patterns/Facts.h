#pragma once

#include <algorithm>
#include <array>
#include <cmath>
#include <complex>
#include <cstddef>
#include <cstdint>
#include <numbers>
#include <set>
#include <stdexcept>
#include <string>
#include <vector>

// What makes the pictures fit for paper; docs/grain.md says why. Each check throws std::runtime_error, naming
// what does not hold.
namespace facts {

using Pixels = std::vector<std::uint8_t>;

inline void require(bool holds, const char* what) {
  if (!holds) throw std::runtime_error(std::string("the picture is not fit: ") + what);
}

// One frequency of the grain: waves a texel and the power they carry.
struct Wave {
  double x, y, power;
  double frequency() const { return std::hypot(x, y); }
};

// Every frequency of the upper half plane but 0: the lower half mirrors it.
inline std::vector<Wave> spectrum(const Pixels& grain, int side, double mean) {
  using Complex = std::complex<double>;
  std::vector<Complex> turn, rows(grain.size());
  for (int i = 0; i < side; ++i) turn.push_back(std::polar(1.0, -2.0 * std::numbers::pi * i / side));
  for (int y = 0; y < side; ++y)
    for (int u = 0; u < side; ++u)
      for (int x = 0; x < side; ++x) rows[y * side + u] += (grain[y * side + x] - mean) * turn[u * x % side];
  std::vector<Wave> waves;
  for (int u = 0; u < side; ++u) {
    for (int v = 0; v <= side / 2; ++v) {
      if (u == 0 && v == 0) continue;
      Complex sum;
      for (int y = 0; y < side; ++y) sum += rows[y * side + u] * turn[v * y % side];
      const int across = u <= side / 2 ? u : u - side;
      waves.push_back({static_cast<double>(across) / side, static_cast<double>(v) / side, std::norm(sum)});
    }
  }
  return waves;
}

// How far the strongest single wave stands above the mean of those of about its frequency. Random noise stays
// near 10; a repeated structure puts its power into one wave: one of a quarter of the deviation stands
// above 20.
inline double strongestPeak(const std::vector<Wave>& waves) {
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

inline void checkGrain(const Pixels& grain, int side) {
  double mean = 0.0, variance = 0.0;
  for (const double value : grain) mean += value / static_cast<double>(grain.size());
  for (const double value : grain)
    variance += (value - mean) * (value - mean) / static_cast<double>(grain.size());
  const auto [lowest, highest] = std::minmax_element(grain.begin(), grain.end());
  require(*lowest == 2 && *highest == 243, "the values' range");
  require(std::abs(mean - 110.85) < 0.01 && std::abs(std::sqrt(variance) - 42.0) < 0.3, "the values' spread");
  require(std::set<int>(grain.begin(), grain.end()).size() == 229, "the number of values");

  for (const bool rows : {false, true}) {
    // Mean difference between a column and the one before it, the first one's being the last; or the rows'.
    const auto difference = [&](int column) {
      const int before = (column + side - 1) % side;
      double sum = 0.0;
      for (int i = 0; i < side; ++i)
        sum += rows ? std::abs(grain[column * side + i] - grain[before * side + i])
                    : std::abs(grain[i * side + column] - grain[i * side + before]);
      return sum;
    };
    double neighbours = 0.0;
    for (int i = 1; i < side; ++i) neighbours += difference(i) / (side - 1);
    require(std::abs(difference(0) / neighbours - 1.0) < 0.1, "it shows a seam where it wraps");
  }

  // Blotches wider than 20 stroke units would show where the grain repeats, and so would white noise alias.
  const std::vector<Wave> waves = spectrum(grain, side, mean);
  double all = 0.0, blotches = 0.0, tooth = 0.0;
  std::array<double, 4> direction{};
  for (const Wave& wave : waves) {
    all += wave.power;
    if (wave.frequency() < 1.0 / 40.0) blotches += wave.power;
    if (wave.frequency() > 1.0 / 25.0 && wave.frequency() < 1.0 / 4.0) tooth += wave.power;
    const double angle = std::atan2(wave.y, wave.x) + std::numbers::pi / 8.0;
    direction[static_cast<std::size_t>(angle / (std::numbers::pi / 4.0)) % 4] += wave.power;
  }
  require(blotches / all < 0.005 && tooth / all > 0.8, "its tooth has not one scale");
  for (const double power : direction) require(std::abs(power / all - 0.25) < 0.03, "it has a direction");
  require(strongestPeak(waves) < 14.0, "it has a period");
}

// A round blot with a flat core. The shader only asks whether a texel is 0, so the holes of the rim are the
// tooth of the stamp's edge.
inline void checkStamp(const Pixels& stamp, int side, int coreLowest, int coreHighest, int empty,
                       double raggedness) {
  const double middle = (side - 1) / 2.0;
  double weight = 0.0, centreX = 0.0, centreY = 0.0;
  for (int i = 0; i < side * side; ++i) {
    const double radius = std::hypot(i % side - middle, i / side - middle);
    require(radius > 30.0 || (stamp[i] >= coreLowest && stamp[i] <= coreHighest), "a core is not flat");
    require(radius <= 48.5 || stamp[i] == 0, "a stamp reaches too far");
    weight += stamp[i];
    centreX += stamp[i] * (i % side);
    centreY += stamp[i] * (i / side);
  }
  require(std::abs(std::count(stamp.begin(), stamp.end(), std::uint8_t{0}) - empty) <= 50,
          "a stamp's share of empty texels");
  require(std::abs(centreX / weight - middle) < 1.0 && std::abs(centreY / weight - middle) < 1.0,
          "a stamp is not in the middle");
  // Walking inwards at 64 angles: where the stamp begins.
  double shallow = 50.0, deep = 0.0;
  for (int step = 0; step < 64; ++step) {
    const double angle = 2.0 * std::numbers::pi * step / 64;
    double radius = 49.0;
    const auto at = [&] {
      const auto x = std::lround(middle + radius * std::cos(angle));
      const auto y = std::lround(middle + radius * std::sin(angle));
      return stamp[static_cast<std::size_t>(y * side + x)];
    };
    while (at() == 0) radius -= 0.25;
    shallow = std::min(shallow, 49.0 - radius);
    deep = std::max(deep, 49.0 - radius);
  }
  require(deep - shallow > raggedness, "a rim is not ragged");
}

}  // namespace facts
