#pragma once

#include <concepts>
#include <utility>

#include "base/Error.h"
#include "base/PointF.h"
#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "log/Log.h"
#include "pen/Pencil2Data.h"
#include "render/Posting.h"
#include "stroke/StrokeRules.h"
#include "stroke/StrokeVersions.h"
#include "stroke/input/LiveInput.h"
#include "stroke/input/MoveFilter.h"
#include "stroke/input/PenAttitude.h"
#include "stroke/input/PenSample.h"
#include "stroke/input/PenSettings.h"
#include "stroke/input/SampleCleaner.h"
#include "stroke/input/SampleSources.h"
#include "stroke/placing/PatternShift.h"
#include "stroke/placing/SegmentPlacer.h"
#include "stroke/placing/StampRun.h"

namespace Qelt {

// What a stamp pen takes from a row besides what placing stamps takes: how samples are cleaned and filtered,
// over how many of them tilt and orientation are averaged, the rules that turn them into width and number of
// stamps, and how the drawable's kind begins, ends and reports a stroke.
template <typename Version>
concept PenRow = StampRow<Version> && requires(float x) {
  { Version::tiltWindow } -> std::convertible_to<int>;
  { Version::orientationWindow } -> std::convertible_to<int>;
  { Version::profile.unknownPressure } -> std::convertible_to<float>;
  { Version::profile.touchSkipDistance } -> std::convertible_to<float>;
  { Version::profile.tiltCap } -> std::convertible_to<float>;
  { Version::profile.adjustTilt(x) } -> std::same_as<float>;
  { Version::profile.getPointSize(x, x) } -> std::same_as<float>;
  { Version::profile.placement } -> std::convertible_to<Placement>;
  { Version::profile.getRepeat(x, x) } -> std::same_as<int>;
  { Version::profile.isOutline } -> std::convertible_to<bool>;
  { Version::profile.shiftsPattern } -> std::convertible_to<bool>;
  { Version::profile.publishes } -> std::convertible_to<bool>;
  { Version::profile.growth } -> std::convertible_to<float>;
  { Version::profile.endGrowth } -> std::convertible_to<float>;
  { Version::profile.closeGrowth } -> std::convertible_to<float>;
  { Version::profile.wrongDistanceInDrawLine } -> std::convertible_to<const char*>;
  { Version::profile.wrongDistanceInEndPen } -> std::convertible_to<const char*>;
} &&(Version::profile.isOutline ||
     requires(float x) {
       { Version::profile.getPressureAlpha(x, x, x) } -> std::same_as<float>;
       { Version::profile.startAlpha } -> std::convertible_to<float>;
       { Version::profile.postsStraightStarts } -> std::convertible_to<bool>;
       { Version::profile.restartsPatternShift } -> std::convertible_to<bool>;
     }) &&
    (Version::profile.placement == Placement::Even || requires(float x) {
      { Version::profile.getRepeatDistance(x) } -> std::same_as<float>;
    });

// The stamp pen of a stroke, outline or preview drawable: turns a live event, or a whole stroke, into stamps
// in the render drawable's batch. `Version` is the drawable's row and says all that differs; what stands here
// no version does its own way.
//
// Segment by segment: the sample is cleaned, filtered by distance, and joined to the path; the attitude of
// the pen is averaged; then stamps are placed while width and alpha move from the last segment's targets to
// this one's.
//
// Lives as long as its drawable. Each call of the drawable begins with `beginCall`. Main thread; allocates
// only where the batch grows, and then throws std::bad_alloc.
template <PenRow Version>
class StampPen {
  static constexpr const auto& kProfile = Version::profile;

 public:
  using RenderDrawable = typename Version::RenderDrawable;

  // All three are borrowed. Any may be null as long as nothing is drawn.
  StampPen(Pencil2Data* penData, PenGLDataManager* manager, RenderDrawable* renderDrawable)
      : mPenData(penData), mDataManager(manager), mRenderDrawable(renderDrawable), mPlacer(renderDrawable) {}

  void beginCall() { mPlacer.beginCall(); }

  // Works out what follows from the pen size: the shortest move, and the distance from stamp to stamp.
  void takeSize() {
    mMoves.setMinimumMove(getSize() / 5.0f);
    if constexpr (kProfile.placement != Placement::Even) {
      mRepeatDistance = kProfile.getRepeatDistance(getSize());
    }
  }

