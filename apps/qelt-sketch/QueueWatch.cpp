#include "QueueWatch.h"

#include <new>
#include <stdexcept>

namespace QeltDesktop {

void QueueWatch::finish() {
  mQueue.finish();
  if (GlVertexObject::undrawnBatches() != mUndrawnBefore) throw std::bad_alloc();
  if (mQueue.droppedTasks() != mDroppedBefore) throw std::runtime_error("a render task failed (see --log)");
}

}  // namespace QeltDesktop
