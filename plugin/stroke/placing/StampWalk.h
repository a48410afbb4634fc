#pragma once

#include <algorithm>
#include <cmath>

#include "graphics/SmPath.h"
#include "stroke/StrokeRules.h"

// Walks along the path of one segment and places stamps. Distances are in stroke units.
namespace Qelt {

// No walk places more stamps than this on one segment. At version 8's spacing of 0.4 units that takes a
// single straight move of a hundred thousand units, some fifty screens: only broken input gets there.
inline constexpr int kMostStampsPerSegment = 262144;

struct WalkResult {
  float carry;    // how far into the next segment its first stamp lies; 0 after an even walk
  bool cutShort;  // whether the walk ended before the path did
  int stamps;     // how many were placed or passed over
};

// At most how many stamps a spaced walk will place.
inline int spacedStamps(float first, float spacing, float length) {
  if (!(first <= length)) return 0;
  // One more than the quotient for the stamp at its start, one more for rounding.
  const int count = rules::saturatedCount((length - first) / spacing);
  return std::min(count, kMostStampsPerSegment - 2) + 2;
}

// Calls place(point) every `spacing` along the path, from distance `first` on, at most `most` times; after
// that it calls place.passOver(distance) instead. A walk that cannot advance, or meets the bound of a
// segment, returns as if its last stamp lay at the end of the path.
template <typename Place>
WalkResult walkSpaced(const SmPath& path, float first, float spacing, float length, int most, Place&& place) {
  const int bound = std::min(most, kMostStampsPerSegment);
  float distance = first;
  int stamps = 0;
  const auto goesOn = [&distance, spacing] {
    const float next = distance + spacing;
    const bool isFarther = next > distance;
    distance = next;
    return isFarther;
  };
  for (; distance <= length && stamps < bound; ++stamps) {
    SmPoint at;
    if (path.getPosTan(distance, &at, nullptr)) place(at);
    if (!goesOn()) return {spacing, true, stamps + 1};
  }
  for (; distance <= length && stamps < kMostStampsPerSegment; ++stamps) {
    place.passOver(distance);
    if (!goesOn()) return {spacing, true, stamps + 1};
  }
  if (distance <= length) return {spacing, true, stamps};
  const float carry = distance - length;
  if (!std::isfinite(carry)) return {spacing, true, stamps};
  return {carry, false, stamps};
}

// Calls place(point) `count` times at even distances, from the path's start on to one step before its end;
// after `most` of them it calls place.passOver(distance) instead. Stops early where the path has no position.
// Only the bound of a segment cuts it short.
template <typename Place>
WalkResult walkEvenly(const SmPath& path, int count, float length, int most, Place&& place) {
  const float step = length / static_cast<float>(count);
  const int stamps = std::min(count, kMostStampsPerSegment);
  const int bound = std::min(most, stamps);
  int i = 0;
  for (; i < bound; ++i) {
    SmPoint at;
    if (!path.getPosTan(static_cast<float>(i) * step, &at, nullptr)) return {0.0f, stamps < count, i};
    place(at);
  }
  for (; i < stamps; ++i) place.passOver(static_cast<float>(i) * step);
  return {0.0f, stamps < count, stamps};
}

}  // namespace Qelt