  // Draws one live event. Sets `rect` to the rectangle of what changed; leaves it as it is when the event is
  // ignored.
  //
  // Moves and ups count only after a down. A down begins anew at any time; a cancel changes nothing, so that
  // the next move goes on with the stroke.
  bool draw(const MotionEvent& event, RectF* rect) {
    const Smoothing smoothing = settings().smoothing();
    switch (event.GetAction()) {
      case kActionDown:
        return startPen(event, rect, smoothing);
      case kActionMove:
        return mDown && movePen(event, rect, smoothing);
      case kActionUp:
        if (!std::exchange(mDown, false)) return false;
        mAlpha = kNoAlpha;  // the closing segment has no ramp
        return endPen(event, rect, smoothing);
      default:
        return false;
    }
  }

  // Draws a whole stroke. `rect` becomes the rectangle of its stamps. A straight replay takes every point
  // into it and grows it; after a curved one the caller grows it. False, with the host's error set, when
  // there is no point to start from.
  template <SampleSource Source>
  bool replay(Source source, RectF* rect, Smoothing smoothing) {
    restartMoves(source.isCoarse());
    const int first = firstUsablePoint(source);
    if (first < 0) {
      Error::SetError(Error::kInvalidArgument);
      return false;
    }
    const auto sample = [&source](int i) {
      return PenSample{source.point(i), kCleaner.pressure(source.pressure(i), source.toolType()),
                       source.tilt(i, kCleaner), SampleCleaner::orientation(source.orientation(i))};
    };

    source.prepare(kCleaner);
    const PenSample start = sample(first);
    if constexpr (!kProfile.isOutline) {
      // Kept: a straight replay posts no start point; the grain stays where the stroke before it had it.
      if (smoothing == Smoothing::Curve) postStartPoint(queue(), mRenderDrawable, start.at);
    }
    begin(start);
    rect->Set(start.at.x, start.at.y, start.at.x, start.at.y);

    const int count = source.count();
    for (int i = first + 1; i < count; ++i) {
      const PenSample next = sample(i);
      drawLine(next, rect, smoothing);
      if (smoothing == Smoothing::Straight && isUsable(next.at)) rect->MakeRect(&next.at);
    }

    MotionEvent up = source.upEvent(kCleaner);  // not const: the end writes its corrections into it
    RectF endRect;
    if (endPen(up, &endRect, smoothing)) rect->Union(endRect);
    if (smoothing == Smoothing::Straight) extendRectByStrokeWidthGL(rect);
    return true;
  }

  // Grows the rectangle of a move or a replay. Stroke units.
  static void extendRectByStrokeWidthGL(RectF* rect) { rect->IncreaseRect(kProfile.growth); }

 private:
  // --- Live events ---

  // A down at a point that is not usable starts nothing.
  bool startPen(const MotionEvent& event, RectF* rect, Smoothing smoothing) {
    const PointF at{event.GetX(0), event.GetY(0)};
    if (!isUsable(at)) return false;
    mDown = true;
    substituteTouchPressure(event, kCleaner);
    const PenSample start = takeCurrentSample(event, kCleaner);
    takeSize();
    restartMoves(isCoarseTool(event.GetToolType(0), event.GetSource()));
    begin(start);
    const bool curve = smoothing == Smoothing::Curve;
    if (curve || kProfile.postsStraightStarts) postStartPoint(queue(), mRenderDrawable, start.at);
    if constexpr (kProfile.publishes) {
      if (curve) publishStart();
    }
    postPenData(queue(), mRenderDrawable, getSize(), settings().color());
    rect->Set(at.x, at.y, at.x, at.y);
    return true;
  }

  bool movePen(const MotionEvent& event, RectF* rect, Smoothing smoothing) {
    path().setToJoint(rect);
    if (isSpaced(smoothing) && mRepeatDistance > 0.0f) {
      mRenderDrawable->reserve(stampsOfMove(event, path().mid(), path().last(), mRepeatDistance));
    }
    takeMove(event, kCleaner, [&](const PenSample& sample) { drawLine(sample, rect, smoothing); });
    extendRectByStrokeWidthGL(rect);
    return true;
  }

