#include "core/PixelArea.h"

#include <cmath>

namespace QeltDesktop {

PixelArea pixelsOf(const Qelt::RectF& box, float reach, const PageView& view, int width, int height) {
  constexpr double kRim = 2.0;  // pixels
  const auto within = [](double pixel, int size) {
    return static_cast<int>(std::clamp(pixel, 0.0, static_cast<double>(size)));
  };
  const double grown = reach;
  const PixelArea area{within(std::floor(view.zoom * (box.left - grown) + view.x - kRim), width),
                       within(std::floor(view.zoom * (box.top - grown) + view.y - kRim), height),
                       within(std::ceil(view.zoom * (box.right + grown) + view.x + kRim), width),
                       within(std::ceil(view.zoom * (box.bottom + grown) + view.y + kRim), height)};
  return isEmpty(area) ? PixelArea{} : area;
}

}  // namespace QeltDesktop
