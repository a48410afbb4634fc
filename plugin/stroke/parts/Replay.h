#pragma once

#include "base/Error.h"
#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "stroke/parts/PenSample.h"
#include "stroke/parts/SampleCleaner.h"
#include "stroke/parts/SegmentPath.h"

// A whole stroke, recorded in an event or stored in a document, fed through the very code that draws live
// input. Main thread.
namespace Qelt {

// The index of the first point that a stroke can start from, or -1. Points that are not usable are dropped.
template <typename Source>
int firstUsablePoint(const Source& source) {
  const int count = source.count();
  for (int i = 0; i < count; ++i) {
    if (isUsable(source.point(i))) return i;
  }
  return -1;
}

// Feeds a whole stroke to a pen:
//   pen.cleaner()                                  the version's SampleCleaner
//   pen.restartMoves(coarseTool)                   ahead of everything, even where nothing follows
//   pen.beginReplay(start, smoothing)              the first sample
//   pen.drawLine(sample, rect, smoothing)          every later one
//   pen.endPen(upEvent, rect, smoothing)           the end; false when it leaves the rectangle alone
// `rect` becomes the start point and takes in what the pen reports; a straight replay also takes in every
// point and grows by `straightGrowth` at the end. False with error 7 when there is no point to start from.
template <typename Source, typename Pen>
bool replay(Source source, Pen& pen, RectF* rect, Smoothing smoothing, float straightGrowth) {
  pen.restartMoves(source.isCoarse());
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
  pen.beginReplay(start, smoothing);
  rect->Set(start.at.x, start.at.y, start.at.x, start.at.y);

  const int count = source.count();
  for (int i = first + 1; i < count; ++i) {
    const PenSample next = sample(i);
    pen.drawLine(next, rect, smoothing);
    if (smoothing == Smoothing::Straight && isUsable(next.at)) rect->MakeRect(&next.at);
  }

  MotionEvent up = source.upEvent(cleaner);  // not const: the end writes its corrections into it
  RectF endRect;
  if (pen.endPen(up, &endRect, smoothing)) rect->Union(endRect);
  if (smoothing == Smoothing::Straight) rect->IncreaseRect(straightGrowth);
  return true;
}

}  // namespace Qelt
