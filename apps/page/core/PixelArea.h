#pragma once

#include <algorithm>
#include <cstddef>

#include "base/RectF.h"
#include "core/PageTypes.h"

namespace QeltDesktop {

// Pixels of the window.
using PixelArea = Qelt::Rect;

inline bool isEmpty(const PixelArea& area) {
  return area.left >= area.right || area.top >= area.bottom;
}

inline PixelArea common(const PixelArea& a, const PixelArea& b) {
  const PixelArea area{std::max(a.left, b.left), std::max(a.top, b.top), std::min(a.right, b.right),
                       std::min(a.bottom, b.bottom)};
  return isEmpty(area) ? PixelArea{} : area;
}

inline bool meet(const PixelArea& a, const PixelArea& b) {
  return !isEmpty(common(a, b));
}

inline bool holds(const PixelArea& outer, const PixelArea& inner) {
  return isEmpty(inner) || (outer.left <= inner.left && outer.top <= inner.top &&
                            outer.right >= inner.right && outer.bottom >= inner.bottom);
}

// The smallest area that holds both.
inline PixelArea united(const PixelArea& a, const PixelArea& b) {
  if (isEmpty(a)) return b;
  if (isEmpty(b)) return a;
  return {std::min(a.left, b.left), std::min(a.top, b.top), std::max(a.right, b.right),
          std::max(a.bottom, b.bottom)};
}

// The pixels of a window that a box of the page, grown by `reach` and by two pixels, covers.
PixelArea pixelsOf(const Qelt::RectF& box, float reach, const PageView& view, int width, int height);

}  // namespace QeltDesktop
