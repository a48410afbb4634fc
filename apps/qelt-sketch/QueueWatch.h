#pragma once

#include <cstdint>

#include "desktop/gl/GlVertexObject.h"
#include "desktop/gl/RenderQueue.h"

namespace QeltDesktop {

// Waits for a render queue on behalf of an output that must be whole. Main thread. The queue outlives it.
class QueueWatch {
 public:
  explicit QueueWatch(RenderQueue& queue) : mQueue(queue) {}

  // Waits until everything posted so far has run. Throws when something has been lost since the watch began:
  // std::bad_alloc when there was no memory to draw a batch, std::runtime_error when a task failed, which
  // took with it what it had to draw or to show.
  void finish();

 private:
  RenderQueue& mQueue;
  const std::uint64_t mUndrawnBefore = GlVertexObject::undrawnBatches();
  const std::uint64_t mDroppedBefore = mQueue.droppedTasks();
};

}  // namespace QeltDesktop
