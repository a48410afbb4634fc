#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <string_view>
#include <typeinfo>
#include <vector>

#include "desktop/pencommon/BatchObserver.h"
#include "pen/RenderingVersions.h"
#include "pencommon/PenDrawableRT.h"

namespace QeltTests {

// Whether a buffer is of whole stamps with so many floats a vertex: two triangles each, which are one
// rectangle with one set of values.
inline bool isOfStamps(const std::vector<float>& buffer, std::size_t stride) {
  // Vertex by vertex: 0 the left or top edge, 1 the right or bottom one.
  static constexpr int kRight[6] = {0, 0, 1, 1, 0, 1};
  static constexpr int kBottom[6] = {0, 1, 0, 0, 1, 1};
  if (buffer.size() % (6 * stride) != 0) return false;
  for (std::size_t number = 0; number * stride < buffer.size(); ++number) {
    const int right = kRight[number % 6], bottom = kBottom[number % 6];
    const float* const first = &buffer[(number - number % 6) * stride];
    const float* const last = first + 5 * stride;
    const float* const vertex = &buffer[number * stride];
    if (vertex[0] != (right != 0 ? last : first)[0] || vertex[1] != (bottom != 0 ? last : first)[1] ||
        vertex[2] != static_cast<float>(right) || vertex[3] != static_cast<float>(1 - bottom) ||
        !std::equal(vertex + 4, vertex + stride, first + 4)) {
      return false;
    }
  }
  return true;
}

// Floats in a vertex of a buffer: of the layouts that the versions have, the one that fits it; 0 where none
// does.
inline std::size_t strideOf(const std::vector<float>& buffer) {
  std::vector<int> layouts = {Qelt::kOutlineFloatsPerVertex, Qelt::kPreviewFloatsPerVertex,
                              Qelt::kPredictionFloatsPerVertex};
  for (const Qelt::RenderingVersion& row : Qelt::kRenderingVersions) layouts.push_back(row.floatsPerVertex);
  for (const int layout : layouts) {
    if (isOfStamps(buffer, static_cast<std::size_t>(layout))) return static_cast<std::size_t>(layout);
  }
  return 0;
}

// What no pen may hand over, whatever it was told to draw; null where the batch is in order.
inline const char* faultOf(const QeltDesktop::Batch& batch) {
  const std::string_view name = typeid(*batch.drawable).name();
  // Kept: a preview's ramps may run past their targets; a prediction ahead of any stroke takes over the
  // record's -1 for "no stamp yet", a third of which it hands over.
  const bool overshoots = name.find("PreviewDrawableRT") != std::string_view::npos;
  const float lowestAlpha = name.find("PredictionDrawableRT") != std::string_view::npos ? -1.0f / 3.0f : 0.0f;
  for (const std::vector<float>& buffer : batch.buffers) {
    for (const float value : buffer) {
      if (!std::isfinite(value)) return "a vertex that is not finite";
    }
    const std::size_t stride = strideOf(buffer);
    if (stride == 0) return "a batch that is not of whole stamps";
    for (std::size_t at = 0; at < buffer.size() && !overshoots; at += 6 * stride) {
      const float* const first = buffer.data() + at;
      const float* const last = first + 5 * stride;
      if (first[0] > last[0] || first[1] > last[1]) return "a stamp with its edges crossed";
      // An outline's vertices have no alpha.
      if (stride > 7 && first[4] < lowestAlpha) return "a negative alpha";
      if (stride == 11 && first[10] < 0.0f) return "a negative alpha by width";
    }
  }
  return nullptr;
}

}  // namespace QeltTests
