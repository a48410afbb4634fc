#include "SampleReader.h"

#include <array>
#include <cmath>
#include <cstddef>
#include <numbers>

namespace QeltDesktop {
namespace {

// The point's values by what they mean; unknown where there is no such channel or no value yet.
using Readings = std::array<Reading, static_cast<std::size_t>(Quantity::Time) + 1>;

const Reading& of(const Readings& readings, Quantity quantity) {
  return readings[static_cast<std::size_t>(quantity)];
}

float wrappedAngle(double radians) {
  const double wrapped = std::remainder(radians, 2.0 * std::numbers::pi);
  const auto angle = static_cast<float>(wrapped);
  // The lower end is open: half a turn has one name.
  constexpr float kHalfTurn = std::numbers::pi_v<float>;
  return angle <= -kHalfTurn ? kHalfTurn : angle;
}

// Tilt and orientation, each on its own; the tilts along the axes count where neither elevation nor azimuth
// is recorded.
void setAttitude(Sample& sample, const Readings& readings, bool hasSphericalAngles) {
  if (hasSphericalAngles) {
    const Reading& elevation = of(readings, Quantity::Elevation);
    const Reading& azimuth = of(readings, Quantity::Azimuth);
    if (elevation.known) sample.tilt = static_cast<float>(std::numbers::pi / 2.0 - elevation.value);
    if (azimuth.known) sample.orientation = wrappedAngle(azimuth.value);
    return;
  }
  const Reading& tiltX = of(readings, Quantity::TiltX);
  const Reading& tiltY = of(readings, Quantity::TiltY);
  if (!tiltX.known && !tiltY.known) return;
  const double alongX = std::tan(tiltX.value);
  const double alongY = std::tan(tiltY.value);
  sample.tilt = static_cast<float>(std::atan(std::hypot(alongX, alongY)));
  // An upright pen comes out as half a turn, as atan2 has it beside a negative zero.
  sample.orientation = wrappedAngle(std::atan2(alongX, -alongY));
}

}  // namespace

void readSamples(const TraceText& text, const TraceFormat& format, Traces& traces) {
  const bool hasSphericalAngles = format.has(Quantity::Elevation) || format.has(Quantity::Azimuth);
  std::size_t count = 0;
  text.forEachPoint(format, [&](const std::vector<Reading>& point) {
    Readings readings;
    float maxForce = 0.0f;
    for (std::size_t i = 0; i < point.size(); ++i) {
      const Channel& channel = format.channels[i];
      Reading& reading = readings[static_cast<std::size_t>(channel.quantity)];
      reading = point[i];
      reading.value *= channel.unit;
      if (channel.quantity == Quantity::Force) maxForce = channel.max;
    }
    Sample sample;
    sample.x = of(readings, Quantity::X).nearest;
    sample.y = of(readings, Quantity::Y).nearest;
    const Reading& force = of(readings, Quantity::Force);
    if (force.known) sample.pressure = maxForce > 0.0f ? force.nearest / maxForce : force.nearest;
    setAttitude(sample, readings, hasSphericalAngles);
    const Reading& time = of(readings, Quantity::Time);
    sample.time = time.known ? time.value : usualTime(count);
    traces.addSample(sample);
    ++count;
  });
}

}  // namespace QeltDesktop
