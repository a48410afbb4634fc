#pragma once

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <vector>

#include "base/Vector.h"
#include "gl/GraphicsFactory.h"
#include "gl/VertexDescriptor.h"

// How one stamp becomes two triangles: six vertices of a square around its centre, in the order
//
//     0 (u 0, v 1) --- 2, 3 (1, 1)
//          |         /      |
//     1, 4 (0, 0) ------ 5 (1, 0)        y down
//
// All lengths in stroke units.
namespace Qelt {

// What a vertex holds: the floats of each attribute, in the order of the shader's locations.
struct VertexLayout {
  std::array<int, 4> attributes;  // 0 where there is none

  constexpr std::size_t floats() const {
    std::size_t sum = 0;
    for (const int floats : attributes) sum += static_cast<std::size_t>(floats);
    return sum;
  }
};

// Corner x, y, u, v; alpha, tilt blend, stamp shape; direction.
inline constexpr VertexLayout kSquareVertex{{4, 3, 2}};
// The same; then inner radius and alpha by width.
inline constexpr VertexLayout kAntialiasedVertex{{4, 3, 2, 2}};
// Corner x, y, u, v; tilt blend; direction.
inline constexpr VertexLayout kOutlineVertex{{4, 1, 2}};

// A vertex object for triangles; null if the host could not make one. Render thread.
inline GraphicsObject* createStampObject(const VertexLayout& layout) {
  VertexDescriptor descriptor;
  for (const int floats : layout.attributes) {
    if (floats > 0) descriptor.addAttribute(AttributeType::Float, floats, -1);
  }
  return GraphicsFactory::createGraphicsObject(1, GraphicsFactory::kTriangles, descriptor, 0, 0);
}

// What every vertex of a stamp carries besides its corner.
struct StampLook {
  float alpha;      // an outline's has none
  float tiltBlend;  // 0: upright
  float tile;       // which of the three stamp shapes, 0 to 2; an outline's has none
  Vector2<float> direction;
};

// Where a stamp's square lies, and how its rim is smoothed.
struct StampQuad {
  float left, top, right, bottom;
  // Of anti-aliased vertices alone.
  float innerRadius;   // where the rim's fade begins, in texture units from the centre; the rim ends at 0.5
  float alphaByWidth;  // factor that dims a stamp widened to one pixel; else 1, or 0 to hide the stamp
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

// A square of the given half width, with a margin of half a device pixel for the rim. A stamp less than one
// pixel wide is widened to one pixel and dimmed in proportion. A stamp that has no width left to widen, or
// whose extent does not fit into a float, is made invisible. `inverseScale`: stroke units per device pixel,
// positive.
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

// Makes room for `count` more stamps, at least doubling so that a long redraw stays linear.
inline void reserveStamps(std::vector<float>* buffer, int count, std::size_t floatsPerStamp) {
  if (buffer == nullptr) return;
  const std::size_t needed = buffer->size() + static_cast<std::size_t>(count) * floatsPerStamp;
  if (needed > buffer->capacity()) buffer->reserve(std::max(needed, 2 * buffer->capacity()));
}

// Writes the vertices of a stamp, 6 * Stride floats, where Stride is that of one of the layouts above. The
// 16-byte stores overlap from vertex to vertex, which is twice as fast as float by float; see
// docs/performance.md.
template <std::size_t Stride>
void writeStamp(float* out, const StampQuad& q, const StampLook& look) {
  constexpr bool kOutline = Stride == kOutlineVertex.floats();
  constexpr bool kAntialiased = Stride == kAntialiasedVertex.floats();
  static_assert(kOutline || kAntialiased || Stride == kSquareVertex.floats());
  using Four [[gnu::vector_size(16), gnu::aligned(4), gnu::may_alias]] = float;
  const Four corners[6] = {{q.left, q.top, 0.0f, 1.0f},    {q.left, q.bottom, 0.0f, 0.0f},
                           {q.right, q.top, 1.0f, 1.0f},   {q.right, q.top, 1.0f, 1.0f},
                           {q.left, q.bottom, 0.0f, 0.0f}, {q.right, q.bottom, 1.0f, 0.0f}};
  if constexpr (kOutline) {
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
    if (kAntialiased && i < 5) {
      *reinterpret_cast<Four*>(out + 8) = rest;  // its last lane is where the next vertex begins
    } else {
      out[8] = rest[0];
      if constexpr (kAntialiased) {
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
  // Makes room for so many stamps. Throws std::bad_alloc before anything is changed. Without a batch all
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
