#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <new>

#include "base/Error.h"
#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "graphics/ISPPenCanvas.h"
#include "log/Log.h"
#include "model/ObjectStroke.h"
#include "pen/Pencil2Data.h"
#include "pencommon/PenGLDataManager.h"
#include "render/Posting.h"
#include "stroke/Pencil2StrokeDrawableGL.h"
#include "stroke/StrokeCache.h"
#include "stroke/StrokeRules.h"
#include "stroke/StrokeVersions.h"
#include "stroke/parts/LiveInput.h"
#include "stroke/parts/MoveFilter.h"
#include "stroke/parts/PatternShift.h"
#include "stroke/parts/PenAttitude.h"
#include "stroke/parts/PenSample.h"
#include "stroke/parts/Replay.h"
#include "stroke/parts/SampleCleaner.h"
#include "stroke/parts/SampleSources.h"
#include "stroke/parts/SegmentPath.h"
#include "stroke/parts/StampCounter.h"
#include "stroke/parts/StampLimits.h"
#include "stroke/parts/StampRun.h"
#include "stroke/parts/StampWalk.h"
#include "stroke/parts/StrokeState.h"
#include "stroke/parts/ViewScale.h"

namespace Qelt {

// The stroke drawable of one version: turns live events, recorded events and stored strokes into stamps and
// hands them to the render thread. `Version` is a row of StrokeVersions.h; what stands here is what no
// version does its own way. Main thread; allocates nothing a stamp.
//
// Segment by segment: the sample is cleaned, filtered by distance, joined to the path; the attitude of the
// pen is averaged; then the walk places stamps while width and alpha move from the last segment's targets to
// this one's.
template <typename Version>
class StrokePipeline : public Pencil2StrokeDrawableGL {
  static constexpr const StrokeProfile& kProfile = Version::profile;
  // A fixed spacing, or so many stamps a segment. (Asked of the number: under UndefinedBehaviorSanitizer GCC
  // 12 takes no comparison of a function with null for a constant.)
  static constexpr bool kSpaced = kProfile.stampSpacing > 0.0f;

 public:
  using RenderDrawable = typename Version::RenderDrawable;

  StrokePipeline(Pencil2Data* penData, PenGLDataManager* manager)
      : Pencil2StrokeDrawableGL(penData, manager), mRender(new (std::nothrow) RenderDrawable(manager)) {
    setDrawableRT(mRender);
  }

  ~StrokePipeline() override { destroy(); }

  // False when memory ran out for the render-thread half.
  bool hasPartner() const { return mRender != nullptr; }

  bool Draw(const MotionEvent* event, RectF* rect) override {
    if (event == nullptr || rect == nullptr) {
      Error::SetError(Error::kInvalidArgument);
      return false;
    }
    if (!canDraw()) return false;
    mLimits.beginCall();

    typename Version::ReturnGuard guard(mRender, mCanvas, mRender->unclaimedBatch());
    passInverseScale();
    const bool result = drawLive(*event, *this, mState, rect, settings().smoothing(), kMoveGrowth);
    guard.setRect(*rect);
    postRect(queue(), mRender, *rect);
    return result;
  }

  using Pencil2StrokeDrawableGL::RedrawPen;

  bool RedrawPen(const MotionEvent* event, RectF* rect) override {
    mMoves.setMinimumMove(getSize() / 5.0f);
    if (event == nullptr || rect == nullptr) {
      Error::SetError(Error::kInvalidArgument);
      return false;
    }
    if (!canDraw()) return false;
    mLimits.beginCall();
    postRedrawBegin();

    typename Version::ReturnGuard guard(mRender, mCanvas, mRender->unclaimedBatch());
    passInverseScale();
    return redrawInto(guard, event, rect);
  }

  bool RedrawPen(const ObjectStroke* stroke, RectF* rect) override {
    if (stroke == nullptr || rect == nullptr) {
      Error::SetError(Error::kInvalidArgument);
      return false;
    }
    if (!canDraw()) return false;
    mLimits.beginCall();
    postRedrawBegin();

    StrokeCache cache(*stroke);
    if constexpr (kProfile.followsViewScale) {
      const Vector2<float> inverseScale = getInverseScale();
      if (cache.fits(&inverseScale)) return presentCached(cache, *stroke, rect);
    } else {
      if (cache.fits(nullptr)) return presentCached(cache, *stroke, rect);
    }
    cache.dropPoints();
    return redrawAndStore(cache, stroke, rect);
  }

  // Stroke units a device pixel under the canvas's transform; the last known without a canvas.
  Vector2<float> getInverseScale() {
    return mCanvas != nullptr ? mViewScale.inverse(mCanvas->GetMatrix()) : mViewScale.inverse();
  }

