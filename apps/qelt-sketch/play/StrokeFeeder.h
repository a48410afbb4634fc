#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <span>

#include "desktop/model/StoredStroke.h"
#include "engine/MotionEvent.h"
#include "ink/Ink.h"

namespace QeltDesktop {

// The tool that draws, and the source that its events name.
struct Pointer {
  int tool;    // Qelt::ToolType
  int source;  // Qelt::InputSource, or any other number
};

// The tool is the one given, else the stroke's, else a stylus. The source is the one given, else the tool's.
Pointer pointerFor(const Stroke& stroke, std::optional<int> tool, std::optional<int> source);

// Drops all but the first `points` samples of the page's last stroke.
void cutLastStroke(Page& page, int points);

// A time as events and stored strokes have it, rounded; one that is too large counts as the largest.
std::int64_t wholeMilliseconds(double time);

// One event of at least one sample: the last is the current one, the others are history.
Qelt::MotionEvent eventOf(std::span<const Sample> samples, double downTime, int action,
                          const Pointer& pointer);

// One event of a stroke that is being drawn.
struct LiveEvent {
  Qelt::MotionEvent event;
  std::size_t sample;  // index in the stroke of the event's current sample
};

// The stroke as a person draws it: down at the first sample; moves of `samplesPerMove` samples, all but the
// last of them history, with a shorter move for the rest; up at the last sample again, unless the pen stays
// down.
void feedLive(const Stroke& stroke, const Pointer& pointer, int samplesPerMove, bool penStaysDown,
              const std::function<void(LiveEvent&)>& take);

// The stroke as one recorded up event: every sample is history, and the current one repeats the last.
Qelt::MotionEvent recordedEvent(const Stroke& stroke, const Pointer& pointer);

// The stroke as a document stores it.
std::unique_ptr<StoredStroke> storedStroke(const Stroke& stroke, const Pointer& pointer);

// One move event of `count` samples, at least 1, that go on from `last` in the step from `previous` to it.
Qelt::MotionEvent predictedEvent(const Sample& previous, const Sample& last, const Pointer& pointer,
                                 int count);

}  // namespace QeltDesktop
