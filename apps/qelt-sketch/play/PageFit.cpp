#include "play/PageFit.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <optional>

namespace QeltDesktop {
namespace {

struct Extent {
  double width, height;
};

// Of the turned area, at a zoom of 1.
Extent extentOf(const PageArea& area, float degrees) {
  const PageLayout layout = layOut(area, 1.0f, degrees);
  return {layout.width, layout.height};
}

double zoomInto(const Extent& extent, double width, double height) {
  return std::min(width / extent.width, height / extent.height);
}

}  // namespace

float zoomToFit(const PageArea& area, float degrees, const PixelSize& size) {
  const double exact = zoomInto(extentOf(area, degrees), size.width, size.height);
  using Limits = std::numeric_limits<float>;
  auto zoom = static_cast<float>(
      std::clamp(exact, static_cast<double>(Limits::min()), static_cast<double>(Limits::max())));
  // The float may lie above what fits.
  while (static_cast<double>(zoom) > exact && zoom > Limits::min()) zoom = std::nextafter(zoom, 0.0f);
  return zoom;
}

bool isBelowStrokeUnits(const Page& page) {
  const Sample first = page.strokes.front().samples.front();
  bool isOnePoint = true;
  for (const Stroke& stroke : page.strokes) {
    for (const Sample& sample : stroke.samples) {
      if (std::abs(sample.x) > 1.0f || std::abs(sample.y) > 1.0f) return false;
      isOnePoint = isOnePoint && sample.x == first.x && sample.y == first.y;
    }
  }
  return !isOnePoint;
}

void enlargeToFit(Page& page, Options& options, float margin) {
  // A margin that would leave no room for the page is cut to half of it.
  const auto room = [&](int pixels) {
    return options.page ? pixels : std::max(pixels - 2.0 * margin, pixels / 2.0);
  };
  const Extent extent = extentOf(pageArea(page, options.page, 0.0f), options.rotate);
  const double exact = zoomInto(extent, room(options.fit->width), room(options.fit->height));
  // Beyond this the ink would be no longer finite; it is then drawn smaller than it could be.
  constexpr double kMost = 1e30;
  const auto factor = static_cast<float>(std::min(exact, kMost));
  page.strokes.enlarge(factor);
  if (options.page) options.page = PageSize{options.page->width * factor, options.page->height * factor};
}

}  // namespace QeltDesktop
