#pragma once

#include "log/Log.h"

namespace Qelt {

// Calls `leave` at the end of its scope, whichever way the scope is left. An exception out of `leave` is
// logged and dropped: another one may be under way already, and nothing more could be undone.
template <typename Leave>
class ScopeExit {
 public:
  explicit ScopeExit(Leave leave) : mLeave(leave) {}
  ~ScopeExit() {
    try {
      mLeave();
    } catch (...) {
      __android_log_print(kLogError, kLogTag, "%s", "the host threw while a tile or a batch was ended");
    }
  }
  ScopeExit(const ScopeExit&) = delete;
  ScopeExit& operator=(const ScopeExit&) = delete;

 private:
  Leave mLeave;
};

}  // namespace Qelt
