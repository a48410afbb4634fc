#pragma once

#include <cmath>

#include "base/Vector.h"
#include "math/Matrix3.h"

namespace Qelt {

// How many stroke units a device pixel takes under the canvas's transform. Worked out again only when the
// transform changes.
class ViewScale {
 public:
  // (1 / length of the first column, 1 / length of the second).
  Vector2<float> inverse(const Matrix3<float>& view) {
    // Compared byte by byte.
    if (view != mView) {
      mView = view;
      mInverse.x = 1.0f / std::sqrt(view[0] * view[0] + view[1] * view[1] + view[2] * view[2]);
      mInverse.y = 1.0f / std::sqrt(view[3] * view[3] + view[4] * view[4] + view[5] * view[5]);
    }
    return mInverse;
  }

 private:
  Matrix3<float> mView;  // identity
  Vector2<float> mInverse{1.0f, 1.0f};
};

}  // namespace Qelt
