#pragma once

#include <gmock/gmock.h>

#include <string>
#include <vector>

namespace QeltTests {

// A stamp, read back from its six vertices.
struct Stamp {
  float x = 0.0f, y = 0.0f;                    // centre, stroke units
  float halfWidth = 0.0f, halfHeight = 0.0f;   // stroke units
  float alpha = 0.0f;                          // 0 to 1; not of an outline
  float narrowing = 0.0f;                      // 0 round
  int tile = 0;                                // 0 to 2; not of an outline
  float directionX = 0.0f, directionY = 0.0f;  // unit vector
  float innerRadius = 0.0f;                    // only where a vertex has 11 floats
  float alphaByWidth = 1.0f;                   // only where a vertex has 11 floats
};

std::ostream& operator<<(std::ostream& out, const Stamp& stamp);

// The stamps of a batch with `stride` floats a vertex, 7 of an outline, else 9 or 11. Fails the test when the
// batch does not consist of whole stamps, or a stamp's vertices are not the two triangles of one rectangle
// with one set of values.
std::vector<Stamp> stampsOf(const std::vector<float>& batch, int stride);

// A stamp whose centre lies within `tolerance` of (x, y).
MATCHER_P3(StampNear, x, y, tolerance,
           (negation ? "isn't" : "is") + std::string(" a stamp near (") + testing::PrintToString(x) + ", " +
               testing::PrintToString(y) + ")") {
  const float dx = arg.x - static_cast<float>(x);
  const float dy = arg.y - static_cast<float>(y);
  *result_listener << "which lies " << dx << ", " << dy << " away";
  return dx * dx + dy * dy <= static_cast<float>(tolerance) * static_cast<float>(tolerance);
}

}  // namespace QeltTests
