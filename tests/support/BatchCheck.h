#pragma once

#include <cmath>
#include <cstddef>
#include <string_view>
#include <typeinfo>
#include <vector>

#include "desktop/pencommon/BatchObserver.h"
#include "pencommon/PenDrawableRT.h"

namespace QeltTests {

// Floats in one vertex of a render drawable's batches, told by its class.
inline std::size_t floatsPerVertex(const Qelt::PenDrawableRT& drawable) {
  const std::string_view name = typeid(drawable).name();
  const auto is = [name](std::string_view part) { return name.find(part) != std::string_view::npos; };
  if (is("OutlineDrawableRT")) return 7;
  if (is("StrokeDrawableRTV3") || is("PredictionDrawableRT")) return 11;
  return 9;
}

// What no pen may hand over, whatever it was told to draw; null where the batch is in order.
inline const char* faultOf(const QeltDesktop::Batch& batch) {
  const std::size_t stride = floatsPerVertex(*batch.drawable);
  const std::string_view name = typeid(*batch.drawable).name();
  // Kept: a preview's ramps may run past their targets; a prediction ahead of any stroke takes over the
  // record's -1 for "no stamp yet", a third of which it hands over.
  const bool overshoots = name.find("PreviewDrawableRT") != std::string_view::npos;
  const float lowestAlpha = name.find("PredictionDrawableRT") != std::string_view::npos ? -1.0f / 3.0f : 0.0f;
  for (const std::vector<float>& buffer : batch.buffers) {
    if (buffer.size() % (6 * stride) != 0) return "a batch that is not of whole stamps";
    for (std::size_t at = 0; at < buffer.size(); at += 6 * stride) {
      const float* const first = buffer.data() + at;
      for (std::size_t i = 0; i < 6 * stride; ++i) {
        if (!std::isfinite(first[i])) return "a vertex that is not finite";
      }
      const float* const last = first + 5 * stride;
      if (overshoots) continue;
      if (first[0] > last[0] || first[1] > last[1]) return "a stamp with its edges crossed";
      // An outline's vertices have no alpha.
      if (stride > 7 && first[4] < lowestAlpha) return "a negative alpha";
      if (stride == 11 && first[10] < 0.0f) return "a negative alpha by width";
    }
  }
  return nullptr;
}

}  // namespace QeltTests
