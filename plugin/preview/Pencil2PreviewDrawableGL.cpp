#include "preview/Pencil2PreviewDrawableGL.h"

#include <new>

#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "render/Posting.h"
#include "stroke/input/SampleSources.h"

namespace Qelt {

Pencil2PreviewDrawableGL::Pencil2PreviewDrawableGL(Pencil2Data* penData, PenGLDataManager* manager)
    : PenPreviewDrawableGL(manager),
      mPenData(penData),
      mRenderDrawable(new (std::nothrow) RenderDrawable(manager)),
      mPen(penData, manager, mRenderDrawable) {
  setDrawableRT(mRenderDrawable);
}

Pencil2PreviewDrawableGL::~Pencil2PreviewDrawableGL() {
  destroy();
}

bool Pencil2PreviewDrawableGL::Draw(const MotionEvent* event, RectF* rect) {
  if (!areGiven(event, rect) || !canDraw()) return false;
  mPen.beginCall();

  Version::ReturnGuard guard(mRenderDrawable, mCanvas, mRenderDrawable->unclaimedBatch());
  const bool result = mPen.draw(*event, rect);
  report(guard, *rect);
  return result;
}

bool Pencil2PreviewDrawableGL::RedrawPen(const MotionEvent* event, RectF* rect) {
  mPen.takeSize();
  if (!areGiven(event, rect) || !canDraw()) return false;
  mPen.beginCall();
  IGLMsgQueue* queue = queueOf(mDataManager);
  postRedrawState(queue, mRenderDrawable);
  postPenData(queue, mRenderDrawable, settings().size(), settings().color());

  Version::ReturnGuard guard(mRenderDrawable, mCanvas, mRenderDrawable->unclaimedBatch());
  const Smoothing smoothing = settings().smoothing();
  bool result = mPen.replay(sourceOf(*event), rect, smoothing);
  if (smoothing == Smoothing::Curve) {
    mPen.extendRectByStrokeWidthGL(rect);
    result = true;  // Kept: whatever the replay returned; the straight one's result counts
  }
  report(guard, *rect);
  return result;
}

bool Pencil2PreviewDrawableGL::RedrawPen(const List*, RectF*) {
  return true;
}

bool Pencil2PreviewDrawableGL::canDraw() const {
  return mRenderDrawable != nullptr && mCanvas != nullptr && settings().exist();
}

// Passes the call's rectangle, stroke units, to the guard, which has the batch drawn into the tiles that it
// meets, and to the render drawable.
void Pencil2PreviewDrawableGL::report(Version::ReturnGuard& guard, const RectF& rect) {
  guard.setRect(rect);
  postRect(queueOf(mDataManager), mRenderDrawable, rect);
}

}  // namespace Qelt
