#pragma once

#include <algorithm>
#include <cstdint>

#include "base/PointF.h"
#include "base/RectF.h"
#include "base/Vector.h"
#include "stroke/placing/SegmentPath.h"
#include "stroke/placing/StampLimits.h"
#include "stroke/placing/StampRun.h"
#include "stroke/placing/StampWalk.h"

namespace Qelt {

// Places the stamps of a stroke, one segment after another: every drawable of the pencil does it through this
// class, and its row says what differs. Owns what goes on from segment to segment: the path, the count of
// stamps, how far into the next segment its first stamp lies, and the call's bound.
//
// Once per call of the drawable `beginCall`, once per stroke `begin`; then, for each segment, the path is
// extended and one of `placeSpaced`, `placeEvenly` and `placeOne` called. Main thread; allocates only where
// the batch grows, and then throws std::bad_alloc.
template <StampRow Version>
class SegmentPlacer {
 public:
  using RenderDrawable = typename Version::RenderDrawable;

  // `renderDrawable`: borrowed. May be null as long as nothing is placed.
  explicit SegmentPlacer(RenderDrawable* renderDrawable) : mRenderDrawable(renderDrawable) {}

  void beginCall() { mLimits.beginCall(); }
  // `stamps`: how many the stroke has already.
  void begin(std::int32_t stamps = 0) {
    mStamps = StampCounter(stamps);
    mLimits.beginStroke();
  }

  // How far into the next segment its first stamp lies, in stroke units. Only for spaced segments.
  void setCarried(float distance) { mCarried = distance; }
  float carried() const { return mCarried; }

  SegmentPath& path() { return mPath; }
  const SegmentPath& path() const { return mPath; }

  // Stamps every `spacing` along the path's segment, the leftover carried to the next one. True when at least
  // one stamp was placed or, beyond the call's bound, left out.
  bool placeSpaced(float length, float spacing, const SegmentLook& look, RectF* rect) {
    return place(spacedStamps(mCarried, spacing, length), length, look, rect, [&](auto& run, int most) {
      const WalkResult walk = walkSpaced(mPath.path(), mCarried, spacing, length, most, run);
      mCarried = walk.carry;
      return walk;
    });
  }

  // `count` stamps along the path's segment; the next segment begins with a stamp at its own start. True when
  // at least one stamp was placed or, beyond the call's bound, left out.
  bool placeEvenly(float length, int count, const SegmentLook& look, RectF* rect) {
    return place(std::min(count, kMostStampsPerSegment), length, look, rect,
                 [&](auto& run, int most) { return walkEvenly(mPath.path(), count, length, most, run); });
  }

  // One stamp at the last point, whatever the path. It does not count towards the call's bound
  // (StampLimits.h).
  void placeOne(const SegmentLook& look, RectF* rect) {
    Appender appender(*mRenderDrawable, 1);
    StampRun<Version> run(appender, look, mStamps, mPlaces);
    *run.places() = {mPath.last().x, mPath.last().y};
    run.place(1);
    finish(run, rect);
  }

  std::int32_t stamps() const { return mStamps.count(); }
  // Centre and alpha of the last stamp of the segment placed last, if it had any.
  Vector2<float> lastStamp() const { return mLastStamp; }
  float lastAlpha() const { return mLastAlpha; }

 private:
  using Appender = typename StampRun<Version>::Appender;

  // `expected`: at most how many stamps walk(run, most) will place.
  template <typename Walk>
  bool place(int expected, float length, const SegmentLook& look, RectF* rect, Walk&& walk) {
    const int most = mLimits.left();
    const std::int32_t before = mStamps.count();
    Appender appender(*mRenderDrawable, std::min(expected, most));
    StampRun<Version> run(appender, look, mStamps, mPlaces);
    const WalkResult walked = walk(run, most);
    finish(run, rect);
    mLimits.note(walked, Version::name, length);
    return mStamps.count() != before;
  }

  void finish(StampRun<Version>& run, RectF* rect) {
    run.finish(mPath.path(), rect);
    mStamps = run.counter();
    mLastStamp = run.lastStamp();
    mLastAlpha = run.lastAlpha();
  }

  RenderDrawable* mRenderDrawable;
  SegmentPath mPath;
  StampCounter mStamps;
  StampLimits mLimits;
  Places mPlaces;
  float mCarried = 0.0f;
  Vector2<float> mLastStamp;
  float mLastAlpha = 0.0f;
};

}  // namespace Qelt
