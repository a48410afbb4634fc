#pragma once

#include "log/Log.h"

namespace Qelt {

// Bounds the stamps of one call of a drawable, so that no input, however absurd, fills the memory: at 264
// bytes a stamp of version 8 this is over a gigabyte. What is beyond is left out, while the stroke goes on as
// if it had been placed. Main thread.
class StampBudget {
 public:
  static constexpr int kMostStampsPerCall = 4194304;

  // A call begins.
  void restart() {
    mLeft = kMostStampsPerCall;
    mLogged = false;
  }

  // How many stamps the call may still place.
  int left() const { return mLeft; }

  // A segment of so many stamps was placed, as far as they were left; logs the first one of a call that were
  // not.
  void spend(int stamps, const char* drawable) {
    if (stamps <= mLeft) {
      mLeft -= stamps;
      return;
    }
    mLeft = 0;
    if (mLogged) return;
    mLogged = true;
    __android_log_print(kLogError, kLogTag, "%s: a call placed %d stamps, the rest is left out", drawable,
                        kMostStampsPerCall);
  }

 private:
  int mLeft = kMostStampsPerCall;
  bool mLogged = false;
};

}  // namespace Qelt
