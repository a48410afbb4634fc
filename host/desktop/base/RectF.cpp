#include "base/RectF.h"

#include <cmath>

namespace Qelt {

namespace {

// Whichever is a number wins over one that is not.
float smaller(float edge, float other) {
  if (other < edge) return other;
  return edge != edge ? other : edge;
}

float larger(float edge, float other) {
  if (other > edge) return other;
  return edge != edge ? other : edge;
}

}  // namespace

void RectF::Set(float l, float t, float r, float b) {
  left = l;
  top = t;
  right = r;
  bottom = b;
}

void RectF::MakeRect(const PointF* point) {
  if (point != nullptr) MakeRect(point->x, point->y);
}

void RectF::MakeRect(float x, float y) {
  left = smaller(left, x);
  top = smaller(top, y);
  right = larger(right, x);
  bottom = larger(bottom, y);
}

void RectF::Union(const RectF& other) {
  left = smaller(left, other.left);
  top = smaller(top, other.top);
  right = larger(right, other.right);
  bottom = larger(bottom, other.bottom);
}

void RectF::IncreaseRect(float amount) {
  left -= amount;
  top -= amount;
  right += amount;
  bottom += amount;
}

void RectF::ExtendRect() {
  left = std::floor(left);
  top = std::floor(top);
  right = std::ceil(right);
  bottom = std::ceil(bottom);
}

bool RectF::IsIntersect(const RectF& other) const {
  return left <= other.right && other.left <= right && top <= other.bottom && other.top <= bottom;
}

}  // namespace Qelt
