#pragma once

#include <string>

namespace QeltTests {

// While one lives, this thread may be inside the plug-in, or in a render task: what it allocates there is not
// the test's own.
class PlugInCall {
 public:
  PlugInCall() { ++sDepth; }
  ~PlugInCall() { --sDepth; }
  PlugInCall(const PlugInCall&) = delete;
  PlugInCall& operator=(const PlugInCall&) = delete;

  static bool isUnderWay() { return sDepth > 0; }

 private:
  static inline thread_local int sDepth = 0;
};

// Stands between the plug-in and the process's `new` and `delete`. Who asks is told by the caller's address,
// so that one allocation of the plug-in's, or of the host's inside a PlugInCall, can be made to fail without
// touching anybody else's. Everything new of the plug-in's is filled with 0xCD, everything deleted with 0xDD.
// Any thread may allocate; the rest is for one. Programs that look at allocations link qelt_allocation_gate.
class AllocationGate {
 public:
  // Everyones: every one of plug-in and host, not of a driver; AndPrograms: of the program itself as well.
  enum class Whose { PlugIns, Everyones, AndPrograms };

  // From here on the code of the loaded library of this path is watched. Throws std::runtime_error when no
  // such library is loaded.
  static void watch(const std::string& libraryPath);

  // Which of these allocations from now on fail: the `number`th from 1, or all from it on.
  static void fail(long number, bool andAllAfter, Whose whose = Whose::PlugIns);
  // Nothing fails from here on. Answers how many of these allocations were asked for since `fail`.
  static long open();

  struct Counts {
    // Blocks that are alive: the plug-in's, those that the host's own code asked for, and those of the whole
    // process.
    long plugInBlocks, hostBlocks, allBlocks;
    long plugInAllocations;  // so far, failed ones included
    long thrownFailures;     // how many allocations failed so far that told it by an exception
    long badDeletions;       // how many deletions were of something that was not alive
  };
  static Counts counts();
};

// While one lives, the `number`th allocation from 0 that this thread asks of `new`, whoever's code it is,
// fails, once.
class FailingAllocation {
 public:
  explicit FailingAllocation(long number) { sUntilFailure = number; }
  ~FailingAllocation() { sUntilFailure = -1; }
  FailingAllocation(const FailingAllocation&) = delete;
  FailingAllocation& operator=(const FailingAllocation&) = delete;

  // Whether there was such an allocation.
  bool hasFailed() const { return sUntilFailure < 0; }
  // Asked at each allocation.
  static bool isDue() { return sUntilFailure >= 0 && sUntilFailure-- == 0; }

 private:
  static inline thread_local long sUntilFailure = -1;  // below 0: none is to fail
};

}  // namespace QeltTests