 protected:
  bool redraw(const MotionEvent* event, RectF* rect) override {
    return replayChecked(event, rect, Smoothing::Curve);
  }
  bool redraw(const ObjectStroke* stroke, RectF* rect) override {
    return replayChecked(stroke, rect, Smoothing::Curve);
  }
  bool redrawPen_NoCurve(const MotionEvent* event, RectF* rect) override {
    return replayChecked(event, rect, Smoothing::Straight);
  }
  bool redrawPen_NoCurve(const ObjectStroke* stroke, RectF* rect) override {
    return replayChecked(stroke, rect, Smoothing::Straight);
  }

 private:
  template <typename Source, typename Pen>
  friend bool replay(Source, Pen&, RectF*, Smoothing, float);
  template <typename Pen>
  friend bool drawLive(const MotionEvent&, Pen&, StrokeState&, RectF*, Smoothing, float);

  // --- Live input ---

  void beginLive(const PenSample& start, bool coarseTool, Smoothing smoothing) {
    mMoves.setMinimumMove(getSize() / 5.0f);
    restartMoves(coarseTool);
    begin(start);
    if (smoothing == Smoothing::Curve) {
      postStartPoint(queue(), mRender, start.at);
      publishStart();
    }
    postPenData(queue(), mRender, getSize(), settings().color());
  }

  void beginMove(const MotionEvent& event) {
    if constexpr (kSpaced) mRender->reserve(stampsOfMove(event, mPath, kProfile.stampSpacing));
  }

  void forgetAlpha() { mAlpha = kNoAlpha; }

  // Ends a stroke at the event's point. A point that is not usable leaves the closing segment out.
  bool endPen(const MotionEvent& event, RectF* rect, Smoothing smoothing) {
    const PenSample sample = endSample(event, kCleaner, mPath, kMoveGrowth, rect);
    mAttitude.push(sample.tilt, sample.orientation);
    if (!settings().hasUsableSize()) return true;

    if (mFirstSegment) {
      placeTap(sample.pressure, rect);
    } else if (isUsable(sample.at)) {
      placeSegment(mPath.close(sample.at, smoothing), sample.pressure, rect);
      rect->IncreaseRect(kCloseGrowth);
    }
    return true;
  }

  // --- Replay ---

  template <typename Input>
  bool replayChecked(const Input* input, RectF* rect, Smoothing smoothing) {
    if (input == nullptr || rect == nullptr) {
      Error::SetError(Error::kInvalidArgument);
      return false;
    }
    return replay(sourceOf(*input), *this, rect, smoothing, kMoveGrowth);
  }

  static EventSource sourceOf(const MotionEvent& event) { return EventSource(event); }
  static StrokeSource sourceOf(const ObjectStroke& stroke) { return StrokeSource(stroke); }

  SampleCleaner cleaner() const { return kCleaner; }
  const SegmentPath& path() const { return mPath; }

  void restartMoves(bool coarseTool) {
    mMoves.restart(coarseTool ? kProfile.touchSkipDistance : mMoves.minimumMove());
  }

  void beginReplay(const PenSample& start, Smoothing smoothing) {
    // Kept: a straight replay posts no start point; the grain stays where the stroke before it had it.
    if (smoothing == Smoothing::Curve) postStartPoint(queue(), mRender, start.at);
    begin(start);
  }

  // Runs the replay that the curve option asks for and reports its area.
  template <typename Input>
  bool redrawInto(typename Version::ReturnGuard& guard, const Input* input, RectF* rect) {
    bool result;
    if (settings().smoothing() == Smoothing::Curve) {
      redraw(input, rect);
      rect->IncreaseRect(kMoveGrowth);
      result = true;  // Kept: whatever the replay answered; the straight one's answer counts
    } else {
      result = redrawPen_NoCurve(input, rect);
    }
    guard.setRect(*rect);
    postRect(queue(), mRender, *rect);
    return result;
  }

  bool presentCached(StrokeCache& cache, const ObjectStroke& stroke, RectF* rect) {
    const StrokeSource source(stroke);
    const int first = firstUsablePoint(source);
    postStartPoint(queue(), mRender, first < 0 ? PointF{} : source.point(first));
    *rect = cache.rect();
    UnclaimedBatch* unclaimed = mRender->unclaimedBatch();
    const bool handedOver =
        typename Version::CacheGuard(mRender, mCanvas, unclaimed).present(cache.buffer(), *rect);
    // The render thread drops the reference when it is done with the buffer.
    RefCount* points = cache.takePoints();
    if (!post(queue(), points, &RefCount::Unref)) {
      if (handedOver) {
        unclaimed->keep(points);
      } else {
        points->Unref();
      }
    }
    cache.postRelease(queue());
    return true;
  }

