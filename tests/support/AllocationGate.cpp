#include "support/AllocationGate.h"

#include <link.h>
#include <unwind.h>

#include <algorithm>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <new>
#include <stdexcept>
#include <string_view>

namespace {

enum class Owner { PlugIn, Host, Other };

// What stands before every block.
struct Header {
  std::uint64_t mark;
  void* base;        // what malloc gave
  std::size_t size;  // of the block itself
  Owner owner;
};

constexpr std::uint64_t kAlive = 0x51454C5441110CADu;
constexpr std::uint64_t kDeleted = 0xDEADDEADDEADDEADu;

// Where a loaded library lies.
struct Code {
  std::atomic<std::uintptr_t> begin{0}, end{0};
  bool holds(std::uintptr_t address) const {
    return address >= begin.load(std::memory_order_relaxed) && address < end.load(std::memory_order_relaxed);
  }
};

constexpr const char* kHostNames[] = {"libQeltPlatform.so", "libQeltBase.so", "libQeltModel.so",
                                      "libQeltEngine.so",   "libQeltGL.so",   "libQeltGraphics.so",
                                      "libQeltPenCommon.so"};
Code plugIn, standardLibrary, program, hosts[std::size(kHostNames)];
std::atomic<long> blocks{0}, ownBlocks{0}, hostsBlocks{0}, ownAllocations{0}, deletionsOfNothing{0},
    thrown{0};
std::atomic<long> askedSince{0}, failFrom{0}, failTo{0};  // failing: from <= number <= to
std::atomic<QeltTests::AllocationGate::Whose> whoseAre{
    QeltTests::AllocationGate::Whose::PlugIns};  // numbered

bool countsProgram() {
  return whoseAre.load(std::memory_order_relaxed) == QeltTests::AllocationGate::Whose::AndPrograms;
}

Owner ownerOf(std::uintptr_t caller) {
  if (plugIn.holds(caller)) return Owner::PlugIn;
  for (const Code& host : hosts) {
    if (host.holds(caller)) return Owner::Host;
  }
  return Owner::Other;
}

// Whether it is plug-in or host that called the standard library, which asks.
bool asksForOneOfUs() {
  struct Search {
    bool inLibrary = false, isOurs = false;
  } search;
  _Unwind_Backtrace(
      [](_Unwind_Context* context, void* data) {
        auto& found = *static_cast<Search*>(data);
        const std::uintptr_t at = _Unwind_GetIP(context);
        const bool isLibrary = standardLibrary.holds(at);
        found.inLibrary = found.inLibrary || isLibrary;
        // Before the library stands what is in this file.
        if (isLibrary || !found.inLibrary) return _URC_NO_REASON;
        found.isOurs = ownerOf(at) != Owner::Other || (countsProgram() && program.holds(at));
        return _URC_END_OF_STACK;
      },
      &search);
  return search.isOurs;
}

// Whether this is one of the allocations that are numbered for failing.
bool isNumbered(Owner owner, std::uintptr_t caller) {
  if (whoseAre.load(std::memory_order_relaxed) == QeltTests::AllocationGate::Whose::PlugIns) {
    return owner == Owner::PlugIn;
  }
  if (!QeltTests::PlugInCall::isUnderWay() || failFrom.load() == INT64_MAX) return false;
  if (countsProgram() && program.holds(caller)) return true;
  return owner != Owner::Other || (standardLibrary.holds(caller) && asksForOneOfUs());
}

void* allocate(std::size_t size, std::size_t alignment, const void* callerAddress) {
  const auto caller = reinterpret_cast<std::uintptr_t>(callerAddress);
  const Owner owner = ownerOf(caller);
  if (QeltTests::FailingAllocation::isDue()) return nullptr;
  if (owner == Owner::PlugIn) ownAllocations.fetch_add(1);
  if (isNumbered(owner, caller)) {
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
  *header = {kAlive, base, size, owner};
  blocks.fetch_add(1, std::memory_order_relaxed);
  auto* const memory = reinterpret_cast<void*>(block);
  if (owner != Owner::Other) {
    if (owner == Owner::PlugIn) std::memset(memory, 0xCD, size);
    (owner == Owner::PlugIn ? ownBlocks : hostsBlocks).fetch_add(1);
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
  if (header->owner != Owner::Other) {
    (header->owner == Owner::PlugIn ? ownBlocks : hostsBlocks).fetch_sub(1);
    if (header->owner == Owner::PlugIn) std::memset(memory, 0xDD, header->size);
  }
  std::free(header->base);
}

// Notes where a library lies if it is one that is looked for.
int note(dl_phdr_info* info, std::size_t, void* plugInPath) {
  const std::string_view path = info->dlpi_name != nullptr ? info->dlpi_name : "";
  const std::string_view name = path.substr(path.rfind('/') + 1);
  Code* code = path == static_cast<const char*>(plugInPath) ? &plugIn : nullptr;
  if (path.empty() && program.end == 0) code = &program;  // it comes first
  if (name.substr(0, 13) == "libstdc++.so.") code = &standardLibrary;
  for (std::size_t i = 0; i < std::size(hosts); ++i) {
    if (name == kHostNames[i]) code = &hosts[i];
  }
  if (code == nullptr) return 0;
  std::uintptr_t begin = UINTPTR_MAX, end = 0;
  for (int i = 0; i < info->dlpi_phnum; ++i) {
    const ElfW(Phdr)& segment = info->dlpi_phdr[i];
    if (segment.p_type != PT_LOAD) continue;
    const std::uintptr_t at = info->dlpi_addr + segment.p_vaddr;
    begin = std::min(begin, at);
    end = std::max<std::uintptr_t>(end, at + segment.p_memsz);
  }
  code->begin = begin;
  code->end = end;
  return 0;
}

}  // namespace

namespace QeltTests {

void AllocationGate::watch(const std::string& libraryPath) {
  plugIn.begin = plugIn.end = 0;
  dl_iterate_phdr(note, const_cast<char*>(libraryPath.c_str()));
  if (plugIn.end == 0) throw std::runtime_error("not loaded: " + libraryPath);
}

void AllocationGate::fail(long number, bool andAllAfter, Whose whose) {
  whoseAre = whose;
  askedSince = 0;
  failTo = andAllAfter ? INT64_MAX : number;
  failFrom = number;
}

long AllocationGate::open() {
  failFrom = INT64_MAX;
  failTo = 0;
  return askedSince;
}

AllocationGate::Counts AllocationGate::counts() {
  return {ownBlocks, hostsBlocks, blocks, ownAllocations, thrown, deletionsOfNothing};
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
// NOLINTBEGIN(bugprone-macro-parentheses): parameter lists are not expressions.
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
// NOLINTEND(bugprone-macro-parentheses)