  // Ends a stroke at the event's point. If the point is not usable, the closing segment is left out. `rect`
  // becomes the rectangle of the end.
  bool endPen(const MotionEvent& event, RectF* rect, Smoothing smoothing) {
    if (!hasRepeatDistance(smoothing, kProfile.wrongDistanceInEndPen)) return false;
    substituteTouchPressure(event, kCleaner);
    const PenSample sample = takeCurrentSample(event, kCleaner);
    path().setToJoint(rect);
    if (isUsable(sample.at)) rect->MakeRect(&sample.at);
    rect->IncreaseRect(kProfile.endGrowth);
    mAttitude.push(sample.tilt, sample.orientation);
    if (!settings().hasUsableSize()) return true;

    if (mFirstSegment) {
      placeTap(sample.pressure, rect);
    } else if (isUsable(sample.at)) {
      const float length = path().close(sample.at, smoothing);
      const float reached = mWidth;
      if (const int repeat = getRepeat(length); !isTooShort(repeat)) {
        placeSegment(length, repeat, sample.pressure, rect, smoothing);
      }
      // Kept: the closing segment leaves the width that an outline has reached as it is.
      if constexpr (kProfile.isOutline) mWidth = reached;
      if constexpr (kProfile.closeGrowth > 0.0f) rect->IncreaseRect(kProfile.closeGrowth);
    }
    return true;
  }

  // --- Segments ---

  void restartMoves(bool coarseTool) {
    mMoves.restart(coarseTool ? kProfile.touchSkipDistance : mMoves.minimumMove());
  }

  // Resets what a stroke carries along.
  void begin(const PenSample& start) {
    path().start(start.at);
    mPlacer.begin();
    mPlacer.setCarried(mRepeatDistance);
    mAttitude.fill(start.tilt, start.orientation);
    mFirstSegment = true;
    // Kept: the width reached goes on from one outline to the next.
    if constexpr (!kProfile.isOutline) {
      mWidth = getSize();
      mAlpha = kProfile.startAlpha;
      if constexpr (kProfile.restartsPatternShift) mPatternShift.restart();
    }
  }

  // Takes one sample into the stroke. True when it placed at least one stamp, or left one out beyond the
  // call's bound.
  bool drawLine(const PenSample& sample, RectF* rect, Smoothing smoothing) {
    if (!hasRepeatDistance(smoothing, kProfile.wrongDistanceInDrawLine)) return false;
    if (!mMoves.accepts(path().last(), sample.at)) return false;
    mFirstSegment = false;
    const float length = path().extend(sample.at, smoothing);
    [[maybe_unused]] const float meanOrientation = mAttitude.meanOrientation();
    mAttitude.push(sample.tilt, sample.orientation);

    bool placed = false;
    if (settings().hasUsableSize()) {
      const int repeat = getRepeat(length);
      if (isTooShort(repeat)) {
        // Kept: the segment has moved the mid point all the same, and leaves the last point where it is; of
        // an outline it leaves the mean orientation as well.
        if constexpr (kProfile.isOutline) mAttitude.setMeanOrientation(meanOrientation);
        return false;
      }
      placed = placeSegment(length, repeat, sample.pressure, rect, smoothing);
    }
    path().setLast(sample.at);
    if constexpr (kProfile.publishes) {
      if (smoothing == Smoothing::Curve) publishSegment(placed);
    }
    return placed;
  }

  // How many steps width and alpha take along a segment. Where stamps are placed evenly, also how many.
  int getRepeat(float length) const {
    if constexpr (kProfile.placement == Placement::Spaced) {
      // Worked out apart from the walk, whose number of stamps may differ from it by one.
      return rules::incremented(rules::saturatedCount((length - mPlacer.carried()) / mRepeatDistance));
    } else {
      return kProfile.getRepeat(length, getSize());
    }
  }

  static bool isTooShort(int repeat) { return kProfile.placement != Placement::Spaced && repeat == 0; }

  static bool isSpaced(Smoothing smoothing) {
    return kProfile.placement == Placement::Spaced ||
           (kProfile.placement == Placement::SpacedOnCurves && smoothing == Smoothing::Curve);
  }

  // False, after logging the message, where stamps are spaced but the distance is 0 or negative, as in a
  // stroke begun at size 0.
  bool hasRepeatDistance(Smoothing smoothing, const char* message) const {
    if (!isSpaced(smoothing) || !(mRepeatDistance <= 0.0f)) return true;
    if (message != nullptr) {
      __android_log_print(kLogError, kLogTag, message, static_cast<double>(mRepeatDistance));
    }
    return false;
  }

