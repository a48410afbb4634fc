#pragma once

namespace Qelt {

// A position in stroke units, y down.
struct PointF {
  float x = 0.0f, y = 0.0f;
};

}  // namespace Qelt
