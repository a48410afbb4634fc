#include "play/PageLayout.h"

#include <algorithm>
#include <cmath>
#include <numbers>

namespace QeltDesktop {
namespace {

struct Turn {
  double sine, cosine;
};

// Quarter turns are exact, so that no row of half-covered pixels appears at the picture's edge.
Turn turnBy(float degrees) {
  const double turned = std::remainder(static_cast<double>(degrees), 360.0);
  if (turned == 0.0) return {0.0, 1.0};
  if (turned == 90.0) return {1.0, 0.0};
  if (turned == -90.0) return {-1.0, 0.0};
  if (std::abs(turned) == 180.0) return {0.0, -1.0};
  const double radians = turned * std::numbers::pi / 180.0;
  return {std::sin(radians), std::cos(radians)};
}

}  // namespace

float pageMargin(float largestPenSize, float outlineSize) {
  const auto counted = [](float size) { return std::isfinite(size) && size > 0.0f ? size : 0.0f; };
  return std::min(16.0f + 2.0f * counted(largestPenSize) + counted(outlineSize), 512.0f);
}

PageArea pageArea(const Page& page, const std::optional<PageSize>& size, float margin) {
  if (size) return {0.0f, 0.0f, size->width, size->height};
  const Sample first = page.strokes.front().samples.front();
  float left = first.x, top = first.y, right = first.x, bottom = first.y;
  for (const Stroke& stroke : page.strokes) {
    for (const Sample& sample : stroke.samples) {
      left = std::min(left, sample.x);
      top = std::min(top, sample.y);
      right = std::max(right, sample.x);
      bottom = std::max(bottom, sample.y);
    }
  }
  return {left - margin, top - margin, right - left + 2.0f * margin, bottom - top + 2.0f * margin};
}

PageLayout layOut(const PageArea& area, float zoom, float degrees) {
  const Turn turn = turnBy(degrees);
  const double sine = turn.sine * zoom;
  const double cosine = turn.cosine * zoom;
  const double width = area.width * std::abs(cosine) + area.height * std::abs(sine);
  const double height = area.width * std::abs(sine) + area.height * std::abs(cosine);
  const double centreX = area.left + area.width * 0.5;
  const double centreY = area.top + area.height * 0.5;
  PageLayout layout{.matrix = {}, .width = width, .height = height};
  layout.matrix[0] = static_cast<float>(cosine);
  layout.matrix[1] = static_cast<float>(sine);
  layout.matrix[3] = static_cast<float>(-sine);
  layout.matrix[4] = static_cast<float>(cosine);
  layout.matrix[6] = static_cast<float>(width * 0.5 - (cosine * centreX - sine * centreY));
  layout.matrix[7] = static_cast<float>(height * 0.5 - (sine * centreX + cosine * centreY));
  return layout;
}

}  // namespace QeltDesktop
