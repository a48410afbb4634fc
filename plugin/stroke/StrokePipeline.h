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
#include "pencommon/PenSettingData.h"
#include "render/Posting.h"
#include "stroke/Pencil2StrokeDrawableGL.h"
#include "stroke/StrokeCache.h"
#include "stroke/StrokeRules.h"
#include "stroke/StrokeVersions.h"
#include "stroke/parts/DirtyBox.h"
#include "stroke/parts/MoveFilter.h"
#include "stroke/parts/PatternShift.h"
#include "stroke/parts/PenAttitude.h"
#include "stroke/parts/PenSample.h"
#include "stroke/parts/Replay.h"
#include "stroke/parts/SampleCleaner.h"
#include "stroke/parts/SegmentPath.h"
#include "stroke/parts/StampCounter.h"
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

  bool Draw(const MotionEvent* event, RectF* rect) override {
    if (event == nullptr || rect == nullptr) {
      Error::SetError(Error::kInvalidArgument);
      return false;
    }
    if (!canDraw()) return false;

    typename Version::ReturnGuard guard(mRender, mCanvas, mRender->unclaimedBatch());
    passInverseScale();
    const bool result = drawEvent(*event, rect);
    guard.setRect(*rect);
    postRect(*rect);
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

  // --- Live input ------------------------------------------------------------------------------------------

  bool drawEvent(const MotionEvent& event, RectF* rect) {
    const Smoothing smoothing = currentSmoothing();
    switch (event.GetAction()) {
      case kActionDown:
        if (!isFinite(PointF{event.GetX(0), event.GetY(0)})) return false;
        mState.down();
        mMoves.setMinimumMove(getSize() / 5.0f);
        return startPen(event, rect, smoothing);
      case kActionMove:
        return mState.move() && movePen(event, rect, smoothing);
      case kActionUp:
        if (!mState.up()) return false;
        mAlpha = kNoAlpha;  // the closing segment has no ramp
        return endPen(&event, rect, smoothing);
      default:
        return false;
    }
  }

  // The start pressure places no stamp; all the same it is written back for a stylus that reports none.
  bool startPen(const MotionEvent& event, RectF* rect, Smoothing smoothing) {
    substituteTouchPressure(event);
    const PointF at{event.GetX(0), event.GetY(0)};
    const PenSample start{at, kCleaner.unknownPressure, cleanTilt(event),
                          SampleCleaner::orientation(event.GetOrientation(0))};
    begin(start, isCoarseTool(event.GetToolType(0), event.GetSource()));

    if (smoothing == Smoothing::Curve) {
      postStartPoint(at);
      publishStart();
    }
    rect->Set(at.x, at.y, at.x, at.y);
    postPenData();
    return true;
  }

  bool movePen(const MotionEvent& event, RectF* rect, Smoothing smoothing) {
    const int history = event.GetHistorySize();
    const int toolType = event.GetToolType(0);
    if (isTouchStylus(toolType, event.GetSource())) {
      for (int i = 0; i < history; ++i) writable(event).SetHistoricalPressure(i, kProfile.unknownPressure);
      writable(event).SetPressure(kProfile.unknownPressure);
    }
    setToJoint(rect);
    reserveFor(event);

    const float currentTilt = cleanTilt(event);
    EventSource source(event);
    for (int i = 0; i < history; ++i) {
      drawLine({source.point(i), kCleaner.pressure(source.pressure(i), toolType), source.tilt(i, kCleaner),
                SampleCleaner::orientation(source.orientation(i))},
               rect, smoothing);
    }
    drawLine({{event.GetX(0), event.GetY(0)},
              kCleaner.pressure(event.GetPressure(0), toolType),
              currentTilt,
              SampleCleaner::orientation(event.GetOrientation(0))},
             rect, smoothing);
    rect->IncreaseRect(kMoveGrowth);
    return true;
  }

  // Makes room for the stamps of a whole move at once: a batch that grows from segment to segment is copied
  // again and again. Curves are no longer than the way from point to point.
  void reserveFor(const MotionEvent& event) {
    if constexpr (kSpaced) {
      constexpr float kMostAtOnce = 8192.0f;  // stamps, 2 MB; what is beyond grows by doubling
      const int history = event.GetHistorySize();
      PointF from = mPath.last();
      float way = distanceBetween(mPath.mid(), from);
      for (int i = 0; i <= history; ++i) {
        const PointF to = i < history ? PointF{event.GetHistoricalX(i), event.GetHistoricalY(i)}
                                      : PointF{event.GetX(0), event.GetY(0)};
        way += distanceBetween(from, to);
        from = to;
      }
      const float stamps = way / kProfile.stampSpacing + 2.0f * static_cast<float>(history + 1);
      mRender->reserve(static_cast<std::size_t>(stamps < kMostAtOnce ? stamps : kMostAtOnce));
    }
  }

  // Ends a stroke at the event's point. A point that is not finite leaves the closing segment out.
  bool endPen(const MotionEvent* event, RectF* rect, Smoothing smoothing) {
    if (event == nullptr || rect == nullptr) {
      Error::SetError(Error::kInvalidArgument);
      return false;
    }
    substituteTouchPressure(*event);
    const PointF at{event->GetX(0), event->GetY(0)};
    setToJoint(rect);
    if (isFinite(at)) rect->MakeRect(&at);
    rect->IncreaseRect(kMoveGrowth);

    const PenSample sample{at, kCleaner.pressure(event->GetPressure(0), event->GetToolType(0)),
                           cleanTilt(*event), SampleCleaner::orientation(event->GetOrientation(0))};
    mAttitude.push(sample.tilt, sample.orientation);
    if (!hasUsableSize()) return true;

    if (mFirstSegment) {
      placeTap(sample.pressure, rect);
    } else if (isFinite(at)) {
      placeSegment(mPath.close(at, smoothing), sample.pressure, rect);
      rect->IncreaseRect(kCloseGrowth);
    }
    return true;
  }

  // --- Replay
  // ------------------------------------------------------------------------------------------------

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

  void beginReplay(const PenSample& start, bool coarseTool, Smoothing smoothing) {
    // Kept: a straight replay posts no start point; the grain stays where the stroke before it had it.
    if (smoothing == Smoothing::Curve) postStartPoint(start.at);
    begin(start, coarseTool);
  }

  // Runs the replay that the curve option asks for and reports its area.
  template <typename Input>
  bool redrawInto(typename Version::ReturnGuard& guard, const Input* input, RectF* rect) {
    bool result;
    if (currentSmoothing() == Smoothing::Curve) {
      redraw(input, rect);
      rect->IncreaseRect(kMoveGrowth);
      result = true;  // Kept: whatever the replay answered; the straight one's answer counts
    } else {
      result = redrawPen_NoCurve(input, rect);
    }
    guard.setRect(*rect);
    postRect(*rect);
    return result;
  }

  bool presentCached(StrokeCache& cache, const ObjectStroke& stroke, RectF* rect) {
    const StrokeSource source(stroke);
    const int first = firstUsablePoint(source);
    postStartPoint(first < 0 ? PointF{} : source.point(first));
    *rect = cache.rect();
    UnclaimedBatch* unclaimed = mRender->unclaimedBatch();
    bool handedOver = false;
    {
      const typename Version::CacheGuard guard(mRender, mCanvas, *rect, cache.buffer(), unclaimed,
                                               &handedOver);
    }
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
    const bool curve = currentSmoothing() == Smoothing::Curve;
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

  // --- Segments
  // ----------------------------------------------------------------------------------------------

  // Resets everything that a stroke carries along.
  void begin(const PenSample& start, bool coarseTool) {
    mMoves.restart(coarseTool ? kProfile.touchSkipDistance : mMoves.minimumMove());
    mPath.start(start.at);
    mWidth = getSize();
    mAlpha = 0.0f;  // the first segment fades in
    mCarried = kProfile.stampSpacing;
    mFirstSegment = true;
    mAttitude.fill(start.tilt, start.orientation);
    mStamps.restart();
    mPatternShift.restart();
    mLoggedCut = false;
  }

  // Takes one sample into the stroke; true when it placed a stamp.
  bool drawLine(const PenSample& sample, RectF* rect, Smoothing smoothing) {
    if (!mMoves.accepts(mPath.last(), sample.at)) return false;
    mFirstSegment = false;
    const float length = mPath.extend(sample.at, smoothing);
    mAttitude.push(sample.tilt, sample.orientation);

    bool placed = false;
    if (hasUsableSize()) {
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
    const float alpha = kProfile.pressureAlpha(pressure, rules::colorAlpha(getColor()), size);
    if (mAlpha < 0.0f) mAlpha = alpha;
    const float blend = kProfile.tiltBlend(mAttitude.meanTilt());
    const float width = kProfile.pointSize(size, blend);

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
    Appender appender(*mRender, spacedStamps(first, kProfile.stampSpacing, length));
    StampRun run(*this, appender, width, alpha, blend, count);
    const WalkResult walk = walkSpaced(mPath.path(), first, kProfile.stampSpacing, length, run);
    run.finish(*this, rect);
    mCarried = walk.carry;
    if (walk.cutShort) logCut(length);
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
    const int most = std::min(count, kMostStampsPerSegment);
    Appender appender(*mRender, static_cast<std::size_t>(most));
    StampRun run(*this, appender, width, alpha, blend, count);
    const bool cutShort = walkEvenly(mPath.path(), count, length, run);
    run.finish(*this, rect);
    if (cutShort) logCut(length);
  }

  // The stamps of one segment, with width and alpha on their way to the targets. Local state, so that the
  // walk runs in registers.
  using Appender = typename RenderDrawable::Appender;

  class StampRun {
   public:
    // `steps`: of the ramps.
    StampRun(const StrokePipeline& pen, Appender& appender, float width, float alpha, float blend, int steps)
        : mAppender(appender),
          mWidth(pen.mWidth),
          mAlpha(pen.mAlpha),
          mWidthStep(rules::rampStep(pen.mWidth, width, steps)),
          mAlphaStep(kSpaced ? (alpha - pen.mAlpha) / static_cast<float>(steps)
                             : rules::rampStep(pen.mAlpha, alpha, steps)),
          mBlend(blend),
          mStamps(pen.mStamps) {
      mStamp[1] = pen.direction();
    }

    void operator()(SmPoint at) {
      mStamp[0] = {at.x, at.y};
      mBox.add(at.x, at.y, kProfile.stampReach(mWidth));
      mAppender.AddPoint(mStamp, kProfile.stampSize(mWidth), kProfile.stampAlpha(mAlpha), mBlend,
                         mStamps.next());
      mLastAlpha = mAlpha;
      mWidth += mWidthStep;
      mAlpha += mAlphaStep;
    }

    void finish(StrokePipeline& pen, RectF* rect) {
      mAppender.flush();
      mBox.uniteInto(rect);
      pen.mStamps = mStamps;
      pen.mLastStamp = mStamp[0];
      pen.mLastStampAlpha = mLastAlpha;
    }

   private:
    Appender& mAppender;
    float mWidth, mAlpha;
    float mWidthStep, mAlphaStep;
    float mBlend;
    float mLastAlpha = 0.0f;
    StampCounter mStamps;
    DirtyBox mBox;
    Vector2<float> mStamp[2];  // centre, direction
  };

  // A tap, or a stroke whose moves were all dropped: one stamp where the pen went down.
  void placeTap(float pressure, RectF* rect) {
    const float alpha = kProfile.pressureAlpha(pressure, rules::colorAlpha(getColor()), getSize());
    if (mAlpha < 0.0f) mAlpha = alpha;
    const float blend = kProfile.tiltBlend(mAttitude.meanTilt());
    drawPoint(mPath.last(), kProfile.pointSize(mWidth, blend), alpha, blend, rect);
  }

  void drawPoint(PointF at, float width, float alpha, float blend, RectF* rect) {
    const Vector2<float> stamp[2] = {{at.x, at.y}, direction()};
    mRender->AddPoint(stamp, kProfile.stampSize(width), kProfile.stampAlpha(alpha), blend, mStamps.next());
    DirtyBox box;
    box.add(at.x, at.y, kProfile.stampReach(width));
    box.uniteInto(rect);
  }

  // --- Small things
  // ------------------------------------------------------------------------------------------

  bool canDraw() const { return mRender != nullptr && mCanvas != nullptr && hasSettings(); }

  Smoothing currentSmoothing() const {
    return mPenData->mCurveEnabled ? Smoothing::Curve : Smoothing::Straight;
  }

  // A pen without a sensible size places nothing.
  bool hasUsableSize() const { return std::isfinite(getSize()) && getSize() > 0.0f; }

  // The stamps' rotation axis.
  Vector2<float> direction() const {
    float sine, cosine;
    sincosf(mAttitude.meanOrientation(), &sine, &cosine);
    return {-sine, cosine};
  }

  // The current tilt, capped in the event too.
  static float cleanTilt(const MotionEvent& event) {
    EventSource(event).prepare(kCleaner);
    return kCleaner.tilt(event.GetTilt(0));
  }

  static void substituteTouchPressure(const MotionEvent& event) {
    if (isTouchStylus(event.GetToolType(0), event.GetSource()))
      writable(event).SetPressure(kProfile.unknownPressure);
  }

  // Where the stroke stands: from the mid point to the last point.
  void setToJoint(RectF* rect) const {
    rect->Set(mPath.mid().x, mPath.mid().y, mPath.mid().x, mPath.mid().y);
    const PointF last = mPath.last();
    rect->MakeRect(&last);
  }

  void passInverseScale() {
    if constexpr (kProfile.followsViewScale) mRender->SetInverseScale(getInverseScale());
  }

  IGLMsgQueue* queue() const { return mDataManager != nullptr ? mDataManager->GetMsgQueue() : nullptr; }

  void postStartPoint(PointF at) { post(queue(), mRender, &RenderDrawable::SetStartPoint, at.x, at.y); }

  void postPenData() {
    post(queue(), mRender, &PenDrawableRT::SetPenData, getSize(), static_cast<int>(getColor()));
  }

  void postRedrawBegin() {
    post(queue(), mRender, &PenDrawableRT::SetRedrawState, true);
    postPenData();
  }

  void postRect(RectF rect) {
    rect.ExtendRect();
    post(queue(), mRender, &PenDrawableRT::SetRect, rect);
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

  // Once a stroke.
  void logCut(float length) {
    if (mLoggedCut) return;
    mLoggedCut = true;
    __android_log_print(kLogError, kLogTag, "%s: a segment of length %f was cut short", Version::name,
                        static_cast<double>(length));
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
  ViewScale mViewScale;
  bool mFirstSegment = true;  // no segment since the pen went down
  bool mLoggedCut = false;
  float mCarried = 0.0f;      // where the next stamp lies on the next segment
  float mWidth = 0.0f;        // reached at the end of the last segment
  float mAlpha = kNoAlpha;    // likewise; below 0: none yet
  float mTiltBlend = 0.0f;    // of the last segment
  Vector2<float> mLastStamp;  // of the last segment that placed one
  float mLastStampAlpha = 0.0f;
};

}  // namespace Qelt
