#pragma once

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <vector>

#include "base/Vector.h"

// How one stamp becomes two triangles: six vertices of a square around its centre, in the order
//
//     0 (u 0, v 1) --- 2, 3 (1, 1)
//          |         /      |
//     1, 4 (0, 0) ------ 5 (1, 0)        y down
//
// All lengths in stroke units.
namespace Qelt {

// What every vertex of a stamp carries besides its corner.
struct StampLook {
  float alpha;      // opacity factor
  float tiltBlend;  // narrowing: 0 none
  float tile;       // stamp shape 0, 1 or 2
  Vector2<float> direction;
};

// Where a stamp's square lies, and how its rim is smoothed.
struct StampQuad {
  float left, top, right, bottom;
  float innerRadius;   // where the rim's ramp begins, 0.5 at the rim; version 3 vertices only
  float alphaByWidth;  // what a stamp widened to half a pixel is dimmed by; version 3 vertices only
};

// A square of side `width`.
inline StampQuad squareQuad(Vector2<float> centre, float width) {
  const float half = width * 0.5f;
  return {centre.x - half, centre.y - half, centre.x + half, centre.y + half, 0.0f, 1.0f};
}

// A square of the given half width, with a margin of half a device pixel for the rim. A stamp thinner than
// half a pixel is widened to that and dimmed in proportion. `inverseScale`: stroke units a device pixel,
// positive.
inline StampQuad antialiasedQuad(Vector2<float> centre, float halfWidth, Vector2<float> inverseScale) {
  float a = halfWidth / inverseScale.x;
  float b = halfWidth / inverseScale.y;
  const float thinner = a < b ? a : b;
  float alphaByWidth = 1.0f;
  if (thinner < 0.5f) {
    const float k = 0.5f / thinner;
    alphaByWidth = 1.0f / k;
    a *= k;
    b *= k;
  }
  a += 0.5f;
  b += 0.5f;
  const float m = std::max(a, b);
  const float innerRadius = (m - 1.0f) / m * 0.5f;
  const float halfX = inverseScale.x * a;
  const float halfY = inverseScale.y * b;
  return {centre.x - halfX, centre.y - halfY, centre.x + halfX, centre.y + halfY, innerRadius, alphaByWidth};
}

// The vertices of a stamp, `Stride` floats each: 9 (corner x, y, u, v; alpha, blend, tile; direction), or 11
// (then inner radius and alpha by width).
template <std::size_t Stride>
std::array<float, 6 * Stride> stampVertices(const StampQuad& q, const StampLook& look) {
  static_assert(Stride == 9 || Stride == 11);
  const float corners[6][4] = {{q.left, q.top, 0.0f, 1.0f},    {q.left, q.bottom, 0.0f, 0.0f},
                               {q.right, q.top, 1.0f, 1.0f},   {q.right, q.top, 1.0f, 1.0f},
                               {q.left, q.bottom, 0.0f, 0.0f}, {q.right, q.bottom, 1.0f, 0.0f}};
  std::array<float, 6 * Stride> vertices;
  float* out = vertices.data();
  for (const auto& corner : corners) {
    out[0] = corner[0];
    out[1] = corner[1];
    out[2] = corner[2];
    out[3] = corner[3];
    out[4] = look.alpha;
    out[5] = look.tiltBlend;
    out[6] = look.tile;
    out[7] = look.direction.x;
    out[8] = look.direction.y;
    if constexpr (Stride == 11) {
      out[9] = q.innerRadius;
      out[10] = q.alphaByWidth;
    }
    out += Stride;
  }
  return vertices;
}

// Makes room for `count` stamps more, at least doubling so that a long redraw stays linear. Throws
// std::bad_alloc before anything is changed.
inline void reserveStamps(std::vector<float>* buffer, std::size_t count, std::size_t floatsPerStamp) {
  if (buffer == nullptr) return;
  const std::size_t needed = buffer->size() + count * floatsPerStamp;
  if (needed > buffer->capacity()) buffer->reserve(std::max(needed, 2 * buffer->capacity()));
}

}  // namespace Qelt
