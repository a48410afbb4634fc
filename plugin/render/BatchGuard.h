#pragma once

#include <array>
#include <cstddef>
#include <new>
#include <vector>

#include "base/RectF.h"
#include "base/RefCount.h"
#include "graphics/ISPPenCanvas.h"
#include "pencommon/PenDrawableRT.h"
#include "render/PenGLRenderMsg.h"
#include "render/Posting.h"

// How batches, the vertices of one call, get to the render thread, and what becomes of them if the queue
// refuses a task on the way.
namespace Qelt {

// A batch that was handed over, but whose deletion (or release, if it came from the stroke cache) the queue
// refused: the render thread may still read it, so nobody can free it yet. Its render drawable keeps it, at
// most one: until the queue takes the deletion, no new batch is handed over. What is left when the render
// drawable dies goes with it, after every task that might refer to it.
//
// Main thread, but for the destructor.
class UnclaimedBatch {
 public:
  UnclaimedBatch() = default;
  ~UnclaimedBatch() {
    for (auto* buffer : mBuffers) delete buffer;
    if (mReference != nullptr) mReference->Unref();
  }
  UnclaimedBatch(const UnclaimedBatch&) = delete;
  UnclaimedBatch& operator=(const UnclaimedBatch&) = delete;

  // Tries again to have the batch deleted. Returns true if nothing is left.
  bool settle(IGLMsgQueue* queue, PenDrawableRT* drawable) {
    if (mUncleared) {
      if (!post(queue, drawable, &PenDrawableRT::Clear)) return false;
      mUncleared = false;
    }
    for (auto*& buffer : mBuffers) {
      if (buffer != nullptr && !postDelete(queue, buffer)) return false;
      buffer = nullptr;
    }
    if (mReference != nullptr && !post(queue, mReference, &RefCount::Unref)) return false;
    mReference = nullptr;
    return true;
  }

  // Takes a buffer over. `uncleared`: the render drawable still refers to it.
  void keep(std::vector<float>* buffer, bool uncleared) {
    (mBuffers[0] == nullptr ? mBuffers[0] : mBuffers[1]) = buffer;
    mUncleared = uncleared;
  }

  // Takes over the reference that keeps a cached batch alive.
  void keep(RefCount* reference) { mReference = reference; }

 private:
  std::array<std::vector<float>*, 2> mBuffers{};  // an outline's batch has two
  RefCount* mReference = nullptr;
  bool mUncleared = false;
};

// Collects the batch of one call and hands it over when the call ends, however it ends: the batch, a render
// message that draws it, and its deletion, in this order. The call makes its guard before it places a stamp
// and tells it the call's rectangle before it returns; the guard lives on the call's stack. Main thread.
//
// `Drawable` is the host's class of the render drawable, whose `SetBuffer` and `SendDataToGPU` take `Buffers`
// vectors. The render drawable, canvas and `unclaimed`, which belongs to the render drawable, must outlive
// the guard.
//
// If memory runs out for the first vector, nothing is collected or posted. What the queue refuses neither
// leaks nor dangles: see UnclaimedBatch.
template <typename Drawable, std::size_t Buffers = 1>
class BatchGuard {
 public:
  // From here on every stamp is appended to the guard's buffers.
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

  // The call's rectangle, stroke units: the batch is drawn into the tiles that it meets.
  void setRect(const RectF& rect) { mRect = rect; }
  // Null if it could not be allocated.
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
      // Without its message the batch is never cleared, and the render drawable still refers to it.
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

// Presents a batch that the stroke cache holds. Main thread.
template <typename Drawable>
class CacheGuard {
 public:
  CacheGuard(Drawable* drawable, ISPPenCanvas* canvas, UnclaimedBatch* unclaimed)
      : mDrawable(drawable), mCanvas(canvas), mUnclaimed(unclaimed) {}

  // Hands the batch over, with a render message that draws it; `rect` is the call's rectangle, stroke units:
  // the batch is drawn into the tiles that it meets. Returns true if the render thread will read the batch,
  // which must live until then. Null does nothing. An exception out of a post ends the process.
  bool present(std::vector<float>* batch, const RectF& rect) noexcept {
    if (batch == nullptr) return false;
    IGLMsgQueue* queue = mCanvas->GetMsgQueue();
    if (!mUnclaimed->settle(queue, mDrawable)) return false;
    // A message without its batch would draw the batch before it.
    if (!post(queue, mDrawable, &Drawable::SetCacheBuffer, batch)) return false;
    postTask(queue, new (std::nothrow) PenGLRenderMsg(mDrawable, mCanvas, rect, true));
    return true;
  }

 private:
  Drawable* mDrawable;
  ISPPenCanvas* mCanvas;
  UnclaimedBatch* mUnclaimed;
};

}  // namespace Qelt
