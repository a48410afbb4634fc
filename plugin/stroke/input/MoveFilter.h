#pragma once

#include <cmath>

#include "base/PointF.h"
#include "stroke/input/PenSample.h"

namespace Qelt {

// In stroke units. Computed in double precision where the squares do not fit into a float.
inline float distanceBetween(PointF a, PointF b) {
  const float dx = b.x - a.x;
  const float dy = b.y - a.y;
  const float squared = dx * dx + dy * dy;
  if (!std::isinf(squared)) return std::sqrt(squared);
  const double wideX = static_cast<double>(b.x) - static_cast<double>(a.x);
  const double wideY = static_cast<double>(b.y) - static_cast<double>(a.y);
  return static_cast<float>(std::sqrt(wideX * wideX + wideY * wideY));
}

// Decides which moves become segments: very short ones never, short ones every other time.
class MoveFilter {
 public:
  // Shorter moves are dropped. The last point stays where it is, so that a slow drag adds up. Stroke units.
  void setMinimumMove(float distance) { mMinimumMove = distance; }
  float minimumMove() const { return mMinimumMove; }

  // Begins a stroke. Moves shorter than `skipDistance`, in stroke units, are taken every other time; the
  // first of them is dropped.
  void restart(float skipDistance) {
    mSkipDistance = skipDistance;
    mSkipToggle = true;
  }

  // Whether the move from `last` to `at` becomes a segment. A move to a point that is not usable never does.
  bool accepts(PointF last, PointF at) {
    if (!isUsable(at)) return false;
    const float distance = distanceBetween(last, at);
    if (distance < mMinimumMove) return false;
    if (distance < mSkipDistance) {
      const bool skips = mSkipToggle;
      mSkipToggle = !mSkipToggle;
      return !skips;
    }
    mSkipToggle = true;
    return true;
  }

 private:
  float mMinimumMove = 5.0f;
  float mSkipDistance = 5.0f;
  bool mSkipToggle = true;  // whether the next short move is dropped
};

}  // namespace Qelt
