#pragma once

#include "base/Vector.h"
#include "math/Matrix4.h"

namespace Qelt {

// Where the grain of a stroke is fixed: its start point in stroke units, until the first tile drawn turns it
// into window pixels. Render thread.
class GrainOrigin {
 public:
  void set(float x, float y) {
    mStartPoint = {x, y};
    mStartPointPending = true;
  }

  // True from each `set` until the next `settle` that had a viewport.
  bool isPending() const { return mStartPointPending; }

  // Converts the start point: maps it to clip space and from there into the viewport (x, y, width, height in
  // window pixels). Without a viewport, as while the GL context is lost, the point stays pending.
  void settle(const Matrix4<float>& projection, Vector4<int> viewport) {
    if (viewport.z == 0 || viewport.w == 0) return;
    mStartPointPending = false;
    const float x = mStartPoint.x;
    const float y = mStartPoint.y;
    const float clipX = projection[0] * x + projection[4] * y + projection[12];
    const float clipY = projection[1] * x + projection[5] * y + projection[13];
    const float clipW = projection[3] * x + projection[7] * y + projection[15];
    mStartPoint.x =
        (clipX / clipW + 1.0f) * 0.5f * static_cast<float>(viewport.z) + static_cast<float>(viewport.x);
    mStartPoint.y =
        (clipY / clipW + 1.0f) * 0.5f * static_cast<float>(viewport.w) + static_cast<float>(viewport.y);
  }

  Vector2<float> value() const { return mStartPoint; }

 private:
  Vector2<float> mStartPoint;
  bool mStartPointPending = false;
};

}  // namespace Qelt
