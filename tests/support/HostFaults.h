#pragma once

#include <climits>
#include <stdexcept>

namespace QeltTests {

// Says which of a host's calls that may fail does so: a test's stand-ins for the host ask at each. For one
// thread; elsewhere nothing may be armed.
class HostFaults {
 public:
  // Which of the calls from now on fail: the `number`th from 1, or all from it on.
  static void fail(long number, bool andAllAfter) {
    sAsked = 0;
    sFrom = number;
    sTo = andAllAfter ? LONG_MAX : number;
  }
  // Nothing fails from here on. Answers how many calls have asked since `fail`.
  static long open() {
    sFrom = LONG_MAX;
    return sAsked;
  }

  // True when the call that asks is to fail.
  static bool strikes() {
    if (sFrom == LONG_MAX) return false;
    ++sAsked;
    return sAsked >= sFrom && sAsked <= sTo;
  }
  static void mayThrow() {
    if (strikes()) throw std::runtime_error("a call of the host's that was made to fail");
  }

 private:
  static inline long sAsked = 0, sFrom = LONG_MAX, sTo = 0;
};

}  // namespace QeltTests
