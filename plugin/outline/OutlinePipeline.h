#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <new>

#include "base/Error.h"
#include "base/RectF.h"
#include "base/Vector.h"
#include "engine/MotionEvent.h"
#include "graphics/SmPath.h"
#include "model/ObjectStroke.h"
#include "outline/OutlineVersions.h"
#include "outline/Pencil2OutlineDrawableGL.h"
#include "outline/Pencil2OutlineDrawableRTV1.h"
#include "render/Posting.h"
#include "stroke/StrokeRules.h"
#include "stroke/parts/DirtyBox.h"
#include "stroke/parts/LiveInput.h"
#include "stroke/parts/MoveFilter.h"
#include "stroke/parts/PenAttitude.h"
#include "stroke/parts/PenSample.h"
#include "stroke/parts/Replay.h"
#include "stroke/parts/SampleCleaner.h"
#include "stroke/parts/SampleSources.h"
#include "stroke/parts/SegmentPath.h"
#include "stroke/parts/StampLimits.h"
#include "stroke/parts/StampRun.h"
#include "stroke/parts/StampWalk.h"

namespace Qelt {

// The outline drawable of one version: replays a whole stroke at once, as the stroke drawables do, into
// stamps of two streams. `Version` is a row of OutlineVersions.h; what stands here is what no version does
// its own way. Main thread; allocates nothing a stamp.
template <typename Version>
class OutlinePipeline : public Pencil2OutlineDrawableGL {
  static constexpr const OutlineProfile& kProfile = Version::profile;

 public:
  using RenderDrawable = Pencil2OutlineDrawableRTV1;

  OutlinePipeline(Pencil2Data* penData, PenGLDataManager* manager)
      : Pencil2OutlineDrawableGL(penData, manager), mRender(new (std::nothrow) RenderDrawable(manager)) {
    setDrawableRT(mRender);
  }

  ~OutlinePipeline() override { destroy(); }

  // False when memory ran out for the render-thread half.
  bool hasPartner() const { return mRender != nullptr; }

  bool DrawOutline(const MotionEvent* event, RectF* rect) override { return drawChecked(event, rect); }
  bool DrawOutline(const ObjectStroke* stroke, RectF* rect) override { return drawChecked(stroke, rect); }

 private:
  template <typename Source, typename Pen>
  friend bool replay(Source, Pen&, RectF*, Smoothing, float);

  template <typename Input>
  bool drawChecked(const Input* input, RectF* rect) {
    mMoves.setMinimumMove(getSize() / 5.0f);
    if (input == nullptr || rect == nullptr) {
      Error::SetError(Error::kInvalidArgument);
      return false;
    }
    if (mRender == nullptr || mCanvas == nullptr || !settings().exist()) return false;
    mLimits.beginCall();

    // Kept: set at once, not posted; an outline that still waits is drawn in this colour too.
    mRender->SetOutlineColor(static_cast<unsigned int>(GetOutlineColor()));
    const float outlineSize = usableOutlineSize();
    mRender->SetOutlineSize(outlineSize);
    typename Version::ReturnGuard guard(mRender, mCanvas, mRender->unclaimedBatch());
    const Smoothing smoothing = settings().smoothing();
    const bool replayed = replay(sourceOf(*input), *this, rect, smoothing, kStraightGrowth);
    rect->IncreaseRect(outlineSize);
    guard.setRect(*rect);
    postRect(queueOf(mDataManager), mRender, *rect);
    // Kept: true on curves, whatever the replay answered; the straight one's answer counts.
    return smoothing == Smoothing::Curve || replayed;
  }

  // --- What the replay asks for ---

  SampleCleaner cleaner() const { return kCleaner; }

  void restartMoves(bool coarseTool) {
    mMoves.restart(coarseTool ? kProfile.touchSkipDistance : mMoves.minimumMove());
  }

  // Kept: the size reached goes on from one outline to the next; nothing else does.
  void beginReplay(const PenSample& start, Smoothing) {
    mPath.start(start.at);
    mAttitude.fill(start.tilt, start.orientation);
    mFirstSegment = true;
    mLimits.beginStroke();
  }

  // Takes one sample into the outline; true when it placed a stamp.
  bool drawLine(const PenSample& sample, RectF* rect, Smoothing smoothing) {
    if (!mMoves.accepts(mPath.last(), sample.at)) return false;
    mFirstSegment = false;
    const float length = mPath.extend(sample.at, smoothing);
    const float meanOrientation = mAttitude.meanOrientation();
    mAttitude.push(sample.tilt, sample.orientation);

    bool placed = false;
    if (settings().hasUsableSize()) {
      // Kept: a segment too short for its version has moved the mid point, but leaves the last point and the
      // mean orientation where they are.
      if (length < kProfile.shortestSegment) {
        mAttitude.setMeanOrientation(meanOrientation);
        return false;
      }
      placed = placeSegment(length, rect);
      mCurrentSize = targetSize(getSize());
    }
    mPath.setLast(sample.at);
    return placed;
  }