  // Places the stamps of the path's current segment and returns what the placer returns. Afterwards width and
  // alpha are at their targets, whatever the ramps reached. (Kept: where stamps are spaced and getRepeat
  // counts the steps, the ramps may run past the targets.)
  bool placeSegment(float length, int repeat, float pressure, RectF* rect, Smoothing smoothing) {
    const float alpha = targetAlpha(pressure);
    const float blend = kProfile.adjustTilt(mAttitude.meanTilt());
    const float width = kProfile.getPointSize(getSize(), blend);
    beginWidth();
    const SegmentLook look = lookOf(mWidth, mAlpha, rules::getDp(mWidth, width, repeat),
                                    rules::getDp(mAlpha, alpha, repeat), blend);
    const bool placed = isSpaced(smoothing) ? mPlacer.placeSpaced(length, mRepeatDistance, look, rect)
                                            : mPlacer.placeEvenly(length, repeat, look, rect);
    mWidth = width;
    mAlpha = alpha;
    mTiltBlend = blend;
    if constexpr (kProfile.shiftsPattern) mPatternShift.countSegment();
    return placed;
  }

  // A tap, or a stroke whose moves were all dropped: one stamp where the pen went down.
  void placeTap(float pressure, RectF* rect) {
    const float alpha = targetAlpha(pressure);
    beginWidth();
    const float blend = kProfile.adjustTilt(mAttitude.meanTilt());
    mPlacer.placeOne(lookOf(kProfile.getPointSize(mWidth, blend), alpha, 0.0f, 0.0f, blend), rect);
  }

  SegmentLook lookOf(float width, float alpha, float widthStep, float alphaStep, float blend) const {
    return {width, widthStep, alpha, alphaStep, blend, stampDirection(mAttitude.meanOrientation())};
  }

  // The alpha that the pressure asks for. A stroke that has none yet begins with it.
  float targetAlpha([[maybe_unused]] float pressure) {
    if constexpr (kProfile.isOutline) {
      return mAlpha;  // an outline's stamps have none
    } else {
      const float alpha = kProfile.getPressureAlpha(pressure, rules::getAlpha(settings().color()), getSize());
      if (mAlpha < 0.0f) mAlpha = alpha;
      return alpha;
    }
  }

  // A stroke that began at a size that is not usable goes on as if it had begun at the first one that is.
  void beginWidth() {
    if constexpr (!kProfile.isOutline) {
      if (isUsableScale(mWidth)) return;
      mWidth = getSize();
    }
  }

  // --- What the prediction continues from ---

  void publishStart() {
    mPenData->mStartX = path().last().x;
    mPenData->mStartY = path().last().y;
    mPenData->mLastX = path().last().x;
    mPenData->mLastY = path().last().y;
    mPenData->mLastWidth = mWidth;
    mPenData->mLastOrientation = mAttitude.meanOrientation();
    mPenData->mStampCount = 0;
    mPenData->mTiltBlend = 0.0f;
    mPenData->mHasLastStroke = true;
  }

  void publishSegment(bool placed) {
    if (placed) {
      mPenData->mLastStampX = mPlacer.lastStamp().x;
      mPenData->mLastStampY = mPlacer.lastStamp().y;
      mPenData->mLastAlpha = mPlacer.lastAlpha();
    }
    mPenData->mLastX = path().last().x;
    mPenData->mLastY = path().last().y;
    mPenData->mLastWidth = mWidth;
    mPenData->mLastOrientation = mAttitude.meanOrientation();
    mPenData->mTiltBlend = mTiltBlend;
    mPenData->mStampCount = mPlacer.stamps();
    mPenData->mHasLastStroke = true;
  }

  PenSettings settings() const { return PenSettings(mPenData); }
  float getSize() const { return settings().size(); }
  IGLMsgQueue* queue() const { return queueOf(mDataManager); }
  SegmentPath& path() { return mPlacer.path(); }

  static constexpr SampleCleaner kCleaner{kProfile.unknownPressure, kProfile.tiltCap};
  static constexpr float kNoAlpha = -1.0f;

  Pencil2Data* mPenData;
  PenGLDataManager* mDataManager;
  RenderDrawable* mRenderDrawable;
  bool mDown = false;  // whether the pen is down
  MoveFilter mMoves;
  PenAttitude<Version::tiltWindow, Version::orientationWindow> mAttitude;
  SegmentPlacer<Version> mPlacer;
  PatternShift mPatternShift;
  bool mFirstSegment = true;     // no segment since the pen went down
  float mRepeatDistance = 0.0f;  // from stamp to stamp where they are spaced, stroke units
  float mWidth = 0.0f;           // reached at the end of the last segment
  float mAlpha = kNoAlpha;       // likewise; below 0 while there is none
  float mTiltBlend = 0.0f;       // of the last segment
};

}  // namespace Qelt
