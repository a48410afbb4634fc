#pragma once

#include "base/Vector.h"

namespace Qelt {

// Moves an offset of the pattern every 300 segments. Kept: the rows with `shiftsPattern` go on counting,
// although nothing reads the offset.
class PatternShift {
 public:
  void restart() {
    mOffset = {};
    mSegments = 0;
  }

  void countSegment() {
    if (++mSegments % 300 != 0) return;
    mSegments = 0;
    mOffset.x += 77.0f;
    mOffset.y += 37.0f;
  }

  Vector2<float> offset() const { return mOffset; }
  int segments() const { return mSegments; }

 private:
  Vector2<float> mOffset;
  int mSegments = 0;
};

}  // namespace Qelt
