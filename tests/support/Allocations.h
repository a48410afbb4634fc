#pragma once

namespace QeltTests {

// True where the two below work: not under the sanitizers, which bring allocation functions of their own and
// find leaks and double deletions themselves.
bool countsAllocations();

// How many blocks of `new` are alive in the process; 0 where they are not counted. A difference of 0 between
// two looks says that whatever was made meanwhile was deleted again, each once.
long liveAllocations();

// While one lives, the `number`th allocation from 0 that this thread asks of `new` fails, once.
class FailingAllocation {
 public:
  explicit FailingAllocation(long number);
  ~FailingAllocation();
  FailingAllocation(const FailingAllocation&) = delete;
  FailingAllocation& operator=(const FailingAllocation&) = delete;

  // Whether there was such an allocation.
  bool hasFailed() const;
};

}  // namespace QeltTests
