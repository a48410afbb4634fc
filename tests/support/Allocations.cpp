#include "support/Allocations.h"

#include <atomic>
#include <cstddef>
#include <cstdlib>
#include <new>

namespace {

[[maybe_unused]] std::atomic<long> gAlive{0};
thread_local long tUntilFailure = -1;  // below 0: none to come

#if !QELT_SANITIZED
void* allocate(std::size_t size, std::size_t alignment = 0) noexcept {
  if (tUntilFailure >= 0 && tUntilFailure-- == 0) return nullptr;
  const std::size_t atLeast = size == 0 ? 1 : size;
  void* block = alignment == 0
                    ? std::malloc(atLeast)
                    : std::aligned_alloc(alignment, (atLeast + alignment - 1) / alignment * alignment);
  if (block != nullptr) ++gAlive;
  return block;
}

void* allocateOrThrow(std::size_t size, std::size_t alignment = 0) {
  void* block = allocate(size, alignment);
  if (block == nullptr) throw std::bad_alloc();
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
void* operator new(std::size_t size) {
  return allocateOrThrow(size);
}
void* operator new[](std::size_t size) {
  return allocateOrThrow(size);
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
  return allocate(size);
}
void* operator new[](std::size_t size, const std::nothrow_t&) noexcept {
  return allocate(size);
}
void* operator new(std::size_t size, std::align_val_t alignment) {
  return allocateOrThrow(size, static_cast<std::size_t>(alignment));
}
void* operator new[](std::size_t size, std::align_val_t alignment) {
  return allocateOrThrow(size, static_cast<std::size_t>(alignment));
}
void* operator new(std::size_t size, std::align_val_t alignment, const std::nothrow_t&) noexcept {
  return allocate(size, static_cast<std::size_t>(alignment));
}
void* operator new[](std::size_t size, std::align_val_t alignment, const std::nothrow_t&) noexcept {
  return allocate(size, static_cast<std::size_t>(alignment));
}
void operator delete(void* block) noexcept {
  release(block);
}
void operator delete[](void* block) noexcept {
  release(block);
}
void operator delete(void* block, std::size_t) noexcept {
  release(block);
}
void operator delete[](void* block, std::size_t) noexcept {
  release(block);
}
void operator delete(void* block, std::align_val_t) noexcept {
  release(block);
}
void operator delete[](void* block, std::align_val_t) noexcept {
  release(block);
}
void operator delete(void* block, std::size_t, std::align_val_t) noexcept {
  release(block);
}
void operator delete[](void* block, std::size_t, std::align_val_t) noexcept {
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
