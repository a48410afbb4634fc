#include "core/EraserHit.h"

#include <algorithm>
#include <cmath>
#include <cstddef>

#include "base/RectF.h"
#include "core/PageStroke.h"
#include "core/PageTypes.h"

namespace QeltDesktop {
namespace {

// In double precision: squares of what a page holds do not fit into a float without loss.
struct Point {
  double x, y;
};

Point pointOf(Qelt::PointF point) {
  return {point.x, point.y};
}

double cross(Point origin, Point a, Point b) {
  return (a.x - origin.x) * (b.y - origin.y) - (a.y - origin.y) * (b.x - origin.x);
}

double squaredDistance(Point point, Point from, Point to) {
  const double dx = to.x - from.x, dy = to.y - from.y;
  const double squaredLength = dx * dx + dy * dy;
  double along =
      squaredLength > 0.0 ? ((point.x - from.x) * dx + (point.y - from.y) * dy) / squaredLength : 0.0;
  along = std::clamp(along, 0.0, 1.0);
  const double restX = point.x - from.x - along * dx, restY = point.y - from.y - along * dy;
  return restX * restX + restY * restY;
}

bool doCross(Point a, Point b, Point c, Point d) {
  return (cross(a, b, c) > 0.0) != (cross(a, b, d) > 0.0) && (cross(c, d, a) > 0.0) != (cross(c, d, b) > 0.0);
}

double squaredDistance(Point a, Point b, Point c, Point d) {
  if (doCross(a, b, c, d)) return 0.0;
  return std::min({squaredDistance(a, c, d), squaredDistance(b, c, d), squaredDistance(c, a, b),
                   squaredDistance(d, a, b)});
}

}  // namespace

bool isUsable(const EraserMark& mark) {
  for (const float value : {mark.from.x, mark.from.y, mark.to.x, mark.to.y}) {
    if (!(std::abs(value) <= kFarthest)) return false;
  }
  return mark.radius >= 0.0f && mark.radius <= kFarthest;
}

bool isHit(const PageStroke& stroke, const EraserMark& mark) {
  const float reach = mark.radius + stroke.style().size / 2.0f;
  Qelt::RectF box;
  box.Set(mark.from.x, mark.from.y, mark.from.x, mark.from.y);
  box.MakeRect(&mark.to);
  box.IncreaseRect(reach);
  if (!box.IsIntersect(stroke.line())) return false;
  const Point from = pointOf(mark.from), to = pointOf(mark.to);
  const double squaredReach = double{reach} * double{reach};
  const Qelt::PointF* const points = stroke.GetPoint();
  Point last = pointOf(points[0]);
  if (squaredDistance(last, from, to) <= squaredReach) return true;
  for (std::size_t i = 1; i < stroke.size(); ++i) {
    const Point next = pointOf(points[i]);
    if (squaredDistance(last, next, from, to) <= squaredReach) return true;
    last = next;
  }
  return false;
}

}  // namespace QeltDesktop
