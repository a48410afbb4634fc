#include "preview/Pencil2PreviewDrawableGL.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <new>

#include "base/Error.h"
#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "log/Log.h"
#include "render/Posting.h"
#include "stroke/StrokeRules.h"
#include "stroke/parts/SampleSources.h"
#include "stroke/parts/StampWalk.h"

namespace Qelt {
namespace {

constexpr const PreviewProfile& kProfile = PreviewVersion::profile;
constexpr SampleCleaner kCleaner{kProfile.unknownPressure, kProfile.tiltCap};
constexpr float kNoAlpha = -1.0f;
constexpr float kGrowth = 1.0f;  // stroke units around what a call changed

}  // namespace

Pencil2PreviewDrawableGL::Pencil2PreviewDrawableGL(Pencil2Data* penData, PenGLDataManager* manager)
    : PenPreviewDrawableGL(manager), mPenData(penData), mRender(new (std::nothrow) RenderDrawable(manager)) {
  setDrawableRT(mRender);
}

Pencil2PreviewDrawableGL::~Pencil2PreviewDrawableGL() {
  destroy();
}

bool Pencil2PreviewDrawableGL::Draw(const MotionEvent* event, RectF* rect) {
  if (event == nullptr || rect == nullptr) {
    Error::SetError(Error::kInvalidArgument);
    return false;
  }
  if (!canDraw()) return false;
  mLimits.beginCall();

  Version::ReturnGuard guard(mRender, mCanvas, mRender->unclaimedBatch());
  const bool result = drawLive(*event, *this, mState, rect, settings().smoothing(), kGrowth);
  guard.setRect(*rect);
  postRect(queueOf(mDataManager), mRender, *rect);
  return result;
}

bool Pencil2PreviewDrawableGL::RedrawPen(const MotionEvent* event, RectF* rect) {
  takeSize();
  if (event == nullptr || rect == nullptr) {
    Error::SetError(Error::kInvalidArgument);
    return false;
  }
  if (!canDraw()) return false;
  mLimits.beginCall();
  IGLMsgQueue* queue = queueOf(mDataManager);
  postRedrawState(queue, mRender);
  postPenData(queue, mRender, settings().size(), settings().color());

  Version::ReturnGuard guard(mRender, mCanvas, mRender->unclaimedBatch());
  const Smoothing smoothing = settings().smoothing();
  bool result = replay(EventSource(*event), *this, rect, smoothing, kGrowth);
  if (smoothing == Smoothing::Curve) {
    rect->IncreaseRect(kGrowth);
    result = true;  // Kept: whatever the replay answered; the straight one's answer counts
  }
  guard.setRect(*rect);
  postRect(queue, mRender, *rect);
  return result;
}

bool Pencil2PreviewDrawableGL::RedrawPen(const List*, RectF*) {
  return true;
}

SampleCleaner Pencil2PreviewDrawableGL::cleaner() const {
  return kCleaner;
}

void Pencil2PreviewDrawableGL::beginLive(const PenSample& start, bool coarseTool, Smoothing) {
  takeSize();
  IGLMsgQueue* queue = queueOf(mDataManager);
  postStartPoint(queue, mRender, start.at);
  restartMoves(coarseTool);
  begin(start);
  postPenData(queue, mRender, settings().size(), settings().color());
}

void Pencil2PreviewDrawableGL::beginMove(const MotionEvent& event) {
  const bool spaced = settings().smoothing() == Smoothing::Curve && mRepeatDistance > 0.0f;
  if (spaced) mRender->reserve(stampsOfMove(event, mPath, mRepeatDistance));
}

void Pencil2PreviewDrawableGL::restartMoves(bool coarseTool) {
  mMoves.restart(coarseTool ? kProfile.touchSkipDistance : mMoves.minimumMove());
}

void Pencil2PreviewDrawableGL::beginReplay(const PenSample& start, Smoothing smoothing) {
  // Kept: a straight replay posts no start point; the grain stays where the stroke before it had it.
  if (smoothing == Smoothing::Curve) postStartPoint(queueOf(mDataManager), mRender, start.at);
  begin(start);
}

void Pencil2PreviewDrawableGL::forgetAlpha() {
  mAlpha = kNoAlpha;
}

bool Pencil2PreviewDrawableGL::drawLine(const PenSample& sample, RectF* rect, Smoothing smoothing) {
  if (smoothing == Smoothing::Curve &&
      !hasSpacing("Pencil2PreviewDrawableGL::drawLine, mRepeatDistance is a wrong value(%f).")) {
    return false;
  }
  if (!mMoves.accepts(mPath.last(), sample.at)) return false;
  mFirstSegment = false;
  const float length = mPath.extend(sample.at, smoothing);
  mAttitude.push(sample.tilt, sample.orientation);
  const bool placed = settings().hasUsableSize() && placeSegment(length, sample.pressure, rect, smoothing);
  mPath.setLast(sample.at);
  return placed;
}

bool Pencil2PreviewDrawableGL::endPen(const MotionEvent& event, RectF* rect, Smoothing smoothing) {
  // Kept: the message names another class.
  if (smoothing == Smoothing::Curve &&
      !hasSpacing("Pencil3GL::EndPen, mRepeatDistance is a wrong value(%f).")) {
    return false;
  }
  const PenSample sample = endSample(event, kCleaner, mPath, kGrowth, rect);
  mAttitude.push(sample.tilt, sample.orientation);
  if (!settings().hasUsableSize()) return true;

  if (mFirstSegment) {
    placeTap(sample.pressure, rect);
  } else if (isUsable(sample.at)) {
    placeSegment(mPath.close(sample.at, smoothing), sample.pressure, rect, smoothing);
  }
  return true;
}

bool Pencil2PreviewDrawableGL::canDraw() const {
  return mRender != nullptr && mCanvas != nullptr && settings().exist();
}

void Pencil2PreviewDrawableGL::takeSize() {
  mRepeatDistance = settings().size() * kProfile.spacingPerSize;
  mMoves.setMinimumMove(settings().size() / 5.0f);
}

void Pencil2PreviewDrawableGL::begin(const PenSample& start) {
  mPath.start(start.at);
  mWidth = settings().size();
  mAlpha = kNoAlpha;  // no fade-in, and nothing of the stroke before
  mCarried = mRepeatDistance;
  mFirstSegment = true;
  mAttitude.fill(start.tilt, start.orientation);
  mStamps.restart();
  mPatternShift.restart();
  mLimits.beginStroke();
}

bool Pencil2PreviewDrawableGL::hasSpacing(const char* message) const {
  if (!(mRepeatDistance <= 0.0f)) return true;
  __android_log_print(kLogError, kLogTag, message, static_cast<double>(mRepeatDistance));
  return false;
}

bool Pencil2PreviewDrawableGL::placeSegment(float length, float pressure, RectF* rect, Smoothing smoothing) {
  const float size = settings().size();
  const float alpha = kProfile.pressureAlpha(pressure, rules::colorAlpha(settings().color()), size);
  if (mAlpha < 0.0f) mAlpha = alpha;
  const float blend = kProfile.tiltBlend(mAttitude.meanTilt());
  const float width = kProfile.pointSize(size, blend);
  beginWidth(size);

  // Kept: on curves the walk decides how many stamps there are, and the ramps may run past their targets,
  // which are restored below.
  const int count = kProfile.stampCount(length, size);
  const SegmentRamps ramps{mWidth, mAlpha, rules::rampStep(mWidth, width, count),
                           rules::rampStep(mAlpha, alpha, count)};
  const bool curve = smoothing == Smoothing::Curve;
  const int most = mLimits.left();
  const int expected =
      curve ? spacedStamps(mCarried, mRepeatDistance, length) : std::min(count, kMostStampsPerSegment);
  Run::Appender appender(*mRender, std::min(expected, most));
  Run run(appender, ramps, blend, stampDirection(mAttitude.meanOrientation()), mStamps);
  const WalkResult walk = curve ? walkSpaced(mPath.path(), mCarried, mRepeatDistance, length, most, run)
                                : walkEvenly(mPath.path(), count, length, most, run);
  if (curve) mCarried = walk.carry;
  run.finish(mPath.path(), rect);
  mLimits.note(walk, Version::name, length);

  const bool placed = run.counter().count() != mStamps.count();
  mStamps = run.counter();
  mWidth = width;
  mAlpha = alpha;
  mPatternShift.countSegment();
  return placed;
}

void Pencil2PreviewDrawableGL::placeTap(float pressure, RectF* rect) {
  const float alpha =
      kProfile.pressureAlpha(pressure, rules::colorAlpha(settings().color()), settings().size());
  if (mAlpha < 0.0f) mAlpha = alpha;
  beginWidth(settings().size());
  const float blend = kProfile.tiltBlend(mAttitude.meanTilt());
  Run::Appender appender(*mRender, 1);
  Run run(appender, {kProfile.pointSize(mWidth, blend), alpha, 0.0f, 0.0f}, blend,
          stampDirection(mAttitude.meanOrientation()), mStamps);
  run({mPath.last().x, mPath.last().y});
  run.finish(mPath.path(), rect);
  mStamps = run.counter();
}

// A stroke that began at a size that is none begins at the first one that is.
void Pencil2PreviewDrawableGL::beginWidth(float size) {
  if (!PenSettings::isUsableSize(mWidth)) mWidth = size;
}

}  // namespace Qelt
