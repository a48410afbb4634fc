#pragma once

#include <array>
#include <vector>

#include "base/RefCount.h"
#include "pencommon/PenDrawableRT.h"
#include "render/Posting.h"

namespace Qelt {

// A batch that was handed over, but whose deletion (or, of a cached one, release) the queue refused: the
// render thread may still read it, so nobody can free it yet. Its render drawable keeps it, at most one:
// until the queue takes the deletion, no new batch is handed over. What is left when the drawable dies goes
// with it, after every task that might refer to it.
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

  // Tries again to have the batch deleted; true when nothing is left.
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

  // Takes a buffer over. `uncleared`: the drawable still refers to it.
  void keep(std::vector<float>* buffer, bool uncleared) {
    (mBuffers[0] == nullptr ? mBuffers[0] : mBuffers[1]) = buffer;
    mUncleared = uncleared;
  }

  // Takes over the reference that keeps a cached batch alive.
  void keep(RefCount* reference) { mReference = reference; }

 private:
  std::array<std::vector<float>*, 2> mBuffers{};  // a batch has two at the most
  RefCount* mReference = nullptr;
  bool mUncleared = false;
};

}  // namespace Qelt
