#pragma once

#include <concepts>
#include <cstdint>
#include <limits>

#include "base/PointF.h"
#include "engine/MotionEvent.h"
#include "model/ObjectStroke.h"
#include "stroke/input/PenSample.h"
#include "stroke/input/SampleCleaner.h"

// Where the samples of a whole stroke come from: an event that the host recorded, or a stroke of a document.
// Main thread.
namespace Qelt {

// What a stroke is replayed from. `prepare` is called once, ahead of everything but `isCoarse` and the search
// for the first usable point. `upEvent` ends the stroke.
template <typename Source>
concept SampleSource = requires(Source source, const SampleCleaner& cleaner, int i) {
  { source.count() } -> std::same_as<int>;
  { source.point(i) } -> std::same_as<PointF>;
  { source.pressure(i) } -> std::same_as<float>;
  { source.tilt(i, cleaner) } -> std::same_as<float>;
  { source.orientation(i) } -> std::same_as<float>;
  { source.toolType() } -> std::same_as<int>;
  { source.isCoarse() } -> std::same_as<bool>;
  source.prepare(cleaner);
  { source.upEvent(cleaner) } -> std::same_as<MotionEvent>;
};

// The pen writes its corrections back into the events it is shown.
// Kept: hosts hand them over as const all the same.
inline MotionEvent& writable(const MotionEvent& event) {
  return const_cast<MotionEvent&>(event);
}

// The points of a recorded event are its history; its current sample ends the stroke.
class EventSource {
 public:
  explicit EventSource(const MotionEvent& event) : mEvent(writable(event)) {}

  int count() const { return mEvent.GetHistorySize(); }
  PointF point(int i) const { return {mEvent.GetHistoricalX(i), mEvent.GetHistoricalY(i)}; }
  int toolType() const { return mEvent.GetToolType(0); }
  bool isCoarse() const { return isCoarseTool(toolType(), mEvent.GetSource()); }

  // Kept: the history of a stylus on a touch screen is taken as recorded; only the end is substituted.
  float pressure(int i) const { return mEvent.GetHistoricalPressure(i); }
  float orientation(int i) const { return mEvent.GetHistoricalOrientation(i); }
  // A tilt above the cap is written back.
  float tilt(int i, const SampleCleaner& cleaner) {
    const float reported = mEvent.GetHistoricalTilt(i);
    if (cleaner.exceedsCap(reported)) mEvent.SetHistoricalTilt(i, cleaner.tiltCap);
    return cleaner.tilt(reported);
  }

  // Caps the current tilt, in the event itself.
  void prepare(const SampleCleaner& cleaner) {
    if (cleaner.exceedsCap(mEvent.GetTilt(0))) mEvent.SetTilt(cleaner.tiltCap);
  }

  MotionEvent upEvent(const SampleCleaner&) const {
    const PointerProperties properties{0, toolType()};
    const PointerCoords coords{mEvent.GetX(0), mEvent.GetY(0), mEvent.GetPressure(0), mEvent.GetTilt(0),
                               mEvent.GetOrientation(0)};
    return MotionEvent(mEvent.GetDownTime(), mEvent.GetEventTime(), kActionUp, 1, &properties, &coords,
                       mEvent.GetButtonState(), mEvent.GetSource(), mEvent.GetFlags());
  }

 private:
  MotionEvent& mEvent;
};

// The points of a stored stroke, whose arrays are only read. Kept: the last point is fed twice, as a move and
// as the end.
class StrokeSource {
 public:
  explicit StrokeSource(const ObjectStroke& stroke)
      : mStroke(stroke),
        mPoints(stroke.GetPoint()),
        mPressures(stroke.GetPressure()),
        mTilts(stroke.GetTilt()),
        mOrientations(stroke.GetOrientation()) {}

  int count() const { return mPoints != nullptr ? mStroke.GetPointCount() : 0; }
  PointF point(int i) const { return mPoints[i]; }
  int toolType() const { return mStroke.GetToolType(); }
  // A stored stroke does not know the source of its events.
  bool isCoarse() const { return isCoarseTool(toolType(), 0); }

  // NaN where the stroke has no pressures; the cleaner then substitutes its own.
  float pressure(int i) const {
    return mPressures != nullptr ? mPressures[i] : std::numeric_limits<float>::quiet_NaN();
  }
  float orientation(int i) const { return mOrientations != nullptr ? mOrientations[i] : 0.0f; }
  float tilt(int i, const SampleCleaner& cleaner) const {
    return mTilts != nullptr ? cleaner.tilt(mTilts[i]) : 0.0f;
  }

  void prepare(const SampleCleaner&) {}

  // Carries the pressure as stored, whatever the tool; `StampPen::endPen` substitutes it.
  MotionEvent upEvent(const SampleCleaner& cleaner) const {
    const int last = count() - 1;
    const PointF at = point(last);
    const PointerProperties properties{0, toolType()};
    const PointerCoords coords{at.x, at.y, pressure(last), tilt(last, cleaner), orientation(last)};
    const std::int64_t* times = mStroke.GetTimeStamp();
    return MotionEvent(times != nullptr ? times[0] : 0, times != nullptr ? times[last] : 0, kActionUp, 1,
                       &properties, &coords, 0, 0, 0);
  }

 private:
  const ObjectStroke& mStroke;
  const PointF* mPoints;
  const float* mPressures;
  const float* mTilts;
  const float* mOrientations;
};

inline EventSource sourceOf(const MotionEvent& event) {
  return EventSource(event);
}
inline StrokeSource sourceOf(const ObjectStroke& stroke) {
  return StrokeSource(stroke);
}

// The index of the first point that a stroke can start from, or -1. Points that are not usable are dropped.
template <SampleSource Source>
int firstUsablePoint(const Source& source) {
  const int count = source.count();
  for (int i = 0; i < count; ++i) {
    if (isUsable(source.point(i))) return i;
  }
  return -1;
}

}  // namespace Qelt
