#pragma once

#include "base/PointF.h"

namespace QeltDesktop {

class PageStroke;

// Where an eraser went: within `radius` of a line. Stroke units.
struct EraserMark {
  Qelt::PointF from, to;
  float radius;
};

// Whether it is finite and near enough; a radius is not below 0.
bool isUsable(const EraserMark& mark);

// Whether the mark touches the line of a stroke, which is as wide as its pen.
bool isHit(const PageStroke& stroke, const EraserMark& mark);

}  // namespace QeltDesktop
