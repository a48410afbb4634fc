#include "Hand.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <utility>
#include <vector>

double length(Point a) {
  return std::sqrt(a.x * a.x + a.y * a.y);
}

Point mix(Point a, Point b, double t) {
  return a + (b - a) * t;
}

Point heading(double degrees) {
  // The sine and cosine of the maths library differ from machine to machine in their last bits; these do not.
  double turn = degrees - 360.0 * std::floor(degrees / 360.0);  // 0 to 360
  bool left = false;
  if (turn > 180.0) {
    turn = 360.0 - turn;
    left = true;
  }
  const double fromRight = (turn - 90.0) / 90.0 * 1.5707963267948966;  // -pi/2 to pi/2
  const double square = fromRight * fromRight;
  double sine = 1.0;
  double cosine = 1.0;
  for (int n = 10; n >= 1; --n) {
    sine = 1.0 - square / ((2.0 * n) * (2.0 * n + 1.0)) * sine;
    cosine = 1.0 - square / ((2.0 * n - 1.0) * (2.0 * n)) * cosine;
  }
  sine *= fromRight;
  return {left ? -cosine : cosine, sine};
}

double ramp(double from, double to, double value) {
  const double t = std::clamp((value - from) / (to - from), 0.0, 1.0);
  return t * t * (3.0 - 2.0 * t);
}

namespace {

constexpr double kStep = 0.25;

// The curve between b and c of a centripetal Catmull-Rom spline: it neither overshoots nor loops, however
// unevenly the points lie.
void appendSpan(Polyline& line, Point a, Point b, Point c, Point d) {
  const auto gap = [](Point from, Point to) { return std::max(std::sqrt(length(to - from)), 1e-6); };
  const double tb = gap(a, b);
  const double tc = tb + gap(b, c);
  const double td = tc + gap(c, d);
  const int steps = std::max(2, static_cast<int>(length(c - b) * 1.2 / kStep));
  for (int i = 1; i <= steps; ++i) {
    const double t = tb + (tc - tb) * i / steps;
    const Point ab = mix(a, b, t / tb);
    const Point bc = mix(b, c, (t - tb) / (tc - tb));
    const Point cd = mix(c, d, (t - tc) / (td - tc));
    line.push_back(mix(mix(ab, bc, t / tc), mix(bc, cd, (t - tb) / (td - tb)), (t - tb) / (tc - tb)));
  }
}

}  // namespace

Polyline smooth(const std::vector<Waypoint>& waypoints) {
  Polyline line;
  if (waypoints.empty()) return line;
  line.push_back(waypoints.front().at);
  for (std::size_t i = 0; i + 1 < waypoints.size(); ++i) {
    const Point b = waypoints[i].at;
    const Point c = waypoints[i + 1].at;
    // Past an end or a corner the curve goes on as it came.
    const Point a = i > 0 && !waypoints[i].corner ? waypoints[i - 1].at : b + (b - c) * 0.5;
    const Point d =
        i + 2 < waypoints.size() && !waypoints[i + 1].corner ? waypoints[i + 2].at : c + (c - b) * 0.5;
    appendSpan(line, a, b, c, d);
  }
  return line;
}

Polyline smooth(const std::vector<Point>& points) {
  std::vector<Waypoint> waypoints;
  for (const Point& point : points) waypoints.push_back({point});
  return smooth(waypoints);
}

namespace {

std::uint64_t scramble(std::uint64_t z) {
  z = (z ^ (z >> 30)) * 0xBF58476D1CE4E5B9u;
  z = (z ^ (z >> 27)) * 0x94D049BB133111EBu;
  return z ^ (z >> 31);
}

constexpr std::uint64_t kStride = 0x9E3779B97F4A7C15u;

double asUnit(std::uint64_t bits) {
  return static_cast<double>(bits >> 11) / 9007199254740992.0;
}

}  // namespace

double Random::unit() {
  return asUnit(scramble(mState += kStride));
}

Tremor::Tremor(Random& random, double reach, double wavelength)
    : mReach(reach),
      mWavelength(wavelength),
      mSeed(static_cast<std::uint64_t>(random.unit() * 9007199254740992.0)) {}

double Tremor::at(double distance) const {
  const double place = distance / mWavelength;
  const double before = std::floor(place);
  const auto knot = [this](double index) {
    return 2.0 * asUnit(scramble(mSeed + kStride * static_cast<std::uint64_t>(index + 1000.0))) - 1.0;
  };
  return mReach * (knot(before) + (knot(before + 1.0) - knot(before)) * ramp(0.0, 1.0, place - before));
}

void Hand::draw(const Polyline& path, const Touch& touch) {
  if (path.size() < 2) return;
  const std::size_t count = path.size();

  std::vector<double> along(count, 0.0);
  for (std::size_t i = 1; i < count; ++i) along[i] = along[i - 1] + length(path[i] - path[i - 1]);
  const double whole = along.back();

  // The way the pen moves, and how sharply it turns, both over a few units.
  const auto place = [&](double distance) {
    const auto next = std::lower_bound(along.begin(), along.end(), std::clamp(distance, 0.0, whole));
    const auto i = std::max<std::size_t>(static_cast<std::size_t>(next - along.begin()), 1);
    const double gap = along[i] - along[i - 1];
    return gap > 0.0 ? mix(path[i - 1], path[i], (std::clamp(distance, 0.0, whole) - along[i - 1]) / gap)
                     : path[i];
  };
  const auto direction = [&](double distance) {
    const Point way = place(distance + 1.0) - place(distance - 1.0);
    const double size = length(way);
    return size > 1e-9 ? way * (1.0 / size) : Point{0.0, 0.0};
  };
  const auto pace = [&](double distance) {
    const double bend =
        length(direction(distance + 1.5) - direction(distance - 1.5)) / 3.0;  // radians a unit
    const double ends = ramp(-6.0, 10.0, distance) * ramp(-6.0, 10.0, whole - distance);
    return touch.speed * std::max(ends, 0.12) / (1.0 + 5.0 * bend);
  };

  const Tremor sideways(mRandom, touch.shake, 15.0);
  const Tremor upwards(mRandom, touch.shake, 17.0);
  const Tremor force(mRandom, 0.035, 24.0);
  const Tremor lean(mRandom, 0.5, 90.0);
  const Tremor swing(mRandom, 2.5, 90.0);

  std::vector<Sample> samples;
  double distance = 0.0;
  double speed = 0.0;
  while (true) {
    const Point at = place(distance);
    const double share = whole > 0.0 ? distance / whole : 0.0;
    // A pencil is put down and lifted within some hundredths of a second.
    const double contact = std::min(1.0, 0.25 + 0.25 * static_cast<double>(samples.size())) *
                           std::min(1.0, 0.2 + (whole - distance) / 6.0);
    const double pressure = (touch.pressure(share, direction(distance)) + force.at(distance)) * contact;
    const double elevation = (touch.leaning ? touch.leaning(share) : touch.elevation) + lean.at(distance);
    samples.push_back({at.x + sideways.at(distance), at.y + upwards.at(distance),
                       std::clamp(pressure, 0.01, 1.0), std::min(elevation, 89.0),
                       touch.azimuth + swing.at(distance)});
    if (distance >= whole) break;
    speed += (pace(distance) - speed) * (samples.size() == 1 ? 1.0 : 0.5);
    distance = std::min(whole, distance + std::max(speed / Page::kRate, 0.05));
  }
  mPage.add(touch.brush, std::move(samples));
  mPage.rest(mRandom.around(0.14, 0.05));
}
