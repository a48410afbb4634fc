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

// At most how many stamps a spaced walk from `first`, 0 or more, will place. The walk adds the spacing up in
// single precision: each step may be shorter than the spacing by half of the distance between two floats at
// the path's end, though never by more than half, or it would not be a step. That is hundreds of stamps on a
// segment of 60,000 units.
inline int spacedStamps(float first, float spacing, float length) {
  if (!(first <= length)) return 0;
  const float shortest = std::max(spacing - length * 0x1p-24f, spacing * 0.5f);
  // One more than the quotient for the stamp at its start, one more for what is rounded here.
  const int count = rules::saturatedCount((length - first) / shortest);
  return std::clamp(count, 0, kMostStampsPerSegment - 2) + 2;
}

// A walk writes each stamp's place where run.next() says and then calls run.place(); see StampRun.

// Places stamps every `spacing` along the path, from distance `first` on, at most `most` of them; after that
// it calls run.passOver(distance) instead. A walk that cannot advance, or meets the bound of a
// segment, returns as if its last stamp lay at the end of the path.
template <typename Run>
WalkResult walkSpaced(const SmPath& path, float first, float spacing, float length, int most, Run&& run) {
  float distance = first;
  int stamps = 0;
  while (distance <= length) {
    if (stamps == kMostStampsPerSegment) return {spacing, true, stamps};
    if (stamps >= most) {
      run.passOver(distance);
    } else if (path.getPosTan(distance, run.next(), nullptr)) {
      run.place();
    }
    ++stamps;
    const float next = distance + spacing;
    if (!(next > distance)) return {spacing, true, stamps};
    distance = next;
  }
  const float carry = distance - length;
  if (!std::isfinite(carry)) return {spacing, true, stamps};
  return {carry, false, stamps};
}

// Places `count` stamps at even distances, from the path's start on to one step before its end;
// after `most` of them it calls run.passOver(distance) instead. Stops early where the path has no position.
// Only the bound of a segment cuts it short.
template <typename Run>
WalkResult walkEvenly(const SmPath& path, int count, float length, int most, Run&& run) {
  const float step = length / static_cast<float>(count);
  const int stamps = std::min(count, kMostStampsPerSegment);
  const int bound = std::min(most, stamps);
  int i = 0;
  for (; i < bound; ++i) {
    if (!path.getPosTan(static_cast<float>(i) * step, run.next(), nullptr)) return {0.0f, stamps < count, i};
    run.place();
  }
  for (; i < stamps; ++i) run.passOver(static_cast<float>(i) * step);
  return {0.0f, stamps < count, stamps};
}

}  // namespace Qelt
