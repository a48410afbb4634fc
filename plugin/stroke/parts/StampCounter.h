#pragma once

#include <cstdint>

namespace Qelt {

// Counts the stamps of a stroke; the stamp shapes take turns by it.
class StampCounter {
 public:
  static constexpr int kShapes = 3;

  void restart(std::int32_t count = 0) {
    mCount = count;
    mShape = count % kShapes;
  }
  std::int32_t count() const { return mCount; }

  // The shape of the next stamp, 0 to 2.
  int next() {
    const int shape = mShape;
    mShape = shape == kShapes - 1 ? 0 : shape + 1;
    // Past the largest count it goes on from 1: shapes take turns as before, and only the count is off.
    mCount = mCount == INT32_MAX ? 1 : mCount + 1;
    return shape;
  }

 private:
  std::int32_t mCount = 0;
  int mShape = 0;
};

}  // namespace Qelt
