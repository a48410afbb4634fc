#pragma once

#include <limits>

#include "base/RectF.h"

namespace Qelt {

// Gathers the squares around the stamps of a segment, so that the caller's rectangle is touched once a
// segment: growing is minimum and maximum, the order does not matter. Stroke units.
class DirtyBox {
 public:
  void add(float x, float y, float reach) {
    // Written so that an edge that is not a number changes nothing.
    const float left = x - reach, top = y - reach, right = x + reach, bottom = y + reach;
    mLeft = left < mLeft ? left : mLeft;
    mTop = top < mTop ? top : mTop;
    mRight = right > mRight ? right : mRight;
    mBottom = bottom > mBottom ? bottom : mBottom;
  }

  void uniteInto(RectF* rect) const {
    if (mLeft > mRight || mTop > mBottom) return;
    RectF box;
    box.Set(mLeft, mTop, mRight, mBottom);
    rect->Union(box);
  }

 private:
  float mLeft = std::numeric_limits<float>::infinity();
  float mTop = std::numeric_limits<float>::infinity();
  float mRight = -std::numeric_limits<float>::infinity();
  float mBottom = -std::numeric_limits<float>::infinity();
};

}  // namespace Qelt
