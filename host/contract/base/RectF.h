#pragma once

#include "base/HostApi.h"
#include "base/PointF.h"

namespace Qelt {

// An integer rectangle; the right and bottom edges are exclusive.
struct Rect {
  int left = 0, top = 0, right = 0, bottom = 0;
};

// An axis-aligned rectangle, y down. Growing is plain minimum and maximum: a rectangle without area counts as
// the point or line it is, and an operand that is NaN is ignored.
class QELT_HOST_API RectF {
 public:
  float left = 0.0f, top = 0.0f, right = 0.0f, bottom = 0.0f;

  void Set(float l, float t, float r, float b);
  // Grows to take in a point.
  void MakeRect(const PointF* point);
  void MakeRect(float x, float y);
  // Grows to take in another rectangle.
  void Union(const RectF& other);
  // Moves every edge outwards by `amount`.
  void IncreaseRect(float amount);
  // Rounds every edge outwards to whole units. Chosen here: the host decides what this adds.
  void ExtendRect();
  // True when the two share at least an edge point. Chosen here: touching counts.
  bool IsIntersect(const RectF& other) const;
};

}  // namespace Qelt
