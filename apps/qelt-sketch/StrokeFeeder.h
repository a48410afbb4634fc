#pragma once

#include <cstddef>
#include <functional>
#include <memory>
#include <optional>

#include "Ink.h"
#include "desktop/model/StoredStroke.h"
#include "engine/MotionEvent.h"

namespace QeltDesktop {

// What holds the pen's place: who draws and where its events come from.
struct Pointer {
  int tool;    // Qelt::ToolType
  int source;  // Qelt::InputSource, or any other number
};

// What the caller gives wins; then the trace's tool, then a stylus. Each tool has its own source.
Pointer pointerFor(const Trace& trace, std::optional<int> tool, std::optional<int> source);

// Leaves the page's last trace its first `points` samples.
void cutLastTrace(Page& page, int points);

// One live event and how far the trace has come with it.
struct LiveEvent {
  Qelt::MotionEvent event;
  std::size_t sample;  // index of the event's current sample
};

// The trace as a person draws it: down at the first sample; moves of `batch` samples, all but the last of
// them history, and a shorter one for what is left; up at the last sample again, unless the pen stays down.
void feedLive(const Trace& trace, const Pointer& pointer, int batch, bool penStaysDown,
              const std::function<void(LiveEvent&)>& take);

// The trace as one recorded event: every sample is history, and the current one repeats the last. It is the
// event that lifted the pen.
Qelt::MotionEvent recordedEvent(const Trace& trace, const Pointer& pointer);

// The trace as a page keeps it.
std::unique_ptr<StoredStroke> storedStroke(const Trace& trace, const Pointer& pointer);

// `count` samples, at least 1, that go on from `last` as `last` went on from `previous`, in one move event.
Qelt::MotionEvent predictedEvent(const Sample& previous, const Sample& last, const Pointer& pointer,
                                 int count);

}  // namespace QeltDesktop
