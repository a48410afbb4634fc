#pragma once

#include <gtest/gtest.h>

#include <cmath>
#include <cstddef>
#include <set>
#include <string>
#include <vector>

#include "pen/RenderingVersions.h"

namespace QeltTests {

// The row of a rendering version that the list has.
inline const Qelt::RenderingVersion& rowOf(int version) {
  return Qelt::kRenderingVersions.at(static_cast<std::size_t>(version - 1));
}

// What boards draw with unless a test names a version: the newest one when the tests' numbers were worked
// out. It stays when a newer one comes.
inline constexpr int kUsualVersion = 8;

// What tests expect of a rendering version, worked out on paper and taken from no row of the plug-in's. What
// a row leaves out is as in version 3.
struct ExpectedVersion {
  int number;
  // Of fingers, mice, and a stylus on a touch screen: the pressure they are given, and how long a move must
  // be so that it is never left out, stroke units.
  float unknownPressure = 0.5f, shortMove = 50.0f;
  float tiltCap = 0.79f;  // radians

  // The pen of VersionsTest: size 10, colour alpha 80 (so that alpha / 80 is 1), tilt 0.77.
  //   Half the drawn width, upright and tilted. Tilt blend 0.02 / 0.08 = 0.25, width 10 * (1 + 1.5 * 0.25) =
  //   13.75; in version 5 the blend is 0.72 / 1.9 = 0.3789474 and the width 10 + 50 * 0.3789474 = 28.947368.
  //   Versions 4, 6 and 7 add 1 to the width; version 8 half a pixel to the half width.
  float halfStart = 5.0f, halfTarget = 6.875f, blend = 0.25f;
  //   Alphas handed over at pressures 0.4, 0.5, 0.6 and 0.8: their squares, in version 1 at most 0.36; in
  //   version 8 at least 0.25, times 15 / 10, over 6. What is published is not divided yet.
  float alpha[4] = {0.16f, 0.25f, 0.36f, 0.64f}, alphaDivisor = 1.0f;
  float tapAlpha = 0.25f;  // at `unknownPressure`
  float tapReach = 5.0f;   // of the rectangle of an upright tap, around its point, before it is grown
  //   From stamp to stamp, stroke units; 0 where stamps divide each segment evenly. Where it follows the
  //   size, it is taken as the pen goes down, and a stroke begun at no size stays empty.
  float spacing = 0.0f;
  bool spacingFollowsSize = false;
  //   Stamps of the three segments, of lengths 4.2, 4.1 and 3.0 (straight) and 4.2, 8.3 and 7.8 (curve); of
  //   the closing segment of a stored stroke, which has no length; and of a recorded event, 8.4.
  //   Versions 1 and 2: trunc(40 / 10) = 4 and a quarter of the length: 5.05, 5.025, 4.75; 5.05, 6.075, 5.95;
  //   dropped; 6.1. Versions 3 to 7: 0.8 times the length: 3.36, 3.28, 2.4; 3.36, 6.64, 6.24; 1 at
  //   least; 6.72. Version 8, every 0.4: from 0.4 to 4.0, from 0.2 to 3.8, from 0.1 to 2.9; from 0.4 to 4.0,
  //   from 0.2 to 8.2, from 0.3 to 7.5; the next would lie 0.1 further; from 0.2 to 8.2.
  int straight[3] = {3, 3, 2}, curve[3] = {3, 6, 6}, storedEnd = 1, recordedEnd = 6;

  // The size of a pen whose stamps are opaque under full pressure and alpha.
  float denseSize = 12.0f;
  // The widest stamps that TileBordersTest draws: what the rectangles of live strokes and of redraws reach.
  float widestLive = 9.0f, widestRedraw = 9.0f;
  bool logsLargeCounts = false;
  bool publishes = false;    // tells the prediction where the stroke stands, on curves
  bool followsView = false;  // smooths the rims of stamps by the view's scale
  int renderDrawable = 1;    // drawn by Pencil2StrokeDrawableRTV...

  // Where the first stamp lies on a segment that begins so far along the stroke.
  float firstStampAt(float along) const {
    return spacing > 0.0f ? spacing - std::fmod(along, spacing) : 0.0f;
  }
};

inline constexpr ExpectedVersion kExpectedVersions[] = {
    {.number = 1,
     .alpha = {0.16f, 0.25f, 0.36f, 0.36f},
     .straight = {5, 5, 4},
     .curve = {5, 6, 5},
     .storedEnd = 0},
    {.number = 2, .straight = {5, 5, 4}, .curve = {5, 6, 5}, .storedEnd = 0},
    {.number = 3},
    {.number = 4,
     .halfStart = 5.5f,
     .halfTarget = 7.375f,
     .tapReach = 5.5f,
     .logsLargeCounts = true,
     .publishes = true},
    {.number = 5, .tiltCap = 1.0f, .halfTarget = 14.473684f, .blend = 0.3789474f},
    {.number = 6,
     .halfStart = 5.5f,
     .halfTarget = 7.375f,
     .tapReach = 5.5f,
     .logsLargeCounts = true,
     .publishes = true},
    {.number = 7,
     .halfStart = 5.5f,
     .halfTarget = 7.375f,
     .tapReach = 5.5f,
     .logsLargeCounts = true,
     .publishes = true,
     .renderDrawable = 2},
    {.number = 8,
     .unknownPressure = 0.6f,
     .shortMove = 20.0f,
     .halfStart = 5.5f,
     .halfTarget = 7.375f,
     .alpha = {0.0625f, 0.0625f, 0.09f, 0.16f},
     .alphaDivisor = 6.0f,
     .tapAlpha = 0.09f,
     .spacing = 0.4f,
     .straight = {10, 10, 8},
     .curve = {10, 21, 19},
     .storedEnd = 0,
     .recordedEnd = 21,
     .denseSize = 4.5f,
     .widestLive = 12.0f,
     .widestRedraw = 20.0f,
     .publishes = true,
     .followsView = true,
     .renderDrawable = 3},
};
static_assert(std::size(kExpectedVersions) == Qelt::kRenderingVersions.size(),
              "a rendering version has no row in kExpectedVersions: what do tests expect of it?");

inline const ExpectedVersion& expectedOf(int version) {
  return kExpectedVersions[static_cast<std::size_t>(rowOf(version).number - 1)];
}

// Every rendering version a pen can have.
inline std::vector<int> allVersions() {
  std::vector<int> all;
  for (const Qelt::RenderingVersion& row : Qelt::kRenderingVersions) all.push_back(row.number);
  return all;
}
inline int newestVersion() {
  return Qelt::kRenderingVersions.back().number;
}

// The first version that each of the strokes' render drawables draws.
inline std::vector<int> versionsOfRenderDrawables() {
  std::vector<int> first;
  for (const ExpectedVersion& row : kExpectedVersions) {
    if (row.renderDrawable > static_cast<int>(first.size())) first.push_back(row.number);
  }
  return first;
}

// Every version of an outline.
inline std::vector<int> outlineVersions() {
  std::set<int> all;
  for (const Qelt::RenderingVersion& row : Qelt::kRenderingVersions) all.insert(row.outlineVersion);
  return {all.begin(), all.end()};
}

// Floats in one vertex of a stroke's batch.
inline int strideOf(int version) {
  return rowOf(version).floatsPerVertex;
}

// The name of a test of one version.
inline std::string versionName(const testing::TestParamInfo<int>& test) {
  return "Version" + std::to_string(test.param);
}

}  // namespace QeltTests
