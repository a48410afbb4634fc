#include "pencommon/PenDrawableGL.h"

#include "desktop/base/Log.h"
#include "desktop/gl/CallTask.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/PenCanvas.h"
#include "graphics/ISPPenCanvas.h"
#include "pencommon/PenDrawableRT.h"
#include "pencommon/PenGLDataManager.h"

namespace Qelt {

namespace {

// The way to the render thread: the queue of the pens, or that of the last canvas where they have none.
IGLMsgQueue* queueOf(PenGLDataManager* manager, IGLMsgQueue* ofCanvas) {
  IGLMsgQueue* const queue = manager != nullptr ? manager->GetMsgQueue() : nullptr;
  return queue != nullptr ? queue : ofCanvas;
}

// Where a subclass of our own canvas has no queue to give for the moment, the canvas itself still knows it.
IGLMsgQueue* queueOf(ISPPenCanvas* canvas) {
  if (const auto* const ours = dynamic_cast<const QeltDesktop::PenCanvas*>(canvas)) return ours->queue();
  return canvas != nullptr ? canvas->GetMsgQueue() : nullptr;
}

// Runs a call after everything that the queue has taken: on the render thread, or here when that has ended.
// Where this cannot be waited for, inside a render task or on a thread that may only post, the call is not
// made.
template <typename Call>
void runAfterAll(IGLMsgQueue* queue, Call call) {
  auto* const renderQueue = dynamic_cast<QeltDesktop::RenderQueue*>(queue);
  if (renderQueue != nullptr && !renderQueue->finish()) {
    QeltDesktop::logError(
        "a drawable stays in memory: it was destroyed where its tasks could not be waited for");
    return;
  }
  if (renderQueue == nullptr || !renderQueue->run(call)) call();
}

}  // namespace

PenDrawableGL::PenDrawableGL(PenGLDataManager* manager) : mDataManager(manager) {}

PenDrawableGL::~PenDrawableGL() {
  destroy();
}

void PenDrawableGL::SetCanvas(ISPPenCanvas* canvas) {
  mCanvas = canvas;
  IGLMsgQueue* const queue = queueOf(canvas);
  if (queue != nullptr && queue != mCanvasQueue) {
    // What was posted to the queue of the canvas before still refers to the drawable, and the two queues run
    // side by side.
    auto* const before = QeltDesktop::RenderQueue::ifAlive(mCanvasQueue);
    if (before != nullptr && !before->finish()) {
      QeltDesktop::logError("a drawable changed its render queue where the old one could not be waited for");
    }
    mCanvasQueue = queue;
  }
  prepareDrawableRT();
}

ISPPenCanvas* PenDrawableGL::GetCanvas() {
  return mCanvas;
}

int PenDrawableGL::GetCanvasBitmapType() {
  return 0;
}

void PenDrawableGL::SetCanvasCleared() {}

IReferenceBitmapSettable* PenDrawableGL::GetReferenceBitmapSettable() {
  return mDrawableRT != nullptr ? mDrawableRT->GetReferenceBitmapSettable() : nullptr;
}

IDepthMapBitmapSettable* PenDrawableGL::GetDepthMapBitmapSettable() {
  return mDrawableRT != nullptr ? mDrawableRT->GetDepthMapBitmapSettable() : nullptr;
}

void PenDrawableGL::setDrawableRT(PenDrawableRT* drawable) {
  if (drawable == mDrawableRT) return;
  destroy();
  mDrawableRT = drawable;
  prepareDrawableRT();
}

void PenDrawableGL::prepareDrawableRT() {
  if (mCanvas == nullptr || mDrawableRT == nullptr) return;
  IGLMsgQueue* const queue = queueOf(mDataManager, mCanvasQueue);
  if (queue == nullptr) return;
  int width = 0;
  int height = 0;
  // Other hosts' canvases do not tell their layer to this thread; they are taken to have one.
  if (const auto* const canvas = dynamic_cast<const QeltDesktop::PenCanvas*>(mCanvas)) {
    if (canvas->layer() == nullptr) return;
    width = canvas->layer()->width();
    height = canvas->layer()->height();
  }
  const bool posted = QeltDesktop::postCall(*queue, [drawable = mDrawableRT, width, height, queue] {
    drawable->CreatePenCanvas(width, height, queue);
  });
  mPrepared = mPrepared || posted;
}

void PenDrawableGL::destroy() {
  PenDrawableRT* const drawable = mDrawableRT;
  const bool prepared = mPrepared;
  mDrawableRT = nullptr;
  mPrepared = false;
  if (drawable == nullptr) return;
  IGLMsgQueue* const queue = queueOf(mDataManager, mCanvasQueue);
  if (queue == nullptr) {
    delete drawable;
    return;
  }
  const bool released = prepared && QeltDesktop::postCall(*queue, [drawable] { drawable->Release(); });
  if (prepared && !released) {
    runAfterAll(queue, [drawable] {
      drawable->Release();
      delete drawable;
    });
    return;
  }
  if (!QeltDesktop::postCall(*queue, [drawable] { delete drawable; })) {
    runAfterAll(queue, [drawable] { delete drawable; });
  }
}

}  // namespace Qelt
