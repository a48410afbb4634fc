#include "play/StrokeFeeder.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <vector>

#include "base/PointF.h"

namespace QeltDesktop {
namespace {

Qelt::PointerCoords coordsOf(const Sample& sample) {
  return {.x = sample.x,
          .y = sample.y,
          .pressure = sample.pressure,
          .tilt = sample.tilt,
          .orientation = sample.orientation};
}

// One event of the `count` samples from `first` on: the last is the current one, the others are history.
template <typename SampleList>
Qelt::MotionEvent eventOf(const SampleList& samples, std::size_t first, std::size_t count, double downTime,
                          int action, const Pointer& pointer) {
  const Qelt::PointerProperties properties{.id = 0, .toolType = pointer.tool};
  const Sample begin = samples[first];
  const Qelt::PointerCoords place = coordsOf(begin);
  Qelt::MotionEvent event(wholeMilliseconds(downTime), wholeMilliseconds(begin.time), action, 1, &properties,
                          &place, 0, pointer.source, 0);
  for (std::size_t i = first + 1; i < first + count; ++i) {
    const Sample sample = samples[i];
    const Qelt::PointerCoords coords = coordsOf(sample);
    event.AddBatch(wholeMilliseconds(sample.time), &coords);
  }
  return event;
}

}  // namespace

std::int64_t wholeMilliseconds(double time) {
  constexpr double kFarAway = 9.0e18;  // fits into 64 bits
  return std::llround(std::clamp(time, -kFarAway, kFarAway));
}

Qelt::MotionEvent eventOf(std::span<const Sample> samples, double downTime, int action,
                          const Pointer& pointer) {
  return eventOf(samples, 0, samples.size(), downTime, action, pointer);
}

Pointer pointerFor(const Stroke& stroke, std::optional<int> tool, std::optional<int> source) {
  Pointer pointer{};
  pointer.tool = tool.value_or(stroke.tool.value_or(Qelt::kToolStylus));
  const int usual = pointer.tool == Qelt::kToolFinger  ? Qelt::kSourceTouchScreen
                    : pointer.tool == Qelt::kToolMouse ? Qelt::kSourceMouse
                                                       : Qelt::kSourceStylus;
  pointer.source = source.value_or(usual);
  return pointer;
}

void cutLastStroke(Page& page, int points) {
  page.strokes.cutLast(static_cast<std::size_t>(points));
}

void feedLive(const Stroke& stroke, const Pointer& pointer, int samplesPerMove, bool penStaysDown,
              const std::function<void(LiveEvent&)>& take) {
  const Samples& samples = stroke.samples;
  const double downTime = samples.front().time;
  const auto feed = [&](std::size_t first, std::size_t count, int action) {
    LiveEvent live{eventOf(samples, first, count, downTime, action, pointer), first + count - 1};
    take(live);
  };
  feed(0, 1, Qelt::kActionDown);
  for (std::size_t next = 1; next < samples.size();) {
    const std::size_t count = std::min(samples.size() - next, static_cast<std::size_t>(samplesPerMove));
    feed(next, count, Qelt::kActionMove);
    next += count;
  }
  if (!penStaysDown) feed(samples.size() - 1, 1, Qelt::kActionUp);
}

Qelt::MotionEvent recordedEvent(const Stroke& stroke, const Pointer& pointer) {
  const Samples& samples = stroke.samples;
  const Sample last = samples.back();
  Qelt::MotionEvent event =
      eventOf(samples, 0, samples.size(), samples.front().time, Qelt::kActionUp, pointer);
  const Qelt::PointerCoords coords = coordsOf(last);
  event.AddBatch(wholeMilliseconds(last.time), &coords);
  return event;
}

std::unique_ptr<StoredStroke> storedStroke(const Stroke& stroke, const Pointer& pointer) {
  auto stored = std::make_unique<StoredStroke>(pointer.tool);
  stored->reserve(static_cast<int>(stroke.samples.size()));
  for (const Sample& sample : stroke.samples) {
    stored->addPoint({.x = sample.x, .y = sample.y}, wholeMilliseconds(sample.time), sample.pressure,
                     sample.tilt, sample.orientation);
  }
  return stored;
}

Qelt::MotionEvent predictedEvent(const Sample& previous, const Sample& last, const Pointer& pointer,
                                 int count) {
  std::vector<Sample> samples;
  for (int k = 1; k <= count; ++k) {
    Sample sample = last;
    sample.x = last.x + static_cast<float>(k) * (last.x - previous.x);
    sample.y = last.y + static_cast<float>(k) * (last.y - previous.y);
    sample.time = last.time + k * (last.time - previous.time);
    samples.push_back(sample);
  }
  return eventOf(samples, last.time, Qelt::kActionMove, pointer);
}

}  // namespace QeltDesktop
