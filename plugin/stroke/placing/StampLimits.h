#pragma once

#include "log/Log.h"
#include "stroke/placing/StampWalk.h"

namespace Qelt {

// Bounds the stamps of one call of a drawable, so that no input, however absurd, fills the memory: a stamp of
// version 8 takes 264 bytes, so the bound is over a gigabyte. Stamps beyond it are left out, and the stroke
// goes on as if they had been placed. Logs this at most once per call. Also logs, at most once per stroke,
// that a walk gave up before its segment's end. Main thread.
class StampLimits {
 public:
  static constexpr int kMostStampsPerCall = 4194304;

  void beginStroke() { mSaidCut = false; }
  void beginCall() {
    mLeft = kMostStampsPerCall;
    mSaidLeftOut = false;
  }

  // How many stamps the call may still place.
  int left() const { return mLeft; }

  // Counts a walk along a segment of that length, in stroke units. The walk placed no more than `left()`.
  void note(const WalkResult& walk, const char* drawable, float length) {
    if (walk.stamps > mLeft && !mSaidLeftOut) {
      mSaidLeftOut = true;
      __android_log_print(kLogError, kLogTag, "%s: a call placed %d stamps, the rest is left out", drawable,
                          kMostStampsPerCall);
    }
    mLeft -= walk.stamps < mLeft ? walk.stamps : mLeft;
    if (walk.cutShort && !mSaidCut) {
      mSaidCut = true;
      __android_log_print(kLogError, kLogTag, "%s: a segment of length %f was cut short", drawable,
                          static_cast<double>(length));
    }
  }

 private:
  int mLeft = kMostStampsPerCall;
  bool mSaidLeftOut = false;
  bool mSaidCut = false;
};

}  // namespace Qelt
