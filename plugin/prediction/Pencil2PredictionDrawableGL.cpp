#include "prediction/Pencil2PredictionDrawableGL.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <new>

#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "graphics/ISPPenCanvas.h"
#include "pen/Pencil2Data.h"
#include "render/Posting.h"
#include "stroke/input/PenSample.h"

namespace Qelt {

Pencil2PredictionDrawableGL::Pencil2PredictionDrawableGL(Pencil2Data* penData, PenGLDataManager* manager)
    : PenPredictionDrawableGL(manager),
      mPenData(penData),
      mRenderDrawable(new (std::nothrow) RenderDrawable(manager)),
      mPlacer(mRenderDrawable) {
  setDrawableRT(mRenderDrawable);
}

Pencil2PredictionDrawableGL::~Pencil2PredictionDrawableGL() {
  destroy();
}

void Pencil2PredictionDrawableGL::SetOpacity(float opacity) {
  if (mRenderDrawable != nullptr && std::isfinite(opacity)) mRenderDrawable->SetOpacity(opacity);
}

bool Pencil2PredictionDrawableGL::Draw(const MotionEvent* event, RectF* rect) {
  if (!areGiven(event, rect)) return false;
  if (mRenderDrawable == nullptr || mCanvas == nullptr) return false;
  if (!settings().exist() || !mPenData->mHasLastStroke) return false;

  Version::ReturnGuard guard(mRenderDrawable, mCanvas, mRenderDrawable->unclaimedBatch());
  mRenderDrawable->SetInverseScale(getInverseScale());
  const bool result = event->GetAction() == kActionMove && startPen() && movePen(*event, rect);
  guard.setRect(*rect);
  postRect(queueOf(mDataManager), mRenderDrawable, *rect);
  mPenData->mHasLastStroke = false;
  return result;
}

// Kept: before the live stroke's first stamp the record still holds the last stamp of the stroke before it.
bool Pencil2PredictionDrawableGL::startPen() {
  const Pencil2Data& live = *mPenData;
  const PointF lastStamp{live.mLastStampX, live.mLastStampY}, last{live.mLastX, live.mLastY};
  mPlacer.beginCall();
  mPlacer.begin(std::max<std::int32_t>(live.mStampCount, 0));
  mPlacer.setCarried(Version::profile.repeatDistance);
  mPlacer.path().start(lastStamp, last);
  mLook = {.width = live.mLastWidth,
           .widthStep = 0.0f,
           .alpha = live.mLastAlpha,
           .alphaStep = 0.0f,
           .tiltBlend = live.mTiltBlend,
           .direction = stampDirection(live.mLastOrientation)};

  IGLMsgQueue* queue = queueOf(mDataManager);
  postStartPoint(queue, mRenderDrawable, {live.mStartX, live.mStartY});
  postPenData(queue, mRenderDrawable, settings().size(), settings().color());
  return settings().hasUsableSize() && isUsable(lastStamp) && isUsable(last) &&
         std::isfinite(live.mLastWidth) && live.mLastWidth > 0.0f && std::isfinite(live.mLastAlpha) &&
         std::isfinite(live.mLastOrientation) && std::isfinite(live.mTiltBlend);
}

bool Pencil2PredictionDrawableGL::movePen(const MotionEvent& event, RectF* rect) {
  mPlacer.path().setToJoint(rect);
  const int history = event.GetHistorySize();
  for (int i = 0; i < history; ++i) {
    drawLine({event.GetHistoricalX(i), event.GetHistoricalY(i)}, false, rect);
  }
  drawLine({event.GetX(0), event.GetY(0)}, true, rect);
  rect->IncreaseRect(1.0f);
  return true;
}

void Pencil2PredictionDrawableGL::drawLine(PointF at, bool last, RectF* rect) {
  if (!isUsable(at)) return;
  SegmentPath& path = mPlacer.path();
  const float length = last ? path.close(at, Smoothing::Curve) : path.extend(at, Smoothing::Curve);
  path.setLast(at);
  mPlacer.placeSpaced(length, Version::profile.repeatDistance, mLook, rect);
}

Vector2<float> Pencil2PredictionDrawableGL::getInverseScale() {
  return mViewScale.inverse(mCanvas->GetMatrix());
}

}  // namespace Qelt
