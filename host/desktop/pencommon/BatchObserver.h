#pragma once

#include <cstdint>
#include <functional>
#include <initializer_list>
#include <vector>

#include "base/HostApi.h"

namespace Qelt {
class PenDrawableRT;
}  // namespace Qelt

namespace QeltDesktop {

// A copy of what one hand-over brought to a render drawable.
struct Batch {
  const Qelt::PenDrawableRT* drawable;
  bool cached;                              // by SetCacheBuffer
  std::vector<std::vector<float>> buffers;  // one, or an outline's two: inner first
};

// Sets who is shown every batch that reaches a render drawable, on the render thread; nobody by an empty
// function. Any thread.
QELT_HOST_API void setBatchObserver(std::function<void(Batch)> observer);

// Bytes of vertices that drawables have written into batches since the process began. Those of a call are
// counted when the call returns. Any thread.
QELT_HOST_API std::uint64_t writtenBytes();

// Counts batches that are complete; null ones are left out. Main thread.
void countWritten(std::initializer_list<const std::vector<float>*> buffers);

// Shows a hand-over to the observer, if there is one. Null buffers are left out, and a hand-over of nothing
// else is not shown. Render thread.
void observeBatch(const Qelt::PenDrawableRT* drawable, bool cached,
                  std::initializer_list<const std::vector<float>*> buffers);

}  // namespace QeltDesktop
