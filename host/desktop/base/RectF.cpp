#include "base/RectF.h"

#include <cmath>

namespace Qelt {

namespace {

// Each is one instruction, and keeps the edge when `other` is NaN. Pens grow rectangles once per stamp.
float smaller(float edge, float other) {
  return other < edge ? other : edge;
}

float larger(float edge, float other) {
  return other > edge ? other : edge;
}

// An edge that is NaN gives way to one that is not.
float numberOf(float edge, float other) {
  return std::isnan(edge) ? other : edge;
}

void grow(RectF& rect, float left, float top, float right, float bottom) {
  if (std::isunordered(rect.left, rect.top) || std::isunordered(rect.right, rect.bottom)) [[unlikely]] {
    rect.left = numberOf(rect.left, left);
    rect.top = numberOf(rect.top, top);
    rect.right = numberOf(rect.right, right);
    rect.bottom = numberOf(rect.bottom, bottom);
  }
  rect.left = smaller(rect.left, left);
  rect.top = smaller(rect.top, top);
  rect.right = larger(rect.right, right);
  rect.bottom = larger(rect.bottom, bottom);
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
  grow(*this, x, y, x, y);
}

void RectF::Union(const RectF& other) {
  grow(*this, other.left, other.top, other.right, other.bottom);
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
