#pragma once

#include <cmath>

#include "base/Vector.h"
#include "math/Matrix3.h"

namespace Qelt {

// Stroke units a device pixel under the canvas's transform, worked out again only when that changes.
class ViewScale {
 public:
  // (1 / length of the first column, 1 / length of the second).
  Vector2<float> inverse(const Matrix3<float>& view) {
    // Byte for byte.
    if (view != mView) {
      mView = view;
      mInverse.x = 1.0f / std::sqrt(view[0] * view[0] + view[1] * view[1] + view[2] * view[2]);
      mInverse.y = 1.0f / std::sqrt(view[3] * view[3] + view[4] * view[4] + view[5] * view[5]);
    }
    return mInverse;
  }

  // The last one worked out.
  Vector2<float> inverse() const { return mInverse; }

 private:
  Matrix3<float> mView;  // identity
  Vector2<float> mInverse{1.0f, 1.0f};
};

}  // namespace Qelt
