#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>

#include "graphics/SmPath.h"
#include "stroke/StrokeRules.h"

// Places stamps along the path of one segment. Distances in stroke units.
namespace Qelt {

// No walk places more stamps than this on one segment. At the closest spacing of any version, 0.4 units, it
// is a single straight move of a hundred thousand units, some fifty screens; only broken input comes here.
inline constexpr int kMostStampsPerSegment = 262144;

struct WalkResult {
  float carry;    // where the first stamp of the next segment lies on it
  bool cutShort;  // the walk ended before the path did
};

// How many stamps a spaced walk will place, at the most.
inline std::size_t spacedStamps(float first, float spacing, float length) {
  if (!(first <= length)) return 0;
  // One more than the quotient for the stamp at its start, one more for rounding.
  const int count = rules::saturatedCount((length - first) / spacing);
  return static_cast<std::size_t>(std::min(count, kMostStampsPerSegment - 2)) + 2;
}

// Calls place(point) every `spacing` along the path, from distance `first` on. A walk that cannot go on, or
// has placed too many stamps, ends as if it had ended on its spacing.
template <typename Place>
WalkResult walkSpaced(const SmPath& path, float first, float spacing, float length, Place&& place) {
  float distance = first;
  for (int steps = 0; distance <= length; ++steps) {
    if (steps == kMostStampsPerSegment) return {spacing, true};
    SmPoint at;
    if (path.getPosTan(distance, &at, nullptr)) place(at);
    const float next = distance + spacing;
    if (!(next > distance)) return {spacing, true};
    distance = next;
  }
  const float carry = distance - length;
  return std::isfinite(carry) ? WalkResult{carry, false} : WalkResult{spacing, true};
}

// Calls place(point) `count` times at even distances from the path's start on, one step short of its end;
// stops early where the path has no position. True when the walk was cut short by the bound.
template <typename Place>
bool walkEvenly(const SmPath& path, int count, float length, Place&& place) {
  const float step = length / static_cast<float>(count);
  const int stamps = std::min(count, kMostStampsPerSegment);
  for (int i = 0; i < stamps; ++i) {
    SmPoint at;
    if (!path.getPosTan(static_cast<float>(i) * step, &at, nullptr)) break;
    place(at);
  }
  return stamps < count;
}

}  // namespace Qelt
