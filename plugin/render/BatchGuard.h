#pragma once

#include <array>
#include <cstddef>
#include <new>
#include <vector>

#include "base/RectF.h"
#include "graphics/ISPPenCanvas.h"
#include "pencommon/PenDrawableRT.h"
#include "render/PenGLRenderMsg.h"
#include "render/Posting.h"
#include "render/UnclaimedBatch.h"

namespace Qelt {

// Collects the vertex floats of one call and hands them to the render thread when the call ends, however it
// ends: the batch, a render message that draws it, and its deletion, in this order. Lives on the stack of the
// calling operation; main thread. `Drawable` is the host's render drawable class, whose `SetBuffer` and
// `SendDataToGPU` take `Buffers` vectors.
//
// A first buffer that could not be allocated leaves the guard inert. What the queue refuses neither leaks nor
// dangles: see UnclaimedBatch.
template <typename Drawable, std::size_t Buffers = 1>
class BatchGuard {
 public:
  // From here on every stamp is appended to the guard's buffers. `unclaimed` is the render drawable's.
  BatchGuard(Drawable* drawable, ISPPenCanvas* canvas, UnclaimedBatch* unclaimed) noexcept
      : mDrawable(drawable), mCanvas(canvas), mUnclaimed(unclaimed) {
    for (auto*& buffer : mBuffers) {
      buffer = new (std::nothrow) std::vector<float>;
      if (mBuffers[0] == nullptr) return;
    }
    setBuffers(mBuffers);
  }

  BatchGuard(const BatchGuard&) = delete;
  BatchGuard& operator=(const BatchGuard&) = delete;

  // The area to present, stroke units.
  void setRect(const RectF& rect) { mRect = rect; }
  // Null when it could not be allocated.
  const std::vector<float>* buffer() const { return mBuffers[0]; }

 protected:
  // An exception out of a post ends the process: a batch lost half way would corrupt the next one.
  ~BatchGuard() noexcept {
    if (mBuffers[0] != nullptr) {
      IGLMsgQueue* queue = mCanvas->GetMsgQueue();
      setBuffers({});
      handOver(queue);
    }
    for (auto* buffer : mBuffers) delete buffer;
  }

 private:
  using Vectors = std::array<std::vector<float>*, Buffers>;

  void setBuffers(const Vectors& buffers) {
    if constexpr (Buffers == 1) {
      mDrawable->SetBuffer(buffers[0]);
    } else {
      mDrawable->SetBuffer(buffers[0], buffers[1]);
    }
  }

  bool send(IGLMsgQueue* queue) {
    if constexpr (Buffers == 1) {
      return post<Drawable>(queue, mDrawable, &Drawable::SendDataToGPU, mBuffers[0]);
    } else {
      using Send = void (Drawable::*)(std::vector<float>*, std::vector<float>*);
      return post(queue, mDrawable, static_cast<Send>(&Drawable::SendDataToGPU), mBuffers[0], mBuffers[1]);
    }
  }

  // Leaves in mBuffers what is still the guard's.
  void handOver(IGLMsgQueue* queue) {
    if (!mUnclaimed->settle(queue, mDrawable)) return;
    if (!send(queue)) return;
    const bool drawn = postTask(queue, new (std::nothrow) PenGLRenderMsg(mDrawable, mCanvas, mRect, false));
    for (auto*& buffer : mBuffers) {
      // Without its render message the batch is never cleared, and the drawable still refers to it.
      if (buffer != nullptr && (!drawn || !postDelete(queue, buffer))) mUnclaimed->keep(buffer, !drawn);
      buffer = nullptr;
    }
  }

  Drawable* mDrawable;
  ISPPenCanvas* mCanvas;
  RectF mRect;
  Vectors mBuffers{};
  UnclaimedBatch* mUnclaimed;
};

// Presents a batch that the host's stroke-data cache holds. Borrows the buffer; null does nothing.
template <typename Drawable>
class CacheGuard {
 public:
  // `handedOver` becomes true when the render thread will read the buffer.
  CacheGuard(Drawable* drawable, ISPPenCanvas* canvas, const RectF& rect, std::vector<float>* buffer,
             UnclaimedBatch* unclaimed, bool* handedOver) noexcept
      : mDrawable(drawable),
        mCanvas(canvas),
        mRect(rect),
        mBuffer(buffer),
        mUnclaimed(unclaimed),
        mHandedOver(handedOver) {}

  CacheGuard(const CacheGuard&) = delete;
  CacheGuard& operator=(const CacheGuard&) = delete;

 protected:
  ~CacheGuard() noexcept {
    if (mBuffer == nullptr) return;
    IGLMsgQueue* queue = mCanvas->GetMsgQueue();
    if (!mUnclaimed->settle(queue, mDrawable)) return;
    // A message without its batch would draw the batch before it.
    if (!post(queue, mDrawable, &Drawable::SetCacheBuffer, mBuffer)) return;
    *mHandedOver = true;
    postTask(queue, new (std::nothrow) PenGLRenderMsg(mDrawable, mCanvas, mRect, true));
  }

 private:
  Drawable* mDrawable;
  ISPPenCanvas* mCanvas;
  RectF mRect;
  std::vector<float>* mBuffer;
  UnclaimedBatch* mUnclaimed;
  bool* mHandedOver;
};

}  // namespace Qelt
