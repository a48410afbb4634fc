#include "AllocationGate.h"

#include <link.h>
#include <pthread.h>

#include <atomic>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <mutex>
#include <new>
#include <stdexcept>

namespace {

// What stands before every block.
struct Header {
  std::uint64_t mark;
  void* base;        // what malloc gave
  std::size_t size;  // of the block itself
  Header* previous;  // of the plug-in's living blocks; null for the host's
  Header* next;
  std::uintptr_t caller;
  long number;  // of the plug-in's allocations
  bool ofPlugIn;
};

constexpr std::uint64_t kAlive = 0x51454C5441110CADu;
constexpr std::uint64_t kDeleted = 0xDEADDEADDEADDEADu;

std::atomic<std::uintptr_t> codeBegin{0}, codeEnd{0};
std::atomic<long> blocks{0}, ownBlocks{0}, ownAllocations{0}, deletionsOfNothing{0}, thrown{0};
std::atomic<long> askedSince{0}, failFrom{0}, failTo{0};  // failing: from <= number <= to

// Guards the list of the plug-in's living blocks. Not a std::mutex's business to allocate, nor this one's.
std::mutex listLock;
Header* living = nullptr;

bool isOfPlugIn(const void* caller) {
  const auto address = reinterpret_cast<std::uintptr_t>(caller);
  return address >= codeBegin.load(std::memory_order_relaxed) &&
         address < codeEnd.load(std::memory_order_relaxed);
}

void* allocate(std::size_t size, std::size_t alignment, const void* caller) {
  const bool ofPlugIn = isOfPlugIn(caller);
  long number = 0;
  if (ofPlugIn) {
    number = ownAllocations.fetch_add(1) + 1;
    const long asked = askedSince.fetch_add(1) + 1;
    if (asked >= failFrom.load() && asked <= failTo.load()) return nullptr;
  }
  if (alignment < alignof(std::max_align_t)) alignment = alignof(std::max_align_t);
  const std::size_t extra = sizeof(Header) + alignment;
  if (size > SIZE_MAX - extra) return nullptr;
  void* const base = std::malloc(size + extra);
  if (base == nullptr) return nullptr;
  const auto start = reinterpret_cast<std::uintptr_t>(base) + sizeof(Header);
  const std::uintptr_t block = (start + alignment - 1) / alignment * alignment;
  auto* const header = reinterpret_cast<Header*>(block) - 1;
  *header = {kAlive, base,    size, nullptr, nullptr, reinterpret_cast<std::uintptr_t>(caller),
             number, ofPlugIn};
  blocks.fetch_add(1, std::memory_order_relaxed);
  auto* const memory = reinterpret_cast<void*>(block);
  if (ofPlugIn) {
    std::memset(memory, 0xCD, size);
    ownBlocks.fetch_add(1);
    const std::lock_guard hold(listLock);
    header->next = living;
    if (living != nullptr) living->previous = header;
    living = header;
  }
  return memory;
}

void release(void* memory) {
  if (memory == nullptr) return;
  auto* const header = static_cast<Header*>(memory) - 1;
  if (header->mark != kAlive) {
    deletionsOfNothing.fetch_add(1);
    return;  // better leaked than worse
  }
  header->mark = kDeleted;
  blocks.fetch_sub(1, std::memory_order_relaxed);
  if (header->ofPlugIn) {
    ownBlocks.fetch_sub(1);
    std::memset(memory, 0xDD, header->size);
    const std::lock_guard hold(listLock);
    (header->previous != nullptr ? header->previous->next : living) = header->next;
    if (header->next != nullptr) header->next->previous = header->previous;
  }
  std::free(header->base);
}

struct Search {
  const char* path;
  bool found;
};

int findLibrary(dl_phdr_info* info, std::size_t, void* data) {
  auto* const search = static_cast<Search*>(data);
  if (info->dlpi_name == nullptr || std::strcmp(info->dlpi_name, search->path) != 0) return 0;
  std::uintptr_t begin = UINTPTR_MAX, end = 0;
  for (int i = 0; i < info->dlpi_phnum; ++i) {
    const ElfW(Phdr)& segment = info->dlpi_phdr[i];
    if (segment.p_type != PT_LOAD) continue;
    const std::uintptr_t at = info->dlpi_addr + segment.p_vaddr;
    begin = at < begin ? at : begin;
    end = at + segment.p_memsz > end ? at + segment.p_memsz : end;
  }
  codeBegin = begin;
  codeEnd = end;
  search->found = true;
  return 1;
}

}  // namespace

