#include "BenchStroke.h"

#include <cmath>

#include "engine/MotionEvent.h"

namespace QeltBench {

std::unique_ptr<QeltDesktop::StoredStroke> makeStroke(int points, float x, float y) {
  auto stroke = std::make_unique<QeltDesktop::StoredStroke>(Qelt::kToolStylus);
  stroke->reserve(points);
  for (int i = 0; i < points; ++i) {
    const float phase = 0.3f * static_cast<float>(i);
    // A spiral of nearly constant speed, so that strokes of any length stay on a page.
    const float radius = 30.0f + 0.05f * static_cast<float>(i);
    const float angle = 10.0f * static_cast<float>(i) / radius;
    stroke->addPoint({x + radius * std::cos(angle), y + radius * std::sin(angle)}, 4 * i,
                     0.6f + 0.2f * std::sin(phase), 0.4f, 0.5f);
  }
  return stroke;
}

}  // namespace QeltBench
