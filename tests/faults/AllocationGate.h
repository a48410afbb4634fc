#pragma once

#include <cstddef>
#include <string>

namespace QeltTests {

// Stands between the plug-in and the process's `new` and `delete`. What the plug-in's own code asks for is
// told by the caller's address, so that one of its allocations can be made to fail without touching the
// host's. Everything new is filled with 0xCD, everything deleted with 0xDD. Any thread may allocate; the rest
// is for one.
//
// A test that links this file has no other `operator new`.
class AllocationGate {
 public:
  // From here on the code of the loaded library of this path is watched. Throws std::runtime_error when no
  // such library is loaded.
  static void watch(const std::string& libraryPath);

  // Which of the plug-in's allocations from now on fail: the `number`th from 1, or all from it on.
  static void fail(long number, bool andAllAfter);
  // Nothing fails from here on. Answers how many allocations the plug-in has asked for since `fail`.
  static long open();

  // Blocks that are alive: the plug-in's, and those of the whole process.
  static long plugInBlocks();
  static long allBlocks();
  // The plug-in's allocations so far, failed ones included.
  static long plugInAllocations();
  // How many allocations failed so far that told it by an exception.
  static long thrownFailures();
  // How many deletions were of something that was not alive.
  static long badDeletions();
  // Which of the plug-in's allocations gave the block that begins here; 0 when none did.
  static long numberOf(const void* address);
  // Where in the plug-in its living blocks that are younger than `after` allocations were asked for:
  // addresses in the library, for addr2line.
  static std::string livingSince(long after);
};

}  // namespace QeltTests
