#pragma once

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

}  // namespace QeltTests
