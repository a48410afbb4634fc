#pragma once

#include <cstdint>

#include "base/Error.h"
#include "base/PointF.h"
#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "model/ObjectStroke.h"
#include "stroke/parts/PenSample.h"
#include "stroke/parts/SampleCleaner.h"
#include "stroke/parts/SegmentPath.h"

// A whole stroke, recorded in an event or stored in a document, fed through the very code that draws live
// input. Main thread.
namespace Qelt {

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

  // Kept: of a stylus on a touch screen the history is taken as recorded; only the end is substituted.
  float pressure(int i) const { return mEvent.GetHistoricalPressure(i); }
  float orientation(int i) const { return mEvent.GetHistoricalOrientation(i); }
  // A tilt above the cap is written back.
  float tilt(int i, const SampleCleaner& cleaner) {
    const float reported = mEvent.GetHistoricalTilt(i);
    if (cleaner.exceedsCap(reported)) mEvent.SetHistoricalTilt(i, cleaner.tiltCap);
    return cleaner.tilt(reported);
  }

  // Caps the current tilt, in the event, ahead of everything else.
  void prepare(const SampleCleaner& cleaner) {
    if (cleaner.exceedsCap(mEvent.GetTilt(0))) mEvent.SetTilt(cleaner.tiltCap);
  }

  // The event that ends the stroke.
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

// The points of a stored stroke; its arrays are only read. Kept: the last point is fed twice, as a move and
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
  // A stored stroke has no source.
  bool isCoarse() const { return isCoarseTool(toolType(), 0); }

  // Without an array, what no number counts as.
  float pressure(int i) const { return mPressures != nullptr ? mPressures[i] : __builtin_nanf(""); }
  float orientation(int i) const { return mOrientations != nullptr ? mOrientations[i] : 0.0f; }
  float tilt(int i, const SampleCleaner& cleaner) const {
    return mTilts != nullptr ? cleaner.tilt(mTilts[i]) : 0.0f;
  }

  void prepare(const SampleCleaner&) {}

  // With the pressure as stored, whatever the tool; what ends a stroke substitutes it.
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

// The index of the first point that a stroke can start from, or -1. Points that are not finite are dropped.
template <typename Source>
int firstUsablePoint(const Source& source) {
  const int count = source.count();
  for (int i = 0; i < count; ++i) {
    if (isFinite(source.point(i))) return i;
  }
  return -1;
}

// Feeds a whole stroke to a pen:
//   pen.cleaner()                                  the version's SampleCleaner
//   pen.beginReplay(start, coarseTool, smoothing)  the first sample
//   pen.drawLine(sample, rect, smoothing)          every later one
//   pen.endPen(upEvent, rect, smoothing)           the end; false when it leaves the rectangle alone
// `rect` becomes the start point and takes in what the pen reports; a straight replay also takes in every
// point and grows by `straightGrowth` at the end. False with error 7 when there is no point to start from.
template <typename Source, typename Pen>
bool replay(Source source, Pen& pen, RectF* rect, Smoothing smoothing, float straightGrowth) {
  const int first = firstUsablePoint(source);
  if (first < 0) {
    Error::SetError(Error::kInvalidArgument);
    return false;
  }
  const SampleCleaner cleaner = pen.cleaner();
  const auto sample = [&](int i) {
    return PenSample{source.point(i), cleaner.pressure(source.pressure(i), source.toolType()),
                     source.tilt(i, cleaner), SampleCleaner::orientation(source.orientation(i))};
  };

  source.prepare(cleaner);
  const PenSample start = sample(first);
  pen.beginReplay(start, source.isCoarse(), smoothing);
  rect->Set(start.at.x, start.at.y, start.at.x, start.at.y);

  const int count = source.count();
  for (int i = first + 1; i < count; ++i) {
    const PenSample next = sample(i);
    pen.drawLine(next, rect, smoothing);
    if (smoothing == Smoothing::Straight && isFinite(next.at)) rect->MakeRect(&next.at);
  }

  MotionEvent up = source.upEvent(cleaner);  // not const: the end writes its corrections into it
  RectF endRect;
  if (pen.endPen(&up, &endRect, smoothing)) rect->Union(endRect);
  if (smoothing == Smoothing::Straight) rect->IncreaseRect(straightGrowth);
  return true;
}

}  // namespace Qelt