  // Kept: the entry's use ends after the batch on the curve path, always; before it on the straight path, and
  // only where there is an entry.
  bool redrawAndStore(StrokeCache& cache, const ObjectStroke* stroke, RectF* rect) {
    const bool curve = settings().smoothing() == Smoothing::Curve;
    bool result;
    {
      mMoves.setMinimumMove(getSize() / 5.0f);
      typename Version::ReturnGuard guard(mRender, mCanvas, mRender->unclaimedBatch());
      passInverseScale();
      result = redrawInto(guard, stroke, rect);
      cache.store(*rect, guard.buffer());
      if (!curve && cache.hasEntry()) cache.postRelease(queue());
    }
    if (curve) cache.postRelease(queue());
    return result;
  }

  // --- Segments ---

  // Resets what a stroke carries along. Kept: all but the pattern's shift, which goes on from stroke to
  // stroke.
  void begin(const PenSample& start) {
    mPath.start(start.at);
    mWidth = getSize();
    mAlpha = 0.0f;  // the first segment fades in
    mCarried = kProfile.stampSpacing;
    mFirstSegment = true;
    mAttitude.fill(start.tilt, start.orientation);
    mStamps.restart();
    mLimits.beginStroke();
  }

  // Takes one sample into the stroke; true when it placed a stamp.
  bool drawLine(const PenSample& sample, RectF* rect, Smoothing smoothing) {
    if (!mMoves.accepts(mPath.last(), sample.at)) return false;
    mFirstSegment = false;
    const float length = mPath.extend(sample.at, smoothing);
    mAttitude.push(sample.tilt, sample.orientation);

    bool placed = false;
    if (settings().hasUsableSize()) {
      // A segment too short for its version leaves the last point where it is.
      if (length < kProfile.shortestSegment) return false;
      placed = placeSegment(length, sample.pressure, rect);
    }
    mPath.setLast(sample.at);
    if constexpr (kProfile.publishes) {
      if (smoothing == Smoothing::Curve) publishSegment(placed);
    }
    return placed;
  }

  // Places the stamps of the path's current segment; true when there was one. Afterwards width and alpha are
  // at their targets, whatever the ramps reached.
  bool placeSegment(float length, float pressure, RectF* rect) {
    if (length < kProfile.shortestSegment) return false;
    const float size = getSize();
    const float alpha = kProfile.pressureAlpha(pressure, rules::colorAlpha(settings().color()), size);
    if (mAlpha < 0.0f) mAlpha = alpha;
    const float blend = kProfile.tiltBlend(mAttitude.meanTilt());
    const float width = kProfile.pointSize(size, blend);
    beginWidth(size);

    const int before = mStamps.count();
    if constexpr (kSpaced) {
      placeSpaced(length, width, alpha, blend, rect);
    } else {
      placeEvenly(length, size, width, alpha, blend, rect);
    }
    mWidth = width;
    mAlpha = alpha;
    mTiltBlend = blend;
    if constexpr (kProfile.shiftsPattern) mPatternShift.countSegment();
    return mStamps.count() != before;
  }

  // One stamp every spacing, the leftover carried from segment to segment.
  void placeSpaced(float length, float width, float alpha, float blend, RectF* rect) {
    const float first = mCarried;
    // The ramps' count is worked out apart from the walk, and may differ from it by one.
    const int count = rules::incremented(rules::saturatedCount((length - first) / kProfile.stampSpacing));
    const int most = mLimits.left();
    Appender appender(*mRender, std::min(spacedStamps(first, kProfile.stampSpacing, length), most));
    StampRun<Version> run = runTo(appender, width, alpha, blend, count);
    const WalkResult walk = walkSpaced(mPath.path(), first, kProfile.stampSpacing, length, most, run);
    finish(run, rect);
    mCarried = walk.carry;
    mLimits.note(walk, Version::name, length);
  }

  // So many stamps a segment; the next one begins with a stamp at its own start.
  void placeEvenly(float length, float size, float width, float alpha, float blend, RectF* rect) {
    const int count = kProfile.stampCount(length, size);
    if constexpr (kProfile.logsLargeCounts) {
      if (count > 10000) {
        __android_log_print(kLogError, kLogTag, "repeat %d drawLength %f curWidth %f", count,
                            static_cast<double>(length), static_cast<double>(size));
      }
    }
    const int most = mLimits.left();
    Appender appender(*mRender, std::min({count, kMostStampsPerSegment, most}));
    StampRun<Version> run = runTo(appender, width, alpha, blend, count);
    const WalkResult walk = walkEvenly(mPath.path(), count, length, most, run);
    finish(run, rect);
    mLimits.note(walk, Version::name, length);
  }

