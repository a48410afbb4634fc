#pragma once

#include <atomic>
#include <new>

#include "base/String.h"
#include "pencommon/PenGLDataManager.h"
#include "pencommon/PenManager.h"
#include "render/Posting.h"

namespace Qelt {

// The name by which a dying pen has its data released on the render thread. The release reads the name, so it
// is deleted there as well, by the task after it.
//
// Where the queue takes the release and refuses the deletion, the release may still read the name and the pen
// is gone: such names wait, for all pens together, until the next pen that dies by the same queue posts their
// deletion. Several pens may die at once, each on its own host's main thread, so the list of them is atomic.
class ReleasedName final : public String {
 public:
  // Posts the release of a pen's data, and the deletion of its name. If memory runs out or the queue refuses,
  // the data is not released.
  static void release(PenGLDataManager* manager, IGLMsgQueue* queue) {
    deleteWaiting(queue);
    auto* name = new (std::nothrow) ReleasedName(queue);
    if (name == nullptr) return;
    if (!post(queue, manager, &PenGLDataManager::ReleasePenData, name)) {
      delete name;
    } else if (!postDelete<String>(queue, name)) {
      wait(name);
    }
  }

 private:
  explicit ReleasedName(IGLMsgQueue* queue) : String(PenManager::QELT_PENCIL2_NAME), mQueue(queue) {}

  static void wait(ReleasedName* name) {
    name->mNext = waiting.load();
    while (!waiting.compare_exchange_weak(name->mNext, name)) {
    }
  }

  static void deleteWaiting(IGLMsgQueue* queue) {
    ReleasedName* name = waiting.exchange(nullptr);
    while (name != nullptr) {
      ReleasedName* const next = name->mNext;
      if (name->mQueue != queue || !postDelete<String>(queue, name)) wait(name);
      name = next;
    }
  }

  static inline std::atomic<ReleasedName*> waiting{nullptr};

  IGLMsgQueue* mQueue;
  ReleasedName* mNext = nullptr;
};

}  // namespace Qelt