  // Kept: leaves the size reached as it is.
  bool endPen(const MotionEvent& event, RectF* rect, Smoothing smoothing) {
    const PenSample sample = endSample(event, kCleaner, mPath, kEndGrowth, rect);
    mAttitude.push(sample.tilt, sample.orientation);
    if (!settings().hasUsableSize()) return true;

    if (mFirstSegment) {
      placeTap(rect);
    } else if (isUsable(sample.at)) {
      placeSegment(mPath.close(sample.at, smoothing), rect);
    }
    return true;
  }

  static EventSource sourceOf(const MotionEvent& event) { return EventSource(event); }
  static StrokeSource sourceOf(const ObjectStroke& stroke) { return StrokeSource(stroke); }

  // --- Stamps ---

  // The stamps of one segment, their size on its way to the target.
  class Run {
   public:
    Run(RenderDrawable::Appender& appender, float size, float sizeStep, float tiltFactor,
        Vector2<float> direction)
        : mAppender(appender), mSize(size), mSizeStep(sizeStep), mTiltFactor(tiltFactor) {
      mStamp[1] = direction;
    }

    // Kept: the centre is cut to whole numbers; the area is not.
    void operator()(SmPoint at) {
      const float size = kProfile.stampSize(mSize);
      mBox.add(at.x, at.y, size / 2.0f);
      mStamp[0] = {std::trunc(at.x), std::trunc(at.y)};
      mAppender.AddPoint(mStamp, size, mTiltFactor);
      mSize += mSizeStep;
    }

    // Leaves a stamp out, and goes on as if it had been placed.
    void passOver(float) { mSize += mSizeStep; }

    void finish(RectF* rect) {
      mAppender.flush();
      mBox.uniteInto(rect);
    }

   private:
    RenderDrawable::Appender& mAppender;
    float mSize;
    float mSizeStep;
    float mTiltFactor;
    DirtyBox mBox;
    Vector2<float> mStamp[2];  // centre, direction
  };

  // Places the stamps of the path's current segment; true when there was one. Each segment begins with a
  // stamp at its own start; nothing is carried over.
  bool placeSegment(float length, RectF* rect) {
    if (length < kProfile.shortestSegment) return false;
    const float size = getSize();
    const int count = kProfile.stampCount(length, size);
    const float step = rules::rampStep(mCurrentSize, targetSize(size), count);
    const int most = mLimits.left();
    RenderDrawable::Appender appender(*mRender, std::min({count, kMostStampsPerSegment, most}));
    Run run(appender, mCurrentSize, step, tiltFactor(), stampDirection(mAttitude.meanOrientation()));
    const WalkResult walk = walkEvenly(mPath.path(), count, length, most, run);
    run.finish(rect);
    mLimits.note(walk, Version::name, length);
    return walk.stamps > 0;
  }

  // A tap, or a stroke whose moves were all dropped: one stamp where it began.
  void placeTap(RectF* rect) {
    RenderDrawable::Appender appender(*mRender, 1);
    Run run(appender, targetSize(mCurrentSize), 0.0f, tiltFactor(),
            stampDirection(mAttitude.meanOrientation()));
    run({mPath.last().x, mPath.last().y});
    run.finish(rect);
  }

  // What does not fit into a vertex counts as 0.
  float usableOutlineSize() {
    const float size = GetOutlineSize();
    return std::fabs(size) <= kFarthest ? size : 0.0f;
  }

  float tiltFactor() const { return kProfile.tiltFactor(mAttitude.meanTilt()); }
  float targetSize(float size) const { return kProfile.pointSize(size, tiltFactor()); }

  static constexpr SampleCleaner kCleaner{kProfile.unknownPressure, kProfile.tiltCap};
  static constexpr float kStraightGrowth = 5.0f;  // stroke units around a straight replay
  static constexpr float kEndGrowth = 1.0f;       // and around the end

  RenderDrawable* mRender;  // owned by the host's base; null when its allocation failed
  SegmentPath mPath;
  MoveFilter mMoves;
  PenAttitude<Version::tiltWindow, Version::orientationWindow> mAttitude;
  StampLimits mLimits;
  bool mFirstSegment = true;  // no segment since the stroke began
  float mCurrentSize = 0.0f;  // reached at the end of the last segment of a move
};

}  // namespace Qelt
