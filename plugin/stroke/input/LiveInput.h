#pragma once

#include "base/PointF.h"
#include "engine/MotionEvent.h"
#include "stroke/input/MoveFilter.h"
#include "stroke/input/PenSample.h"
#include "stroke/input/SampleCleaner.h"
#include "stroke/input/SampleSources.h"

// Turns live events into the samples that pens draw from. Corrections are written back into the events. Main
// thread.
namespace Qelt {

// Gives the current sample of a stylus on a touch screen a pressure.
inline void substituteTouchPressure(const MotionEvent& event, const SampleCleaner& cleaner) {
  if (isTouchStylus(event.GetToolType(0), event.GetSource()))
    writable(event).SetPressure(cleaner.unknownPressure);
}

// The current sample, cleaned. A tilt above the cap is written back.
inline PenSample takeCurrentSample(const MotionEvent& event, const SampleCleaner& cleaner) {
  EventSource(event).prepare(cleaner);
  return {{event.GetX(0), event.GetY(0)},
          cleaner.pressure(event.GetPressure(0), event.GetToolType(0)),
          cleaner.tilt(event.GetTilt(0)),
          SampleCleaner::orientation(event.GetOrientation(0))};
}

// Hands the samples of a move to take(sample), the oldest first and the current one last.
template <typename Take>
void takeMove(const MotionEvent& event, const SampleCleaner& cleaner, Take&& take) {
  const int history = event.GetHistorySize();
  const int toolType = event.GetToolType(0);
  if (isTouchStylus(toolType, event.GetSource())) {
    for (int i = 0; i < history; ++i) writable(event).SetHistoricalPressure(i, cleaner.unknownPressure);
    writable(event).SetPressure(cleaner.unknownPressure);
  }
  const PenSample current = takeCurrentSample(event, cleaner);
  EventSource source(event);
  for (int i = 0; i < history; ++i) {
    take(PenSample{source.point(i), cleaner.pressure(source.pressure(i), toolType), source.tilt(i, cleaner),
                   SampleCleaner::orientation(source.orientation(i))});
  }
  take(current);
}

// For how many stamps a move should make room: about as many as it places, one every `spacing` stroke units,
// but at most 8192. The pen stands at `mid` and was last seen at `last`. Room is made at once, since a batch
// that grows from segment to segment is copied again and again. Curves are no longer than the way from point
// to point.
inline int stampsOfMove(const MotionEvent& event, PointF mid, PointF last, float spacing) {
  constexpr float kMostAtOnce = 8192.0f;  // 2 MB; beyond it the batch grows by doubling
  const int history = event.GetHistorySize();
  PointF from = last;
  float way = distanceBetween(mid, from);
  for (int i = 0; i <= history; ++i) {
    const PointF to = i < history ? PointF{event.GetHistoricalX(i), event.GetHistoricalY(i)}
                                  : PointF{event.GetX(0), event.GetY(0)};
    if (!isUsable(to)) continue;  // it will be dropped
    way += distanceBetween(from, to);
    from = to;
  }
  const float stamps = way / spacing + 2.0f * static_cast<float>(history + 1);
  return static_cast<int>(stamps < kMostAtOnce ? stamps : kMostAtOnce);
}

}  // namespace Qelt
