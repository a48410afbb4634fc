#include "support/Allocations.h"

#include <atomic>
#include <cstddef>
#include <cstdlib>
#include <new>

namespace {

[[maybe_unused]] std::atomic<long> gAlive{0};
thread_local long tUntilFailure = -1;  // below 0: none to come

#if !QELT_SANITIZED
void* allocate(std::size_t size, std::size_t alignment) {
  void* block = nullptr;
  if (tUntilFailure < 0 || tUntilFailure-- != 0) {
    const std::size_t whole = (size + alignment - 1) / alignment * alignment;
    block = std::aligned_alloc(alignment, whole == 0 ? alignment : whole);
  }
  if (block == nullptr) throw std::bad_alloc();
  ++gAlive;
  return block;
}

void release(void* block) noexcept {
  if (block == nullptr) return;
  --gAlive;
  std::free(block);
}
#endif

}  // namespace

#if !QELT_SANITIZED
// All the others, of arrays, with a size, or answering null, come down to these.
void* operator new(std::size_t size) {
  return allocate(size, alignof(std::max_align_t));
}
void* operator new(std::size_t size, std::align_val_t alignment) {
  return allocate(size, static_cast<std::size_t>(alignment));
}
void operator delete(void* block) noexcept {
  release(block);
}
void operator delete(void* block, std::size_t) noexcept {
  release(block);
}
void operator delete(void* block, std::align_val_t) noexcept {
  release(block);
}
void operator delete(void* block, std::size_t, std::align_val_t) noexcept {
  release(block);
}
#endif

namespace QeltTests {

bool countsAllocations() {
  return QELT_SANITIZED == 0;
}

long liveAllocations() {
  return gAlive;
}

FailingAllocation::FailingAllocation(long number) {
  tUntilFailure = number;
}

FailingAllocation::~FailingAllocation() {
  tUntilFailure = -1;
}

bool FailingAllocation::hasFailed() const {
  return tUntilFailure < 0;
}

}  // namespace QeltTests
