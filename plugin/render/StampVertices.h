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
  float alpha;      // opacity factor; an outline's has none
  float tiltBlend;  // narrowing: 0 none
  float tile;       // stamp shape 0, 1 or 2; an outline's has none
  Vector2<float> direction;
};

// Where a stamp's square lies, and how its rim is smoothed.
struct StampQuad {
  float left, top, right, bottom;
  float innerRadius;   // where the rim's ramp begins, 0.5 at the rim; version 3 vertices only
  float alphaByWidth;  // what a stamp widened to half a pixel is dimmed by; version 3 vertices only
};

// How far a stamp's square reaches from its centre, and how its rim is smoothed: all that its size decides.
struct StampExtent {
  float x, y;
  float innerRadius, alphaByWidth;
};

// A square of side `width`.
inline StampExtent squareExtent(float width) {
  const float half = width * 0.5f;
  return {half, half, 0.0f, 1.0f};
}

// A square of the given half width, with a margin of half a device pixel for the rim. A stamp thinner than
// half a pixel is widened to that and dimmed in proportion; what has no width left to widen, or does not fit
// into a float, is invisible. `inverseScale`: stroke units a device pixel, positive.
inline StampExtent antialiasedExtent(float halfWidth, Vector2<float> inverseScale) {
  constexpr float kMostPixels = 1e37f;
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
  // Written so that it also holds where the widening above made NaN of a: b is then NaN or infinite.
  if (!(m <= kMostPixels)) return {inverseScale.x, inverseScale.y, 0.0f, 0.0f};
  const float innerRadius = (m - 1.0f) / m * 0.5f;
  return {inverseScale.x * a, inverseScale.y * b, innerRadius, alphaByWidth};
}

inline StampQuad stampQuad(Vector2<float> centre, const StampExtent& extent) {
  return {centre.x - extent.x, centre.y - extent.y, centre.x + extent.x,
          centre.y + extent.y, extent.innerRadius,  extent.alphaByWidth};
}

// Makes room for `count` stamps more, at least doubling so that a long redraw stays linear.
inline void reserveStamps(std::vector<float>* buffer, int count, std::size_t floatsPerStamp) {
  if (buffer == nullptr) return;
  const std::size_t needed = buffer->size() + static_cast<std::size_t>(count) * floatsPerStamp;
  if (needed > buffer->capacity()) buffer->reserve(std::max(needed, 2 * buffer->capacity()));
}

// Writes the vertices of a stamp, 6 * Stride floats: 9 a vertex (corner x, y, u, v; alpha, blend, tile;
// direction), 11 (then inner radius and alpha by width), or an outline's 7 (corner x, y, u, v; blend;
// direction). In 16-byte stores that overlap from vertex to vertex: twice as fast here as float by float, see
// docs/performance.md.
template <std::size_t Stride>
void writeStamp(float* out, const StampQuad& q, const StampLook& look) {
  static_assert(Stride == 7 || Stride == 9 || Stride == 11);
  using Four [[gnu::vector_size(16), gnu::aligned(4), gnu::may_alias]] = float;
  const Four corners[6] = {{q.left, q.top, 0.0f, 1.0f},    {q.left, q.bottom, 0.0f, 0.0f},
                           {q.right, q.top, 1.0f, 1.0f},   {q.right, q.top, 1.0f, 1.0f},
                           {q.left, q.bottom, 0.0f, 0.0f}, {q.right, q.bottom, 1.0f, 0.0f}};
  if constexpr (Stride == 7) {
    const Four rest = {look.tiltBlend, look.direction.x, look.direction.y, 0.0f};
    for (int i = 0; i < 6; ++i, out += Stride) {
      *reinterpret_cast<Four*>(out) = corners[i];
      if (i < 5) {
        *reinterpret_cast<Four*>(out + 4) = rest;  // its last lane is where the next vertex begins
      } else {
        out[4] = rest[0];
        out[5] = rest[1];
        out[6] = rest[2];
      }
    }
    return;
  }
  const Four common = {look.alpha, look.tiltBlend, look.tile, look.direction.x};
  const Four rest = {look.direction.y, q.innerRadius, q.alphaByWidth, 0.0f};
  for (int i = 0; i < 6; ++i, out += Stride) {
    *reinterpret_cast<Four*>(out) = corners[i];
    *reinterpret_cast<Four*>(out + 4) = common;
    if (Stride == 11 && i < 5) {
      *reinterpret_cast<Four*>(out + 8) = rest;  // its last lane is where the next vertex begins
    } else {
      out[8] = rest[0];
      if constexpr (Stride == 11) {
        out[9] = rest[1];
        out[10] = rest[2];
      }
    }
  }
}

// Appends stamps to a batch in blocks, so that each stamp is written once into a block that stays in the
// cache and the batch grows by whole blocks. The batch holds all stamps only after `flush`.
template <std::size_t Stride>
class StampAppender {
 public:
  // Makes room for `stamps` of them; throws std::bad_alloc before anything is changed. Without a batch all
  // stamps are dropped.
  StampAppender(std::vector<float>* batch, int stamps) : mBatch(batch) {
    reserveStamps(batch, stamps, kFloats);
  }
  StampAppender(const StampAppender&) = delete;
  StampAppender& operator=(const StampAppender&) = delete;

  void add(const StampQuad& quad, const StampLook& look) {
    writeStamp<Stride>(mEnd, quad, look);
    mEnd += kFloats;
    if (mEnd == mBlock + sizeof mBlock / sizeof *mBlock) flush();
  }

  void flush() {
    if (mBatch != nullptr) mBatch->insert(mBatch->end(), mBlock, mEnd);
    mEnd = mBlock;
  }

 private:
  static constexpr std::size_t kFloats = 6 * Stride;

  std::vector<float>* mBatch;
  float* mEnd = mBlock;
  alignas(64) float mBlock[16 * kFloats];
};

}  // namespace Qelt
