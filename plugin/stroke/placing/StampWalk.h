#pragma once

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <functional>

#include "graphics/SmPath.h"
#include "stroke/StrokeRules.h"

// Walks along the path of one segment and places stamps. Distances are in stroke units.
namespace Qelt {

// No walk places more stamps than this on one segment. At version 8's spacing of 0.4 units that takes a
// single straight move of a hundred thousand units, some fifty screens: only broken input gets there.
inline constexpr int kMostStampsPerSegment = 262144;

// How many stamps a walk hands over at once. Some at a time, because the path is asked for each place by a
// call, across which no register keeps a float: whatever goes on from stamp to stamp would be loaded and
// stored again for each. A multiple of 4.
inline constexpr int kStampsAtOnce = 32;

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

// A walk works out the distances of some stamps, asks the path for their places, writes these where
// run.places() says, and calls run.place(count); see StampRun.

// The places at `count` distances, at most kStampsAtOnce; returns how many there are. Where the path has no
// place, none is written. Out of line, where all that it needs stays in registers.
[[gnu::noinline]] inline int findPlaces(const SmPath& path, const float* distances, int count,
                                        SmPoint* places) {
  SmPoint* next = places;
  for (int i = 0; i < count; ++i) {
    if (path.getPosTan(distances[i], next, nullptr)) [[likely]]
      ++next;
  }
  return static_cast<int>(next - places);
}

// Distances of stamps in a row.
struct Spaced {
  int count;
  float next;   // that of the stamp after them
  bool goesOn;  // whether it lies beyond the last of them
};

// Writes distances `spacing` apart, from `first` on, up to `length`; at least one and at most `room`. Ends
// before the first that does not lie beyond the one before it. Out of line, like findPlaces.
[[gnu::noinline]] inline Spaced spaceOut(float first, float spacing, float length, int room,
                                         float* distances) {
  float* end = distances;
  float distance = first;
  do {
    *end++ = distance;
    distance += spacing;
  } while (end != distances + room && distance <= length);
  const bool goesOn = distance > end[-1];
  // Where one step leads nowhere, so do all that follow: there is no need to look at each.
  if (!goesOn) {
    const float* const stuck = std::adjacent_find(distances, end, std::greater_equal<>());
    if (stuck != end) end = distances + (stuck - distances) + 1;
  }
  return {static_cast<int>(end - distances), distance, goesOn};
}

// Places stamps every `spacing` along the path, from distance `first` on, at most `most` of them; after that
// it calls run.passOver(distance) instead. A walk that cannot advance, or meets the bound of a
// segment, returns as if its last stamp lay at the end of the path.
template <typename Run>
WalkResult walkSpaced(const SmPath& path, float first, float spacing, float length, int most, Run&& run) {
  const int bound = std::min(most, kMostStampsPerSegment);
  std::array<float, kStampsAtOnce> distances;
  float distance = first;
  int stamps = 0;
  while (distance <= length) {
    Spaced some;
    if (stamps < bound) {
      some = spaceOut(distance, spacing, length, std::min(kStampsAtOnce, bound - stamps), distances.data());
      run.place(findPlaces(path, distances.data(), some.count, run.places()));
    } else {
      if (stamps == kMostStampsPerSegment) return {spacing, true, stamps};
      some = {1, distance + spacing, distance + spacing > distance};
      run.passOver(distance);
    }
    stamps += some.count;
    if (!some.goesOn) return {spacing, true, stamps};
    distance = some.next;
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
  std::array<float, kStampsAtOnce> distances;
  int i = 0;
  while (i < bound) {
    const int some = std::min(kStampsAtOnce, bound - i);
    for (int k = 0; k < some; ++k) distances[static_cast<std::size_t>(k)] = static_cast<float>(i + k) * step;
    const int found = findPlaces(path, distances.data(), some, run.places());
    run.place(found);
    i += found;
    if (found < some) return {0.0f, stamps < count, i};
  }
  for (; i < stamps; ++i) run.passOver(static_cast<float>(i) * step);
  return {0.0f, stamps < count, stamps};
}

}  // namespace Qelt
