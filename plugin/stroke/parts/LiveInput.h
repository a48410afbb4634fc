#pragma once

#include "base/PointF.h"
#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "stroke/parts/MoveFilter.h"
#include "stroke/parts/PenSample.h"
#include "stroke/parts/SampleCleaner.h"
#include "stroke/parts/SampleSources.h"
#include "stroke/parts/SegmentPath.h"
#include "stroke/parts/StrokeState.h"

// Live events, turned into the samples that pens draw from. Corrections are written back into the events.
// Main thread.
namespace Qelt {

inline void substituteTouchPressure(const MotionEvent& event, const SampleCleaner& cleaner) {
  if (isTouchStylus(event.GetToolType(0), event.GetSource()))
    writable(event).SetPressure(cleaner.unknownPressure);
}

// Cleaned; a tilt above the cap is written back.
inline PenSample takeCurrentSample(const MotionEvent& event, const SampleCleaner& cleaner) {
  EventSource(event).prepare(cleaner);
  return {{event.GetX(0), event.GetY(0)},
          cleaner.pressure(event.GetPressure(0), event.GetToolType(0)),
          cleaner.tilt(event.GetTilt(0)),
          SampleCleaner::orientation(event.GetOrientation(0))};
}

// How many stamps a move will place at a spacing, at the most; for making room at once, as a batch that grows
// from segment to segment is copied again and again. Curves are no longer than the way from point to point.
inline int stampsOfMove(const MotionEvent& event, const SegmentPath& path, float spacing) {
  constexpr float kMostAtOnce = 8192.0f;  // 2 MB; what is beyond grows by doubling
  const int history = event.GetHistorySize();
  PointF from = path.last();
  float way = distanceBetween(path.mid(), from);
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

// Hands the samples of a move to take(sample), oldest first, the current one last.
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

// The sample that ends a stroke. `rect` becomes where the stroke stands and that sample, grown by `growth`.
inline PenSample endSample(const MotionEvent& event, const SampleCleaner& cleaner, const SegmentPath& path,
                           float growth, RectF* rect) {
  substituteTouchPressure(event, cleaner);
  const PenSample sample = takeCurrentSample(event, cleaner);
  path.setToJoint(rect);
  if (isUsable(sample.at)) rect->MakeRect(&sample.at);
  rect->IncreaseRect(growth);
  return sample;
}

// Feeds one live event to a pen, which besides what `replay` asks for has
//   pen.path()                                   its SegmentPath
//   pen.beginLive(start, coarseTool, smoothing)  the pen goes down; the pressure places no stamp
//   pen.beginMove(event)                         a move is about to be taken sample by sample
//   pen.forgetAlpha()                            the closing segment has no ramp
// `rect` becomes what the event changed; a move grows it by `moveGrowth`.
template <typename Pen>
bool drawLive(const MotionEvent& event, Pen& pen, StrokeState& state, RectF* rect, Smoothing smoothing,
              float moveGrowth) {
  switch (event.GetAction()) {
    case kActionDown: {
      const PointF at{event.GetX(0), event.GetY(0)};
      if (!isUsable(at)) return false;
      state.down();
      substituteTouchPressure(event, pen.cleaner());
      pen.beginLive(takeCurrentSample(event, pen.cleaner()),
                    isCoarseTool(event.GetToolType(0), event.GetSource()), smoothing);
      rect->Set(at.x, at.y, at.x, at.y);
      return true;
    }
    case kActionMove:
      if (!state.takesMoves()) return false;
      pen.path().setToJoint(rect);
      pen.beginMove(event);
      takeMove(event, pen.cleaner(), [&](const PenSample& sample) { pen.drawLine(sample, rect, smoothing); });
      rect->IncreaseRect(moveGrowth);
      return true;
    case kActionUp:
      if (!state.up()) return false;
      pen.forgetAlpha();
      return pen.endPen(event, rect, smoothing);
    default:
      return false;
  }
}

}  // namespace Qelt