  using Appender = typename RenderDrawable::Appender;

  // Width and alpha on their way to a segment's targets.
  StampRun<Version> runTo(Appender& appender, float width, float alpha, float blend, int steps) const {
    const SegmentRamps ramps{mWidth, mAlpha, rules::rampStep(mWidth, width, steps),
                             rules::rampStep(mAlpha, alpha, steps)};
    return {appender, ramps, blend, stampDirection(mAttitude.meanOrientation()), mStamps};
  }

  void finish(StampRun<Version>& run, RectF* rect) {
    run.finish(mPath.path(), rect);
    mStamps = run.counter();
    mLastStamp = run.lastStamp();
    mLastStampAlpha = run.lastAlpha();
  }

  // A tap, or a stroke whose moves were all dropped: one stamp where the pen went down.
  void placeTap(float pressure, RectF* rect) {
    const float alpha = kProfile.pressureAlpha(pressure, rules::colorAlpha(settings().color()), getSize());
    if (mAlpha < 0.0f) mAlpha = alpha;
    beginWidth(getSize());
    const float blend = kProfile.tiltBlend(mAttitude.meanTilt());
    Appender appender(*mRender, 1);
    StampRun<Version> run(appender, {kProfile.pointSize(mWidth, blend), alpha, 0.0f, 0.0f}, blend,
                          stampDirection(mAttitude.meanOrientation()), mStamps);
    run({mPath.last().x, mPath.last().y});
    finish(run, rect);
  }

  // A stroke that began at a size that is none begins at the first one that is.
  void beginWidth(float size) {
    if (!PenSettings::isUsableSize(mWidth)) mWidth = size;
  }

  // --- Small things ---

  bool canDraw() const { return mRender != nullptr && mCanvas != nullptr && settings().exist(); }

  void passInverseScale() {
    if constexpr (kProfile.followsViewScale) mRender->SetInverseScale(getInverseScale());
  }

  IGLMsgQueue* queue() const { return queueOf(mDataManager); }

  void postRedrawBegin() {
    postRedrawState(queue(), mRender);
    postPenData(queue(), mRender, getSize(), settings().color());
  }

  void publishStart() {
    if constexpr (kProfile.publishes) {
      mPenData->mStartX = mPath.last().x;
      mPenData->mStartY = mPath.last().y;
      mPenData->mLastX = mPath.last().x;
      mPenData->mLastY = mPath.last().y;
      mPenData->mLastWidth = mWidth;
      mPenData->mLastOrientation = mAttitude.meanOrientation();
      mPenData->mStampCount = 0;
      mPenData->mTiltBlend = 0.0f;
      mPenData->mHasLastStroke = true;
    }
  }

  void publishSegment(bool placed) {
    if (placed) {
      mPenData->mLastStampX = mLastStamp.x;
      mPenData->mLastStampY = mLastStamp.y;
      mPenData->mLastAlpha = mLastStampAlpha;
    }
    mPenData->mLastX = mPath.last().x;
    mPenData->mLastY = mPath.last().y;
    mPenData->mLastWidth = mWidth;
    mPenData->mLastOrientation = mAttitude.meanOrientation();
    mPenData->mTiltBlend = mTiltBlend;
    mPenData->mStampCount = mStamps.count();
    mPenData->mHasLastStroke = true;
  }

  static constexpr SampleCleaner kCleaner{kProfile.unknownPressure, kProfile.tiltCap};
  static constexpr float kNoAlpha = -1.0f;
  static constexpr float kMoveGrowth = 5.0f;   // stroke units around what a call changed
  static constexpr float kCloseGrowth = 1.0f;  // and around the closing segment

  RenderDrawable* mRender;  // owned by the host's base; null when its allocation failed
  SegmentPath mPath;
  MoveFilter mMoves;
  PenAttitude<Version::tiltWindow, Version::orientationWindow> mAttitude;
  StrokeState mState;
  StampCounter mStamps;
  PatternShift mPatternShift;
  StampLimits mLimits;
  ViewScale mViewScale;
  bool mFirstSegment = true;  // no segment since the pen went down
  float mCarried = 0.0f;      // where the next stamp lies on the next segment
  float mWidth = 0.0f;        // reached at the end of the last segment
  float mAlpha = kNoAlpha;    // likewise; below 0: none yet
  float mTiltBlend = 0.0f;    // of the last segment
  Vector2<float> mLastStamp;  // of the last segment that placed one
  float mLastStampAlpha = 0.0f;
};

}  // namespace Qelt
