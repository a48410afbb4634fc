#pragma once

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <cstring>
#include <utility>
#include <vector>

#include "base/Vector.h"
#include "gl/GraphicsFactory.h"
#include "gl/VertexDescriptor.h"
#include "graphics/SmPath.h"

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

// Four floats that are computed together.
using Four [[gnu::vector_size(16)]] = float;

// Writes four floats anywhere.
inline void storeFour(float* out, Four four) {
  using FourAnywhere [[gnu::vector_size(16), gnu::aligned(4), gnu::may_alias]] = float;
  *reinterpret_cast<FourAnywhere*>(out) = four;
}

// Two points side by side. x and y of each are loaded as one.
inline Four sideBySide(const SmPoint& a, const SmPoint& b) {
  static_assert(sizeof(SmPoint) == sizeof(double));
  using TwoDoubles [[gnu::vector_size(16)]] = double;
  double first, second;
  std::memcpy(&first, &a, sizeof first);
  std::memcpy(&second, &b, sizeof second);
  return reinterpret_cast<Four>(TwoDoubles{first, second});
}

// The stamp shapes, which take turns along a stroke. An outline's stamps have none.
inline constexpr int kStampShapes = 3;

// Stamps in a row, as the walk places them: `count` of each.
struct PlacedStamps {
  int count;
  const SmPoint* centres;
  const float* sizes;   // their widths, or half of that where they are anti-aliased
  const float* alphas;  // not looked at for an outline's, which have none
  int shape;            // of the first, 0 to 2; likewise
};

// What they have in common.
struct StampPose {
  float tiltBlend;           // 0: upright
  Vector2<float> direction;  // (-sin a, cos a)
};

// How far a stamp's square reaches from its centre, and how its rim is smoothed: all that its size decides.
struct StampExtent {
  float x, y;
  // Of anti-aliased vertices alone.
  float innerRadius;   // where the rim's fade begins, in texture units from the centre; the rim ends at 0.5
  float alphaByWidth;  // factor that dims a stamp widened to one pixel; else 1, or 0 to hide the stamp
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

// How many floats a stamp's last store reaches past it (StampWriter).
inline constexpr std::size_t kPastLast = 1;

// Makes room for so many floats in all, at least doubling so that a long redraw stays linear.
inline void reserveFloats(std::vector<float>& batch, std::size_t floats) {
  if (floats > batch.capacity()) batch.reserve(std::max(floats, 2 * batch.capacity()));
}

// Writes the vertices of stamps that are posed alike: 6 * Stride floats each, where Stride is that of one of
// the layouts above. The 16-byte stores overlap from vertex to vertex, and the last one may reach kPastLast
// floats past the stamp: that is twice as fast as float by float; see docs/performance.md.
template <std::size_t Stride>
class StampWriter {
  static constexpr bool kOutline = Stride == kOutlineVertex.floats();
  static constexpr bool kAntialiased = Stride == kAntialiasedVertex.floats();
  static_assert(kOutline || kAntialiased || Stride == kSquareVertex.floats());

 public:
  explicit StampWriter(const StampPose& pose) : mDirectionY(pose.direction.y) {
    for (int shape = 0; shape < kStampShapes; ++shape) {
      mLooks[shape] = kOutline ? Four{pose.tiltBlend, pose.direction.x, pose.direction.y}
                               : Four{0.0f, pose.tiltBlend, static_cast<float>(shape), pose.direction.x};
    }
  }

  // For the stamps written from here on. Before the first of them.
  void setExtent(const StampExtent& extent) {
    mReach = Four{-extent.x, -extent.y, extent.x, extent.y};
    mRest = Four{mDirectionY, extent.innerRadius, extent.alphaByWidth};
  }

  // What follows the corners of a stamp of that shape, and of the next one.
  const Four* look(int shape) const { return mLooks + shape; }
  const Four* lookAfter(const Four* look) const {
    return look == mLooks + kStampShapes - 1 ? mLooks : look + 1;
  }

  void write(float* out, const SmPoint& centre, float alpha, Four look) const {
    const Four edges = sideBySide(centre, centre) + mReach;
    const Four leftTop = __builtin_shufflevector(edges, Four{0.0f, 1.0f}, 0, 1, 4, 5);
    const Four leftBottom = __builtin_shufflevector(edges, Four{0.0f, 0.0f}, 0, 3, 4, 5);
    const Four rightTop = __builtin_shufflevector(edges, Four{1.0f, 1.0f}, 2, 1, 4, 5);
    const Four rightBottom = __builtin_shufflevector(edges, Four{1.0f, 0.0f}, 2, 3, 4, 5);
    const Four corners[6] = {leftTop, leftBottom, rightTop, rightTop, leftBottom, rightBottom};
    if constexpr (!kOutline) look[0] = alpha;
    for (std::size_t i = 0; i < 6; ++i, out += Stride) {
      storeFour(out, corners[i]);
      storeFour(out + 4, look);
      if constexpr (kAntialiased) {
        storeFour(out + 8, mRest);
      } else if constexpr (!kOutline) {
        out[8] = mDirectionY;
      }
    }
  }

 private:
  Four mLooks[kStampShapes];
  float mDirectionY;
  Four mReach{};  // what to add to a centre for left, top, right and bottom
  Four mRest{};   // what follows the look
};

// Appends stamps to a batch. They are written in place: the batch grows at once by all that may come, and at
// the end shrinks by those that did not.
template <std::size_t Stride>
class StampAppender {
 public:
  // Makes room for so many stamps. Throws std::bad_alloc before anything is changed. Without a batch there is
  // room for none.
  StampAppender(std::vector<float>* batch, int stamps) : mBatch(batch) {
    if (batch == nullptr) return;
    mUsed = batch->size();
    grow(stamps);
  }
  ~StampAppender() {
    if (mBatch != nullptr) mBatch->resize(mUsed);
  }
  StampAppender(const StampAppender&) = delete;
  StampAppender& operator=(const StampAppender&) = delete;

  // Makes room for so many from here on, where there is too little. Throws as the constructor does.
  void makeRoom(int stamps) {
    if (mBatch != nullptr && endAfter(stamps) > mBatch->size()) [[unlikely]]
      grow(stamps);
  }

  // Where the next stamps are to be written, which makes room where there is none; null without a batch.
  float* take(int stamps) {
    if (mBatch == nullptr) return nullptr;
    makeRoom(stamps);
    return mBatch->data() + std::exchange(mUsed, mUsed + static_cast<std::size_t>(stamps) * kFloats);
  }

 private:
  static constexpr std::size_t kFloats = 6 * Stride;

  std::size_t endAfter(int stamps) const {
    return mUsed + static_cast<std::size_t>(stamps) * kFloats + kPastLast;
  }
  // In steps of less than 2 KiB: std::vector fills what is new with zeros, and for more than that glibc uses
  // a string instruction, which takes half again as long.
  void grow(int stamps) {
    constexpr std::size_t kStep = 480;  // floats
    const std::size_t end = endAfter(stamps);
    reserveFloats(*mBatch, end);
    while (mBatch->size() < end) mBatch->resize(std::min(mBatch->size() + kStep, end));
  }

  std::vector<float>* mBatch;
  std::size_t mUsed = 0;
};

}  // namespace Qelt
