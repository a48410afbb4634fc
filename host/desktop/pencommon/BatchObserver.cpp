#include "desktop/pencommon/BatchObserver.h"

#include <atomic>
#include <mutex>
#include <utility>

namespace QeltDesktop {

namespace {

std::mutex gLock;  // guards gObserver
std::function<void(Batch)> gObserver;
std::atomic<bool> gObserved{false};  // spares the usual case the lock
std::atomic<std::uint64_t> gWrittenBytes{0};

}  // namespace

std::uint64_t writtenBytes() {
  return gWrittenBytes;
}

void countWritten(std::initializer_list<const std::vector<float>*> buffers) {
  for (const std::vector<float>* buffer : buffers) {
    if (buffer != nullptr) gWrittenBytes += buffer->size() * sizeof(float);
  }
}

void setBatchObserver(std::function<void(Batch)> observer) {
  const std::lock_guard guard(gLock);
  gObserver = std::move(observer);
  gObserved = static_cast<bool>(gObserver);
}

void observeBatch(const Qelt::PenDrawableRT* drawable, bool cached,
                  std::initializer_list<const std::vector<float>*> buffers) {
  if (!gObserved) return;
  Batch batch{drawable, cached, {}};
  for (const std::vector<float>* buffer : buffers) {
    if (buffer != nullptr) batch.buffers.push_back(*buffer);
  }
  const std::lock_guard guard(gLock);
  if (gObserver && !batch.buffers.empty()) gObserver(std::move(batch));
}

}  // namespace QeltDesktop