namespace QeltTests {

void AllocationGate::watch(const std::string& libraryPath) {
  Search search{libraryPath.c_str(), false};
  dl_iterate_phdr(findLibrary, &search);
  if (!search.found) throw std::runtime_error("not loaded: " + libraryPath);
}

void AllocationGate::fail(long number, bool andAllAfter) {
  askedSince = 0;
  failTo = andAllAfter ? INT64_MAX : number;
  failFrom = number;
}

long AllocationGate::open() {
  failFrom = INT64_MAX;
  failTo = 0;
  return askedSince;
}

long AllocationGate::plugInBlocks() {
  return ownBlocks;
}

long AllocationGate::allBlocks() {
  return blocks;
}

long AllocationGate::plugInAllocations() {
  return ownAllocations;
}

long AllocationGate::thrownFailures() {
  return thrown;
}

long AllocationGate::badDeletions() {
  return deletionsOfNothing;
}

long AllocationGate::numberOf(const void* address) {
  const std::lock_guard hold(listLock);
  for (const Header* header = living; header != nullptr; header = header->next) {
    if (header + 1 == address) return header->number;
  }
  return 0;
}

std::string AllocationGate::livingSince(long after) {
  char text[2048];
  int length = 0;
  {
    const std::lock_guard hold(listLock);
    for (const Header* header = living; header != nullptr && length < 2000; header = header->next) {
      if (header->number <= after) continue;
      length +=
          std::snprintf(text + length, sizeof text - static_cast<std::size_t>(length), " 0x%zx(%zu bytes)",
                        static_cast<std::size_t>(header->caller - codeBegin), header->size);
    }
  }
  return std::string(text, static_cast<std::size_t>(length));
}

}  // namespace QeltTests

// The caller is one frame up, so none of these may be inlined into it.
#define QELT_CALLER __builtin_return_address(0)

namespace {

void* orThrow(void* memory) {
  if (memory != nullptr) return memory;
  thrown.fetch_add(1);
  throw std::bad_alloc();
}

std::size_t bytes(std::align_val_t alignment) {
  return static_cast<std::size_t>(alignment);
}

}  // namespace

// Both of a form: for one and for many.
#define QELT_NEW(PARAMETERS, MEMORY) \
  void* operator new PARAMETERS {    \
    return MEMORY;                   \
  }                                  \
  void* operator new[] PARAMETERS {  \
    return MEMORY;                   \
  }
QELT_NEW((std::size_t size), orThrow(allocate(size, 0, QELT_CALLER)))
QELT_NEW((std::size_t size, const std::nothrow_t&) noexcept, allocate(size, 0, QELT_CALLER))
QELT_NEW((std::size_t size, std::align_val_t to), orThrow(allocate(size, bytes(to), QELT_CALLER)))
QELT_NEW((std::size_t size, std::align_val_t to, const std::nothrow_t&) noexcept,
         allocate(size, bytes(to), QELT_CALLER))

#define QELT_DELETE(PARAMETERS)                \
  void operator delete PARAMETERS noexcept {   \
    release(memory);                           \
  }                                            \
  void operator delete[] PARAMETERS noexcept { \
    release(memory);                           \
  }
QELT_DELETE((void* memory))
QELT_DELETE((void* memory, std::size_t))
QELT_DELETE((void* memory, const std::nothrow_t&))
QELT_DELETE((void* memory, std::align_val_t))
QELT_DELETE((void* memory, std::size_t, std::align_val_t))
QELT_DELETE((void* memory, std::align_val_t, const std::nothrow_t&))
