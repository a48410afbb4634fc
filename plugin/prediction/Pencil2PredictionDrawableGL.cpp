#include "prediction/Pencil2PredictionDrawableGL.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <new>

#include "base/Error.h"
#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "graphics/ISPPenCanvas.h"
#include "pen/Pencil2Data.h"
#include "render/Posting.h"
#include "stroke/parts/PenSample.h"
#include "stroke/parts/StampRun.h"
#include "stroke/parts/StampWalk.h"

namespace Qelt {
namespace {

constexpr const PredictionProfile& kProfile = PredictionVersion::profile;
constexpr float kGrowth = 1.0f;  // stroke units around what a call changed

}  // namespace

Pencil2PredictionDrawableGL::Pencil2PredictionDrawableGL(Pencil2Data* penData, PenGLDataManager* manager)
    : PenPredictionDrawableGL(manager),
      mPenData(penData),
      mRender(new (std::nothrow) RenderDrawable(manager)) {
  setDrawableRT(mRender);
}

Pencil2PredictionDrawableGL::~Pencil2PredictionDrawableGL() {
  destroy();
}

void Pencil2PredictionDrawableGL::SetOpacity(float opacity) {
  if (mRender != nullptr && std::isfinite(opacity)) mRender->SetOpacity(opacity);
}

bool Pencil2PredictionDrawableGL::Draw(const MotionEvent* event, RectF* rect) {
  if (event == nullptr || rect == nullptr) {
    Error::SetError(Error::kInvalidArgument);
    return false;
  }
  if (mRender == nullptr || mCanvas == nullptr) return false;
  if (!settings().exist() || !mPenData->mHasLastStroke) return false;

  Version::ReturnGuard guard(mRender, mCanvas, mRender->unclaimedBatch());
  mRender->SetInverseScale(getInverseScale());
  const bool result = event->GetAction() == kActionMove && startPen() && movePen(*event, rect);
  guard.setRect(*rect);
  postRect(queueOf(mDataManager), mRender, *rect);
  mPenData->mHasLastStroke = false;
  return result;
}

// Kept: before the live stroke's first stamp the record still holds the last stamp of the stroke before it.
bool Pencil2PredictionDrawableGL::startPen() {
  const Pencil2Data& live = *mPenData;
  mPath.setMid({live.mLastStampX, live.mLastStampY});
  mPath.setLast({live.mLastX, live.mLastY});
  mWidth = live.mLastWidth;
  mAlpha = live.mLastAlpha;
  mOrientation = live.mLastOrientation;
  mStamps.restart(std::max<std::int32_t>(live.mStampCount, 0));
  mTiltBlend = live.mTiltBlend;
  mCarried = kProfile.stampSpacing;
  mLimits.beginStroke();
  mLimits.beginCall();

  IGLMsgQueue* queue = queueOf(mDataManager);
  postStartPoint(queue, mRender, {live.mStartX, live.mStartY});
  postPenData(queue, mRender, settings().size(), settings().color());
  return settings().hasUsableSize() && isUsable(mPath.mid()) && isUsable(mPath.last()) &&
         std::isfinite(mWidth) && mWidth > 0.0f && std::isfinite(mAlpha) && std::isfinite(mOrientation) &&
         std::isfinite(mTiltBlend);
}

bool Pencil2PredictionDrawableGL::movePen(const MotionEvent& event, RectF* rect) {
  mPath.setToJoint(rect);
  const int history = event.GetHistorySize();
  for (int i = 0; i < history; ++i) {
    drawLine({event.GetHistoricalX(i), event.GetHistoricalY(i)}, false, rect);
  }
  drawLine({event.GetX(0), event.GetY(0)}, true, rect);
  rect->IncreaseRect(kGrowth);
  return true;
}

bool Pencil2PredictionDrawableGL::drawLine(PointF at, bool last, RectF* rect) {
  if (!isUsable(at)) return false;
  const float length = last ? mPath.close(at, Smoothing::Curve) : mPath.extend(at, Smoothing::Curve);
  mPath.setLast(at);

  using Run = StampRun<Version>;
  const int most = mLimits.left();
  Run::Appender appender(*mRender, std::min(spacedStamps(mCarried, kProfile.stampSpacing, length), most));
  Run run(appender, {mWidth, mAlpha, 0.0f, 0.0f}, mTiltBlend, stampDirection(mOrientation), mStamps);
  const WalkResult walk = walkSpaced(mPath.path(), mCarried, kProfile.stampSpacing, length, most, run);
  run.finish(mPath.path(), rect);
  mCarried = walk.carry;
  mLimits.note(walk, Version::name, length);
  const bool placed = run.counter().count() != mStamps.count();
  mStamps = run.counter();
  return placed;
}

Vector2<float> Pencil2PredictionDrawableGL::getInverseScale() {
  return mViewScale.inverse(mCanvas->GetMatrix());
}

}  // namespace Qelt
