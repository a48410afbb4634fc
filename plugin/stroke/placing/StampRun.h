#pragma once

#include <algorithm>
#include <array>
#include <cmath>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <utility>

#include "base/RectF.h"
#include "base/Vector.h"
#include "graphics/SmPath.h"
#include "render/StampVertices.h"
#include "stroke/placing/StampWalk.h"

namespace Qelt {

// What placing stamps takes from a row: the drawable's name, for the log; its render drawable; and rules for
// what a stamp is handed over with at the width and alpha that the ramps have reached, and how far it
// reaches. Outlines have no alpha.
template <typename Version>
concept StampRow = requires(float running) {
  { Version::name } -> std::convertible_to<const char*>;
  typename Version::RenderDrawable::Appender;
  { Version::profile.stampSize(running) } -> std::same_as<float>;
  { Version::profile.stampReach(running) } -> std::same_as<float>;
}
&&(Version::profile.isOutline || requires(float running) {
  { Version::profile.stampAlpha(running) } -> std::same_as<float>;
});

// Gathers the squares around the stamps of a segment, so that the caller's rectangle is grown once per
// segment. Growing is minimum and maximum, so the order does not matter. Stroke units.
class DirtyBox {
 public:
  // Takes in `count` squares: their centres, and how far they reach from there. Written so that an edge that
  // is NaN changes nothing.
  void add(const SmPoint* centres, const float* reaches, int count) {
    Four least = mLeast, most = mMost;
    const auto take = [&](Four centre, Four reach) {
      const Four leftTop = centre - reach, rightBottom = centre + reach;
      least = leftTop < least ? leftTop : least;
      most = rightBottom > most ? rightBottom : most;
    };
    int i = 0;
    for (; i + 1 < count; i += 2) {
      take(sideBySide(centres[i], centres[i + 1]),
           Four{reaches[i], reaches[i], reaches[i + 1], reaches[i + 1]});
    }
    if (i < count) {
      take(sideBySide(centres[i], centres[i]), Four{reaches[i], reaches[i], reaches[i], reaches[i]});
    }
    mLeast = least;
    mMost = most;
  }

  void uniteInto(RectF* rect) const {
    const float left = std::min(mLeast[0], mLeast[2]), top = std::min(mLeast[1], mLeast[3]);
    // Added to 0, so that no zero is a negative one.
    const float right = 0.0f + std::max(mMost[0], mMost[2]), bottom = 0.0f + std::max(mMost[1], mMost[3]);
    if (left > right || top > bottom) return;
    RectF box;
    box.Set(left, top, right, bottom);
    rect->Union(box);
  }

 private:
  static constexpr float kInfinity = std::numeric_limits<float>::infinity();

  // x and y of every other square, x and y of those between.
  Four mLeast{kInfinity, kInfinity, kInfinity, kInfinity};
  Four mMost{-kInfinity, -kInfinity, -kInfinity, -kInfinity};
};

// Counts the stamps of a stroke. The three stamp shapes take turns by the count.
class StampCounter {
 public:
  explicit StampCounter(std::int32_t count = 0) : mCount(count) {}
  std::int32_t count() const { return mCount; }

  // Counts so many stamps, at least one, and returns the first one's shape, 0 to 2.
  int take(int stamps) {
    const int shape = mCount % kStampShapes;
    // Past the largest count, whose shape is 1, the count begins again at 2: the shapes stay in turn.
    const int left = INT32_MAX - mCount;
    mCount = stamps <= left ? mCount + stamps : 1 + stamps - left;
    return shape;
  }

 private:
  std::int32_t mCount;
};

// The direction of stamps at a pen orientation in radians: a unit vector.
inline Vector2<float> stampDirection(float orientation) {
  float sine, cosine;
  sincosf(orientation, &sine, &cosine);
  return {-sine, cosine};
}

// What the stamps of one segment look like: where width and alpha stand at the first stamp, and by how much
// they change from stamp to stamp; tilt blend and direction are the same for all of them.
struct SegmentLook {
  float width, widthStep;
  float alpha, alphaStep;
  float tiltBlend;
  Vector2<float> direction;  // see stampDirection

  // Goes on to the next stamp; returns the alpha of the one it leaves.
  float advance() {
    width += widthStep;
    return std::exchange(alpha, alpha + alphaStep);
  }
};

// So many floats and places, one for each stamp that is handed over at once.
using Floats = std::array<float, kStampsAtOnce>;
using Places = std::array<SmPoint, kStampsAtOnce>;

// Writes `count` floats that grow by `step`, rounded each time, and returns the next one. Four at a time, as
// whoever reads them does: a load that spans several stores waits until all of them have left the processor.
inline float runUp(float value, float step, int count, Floats& floats) {
  const int fours = count / 4, rest = count % 4;
  const auto next = [&] { return std::exchange(value, value + step); };
  float* out = floats.data();
  for (int i = 0; i < fours; ++i, out += 4) {
    const float a = next(), b = next(), c = next(), d = next();
    storeFour(out, Four{a, b, c, d});
  }
  for (int i = 0; i < rest; ++i) *out++ = next();
  return value;
}

// The stamps of one segment: hands them to the render drawable, some at a time, and gathers the area they
// cover. The walks of StampWalk.h take it as `run`; `finish` is called once afterwards.
template <StampRow Version>
class StampRun {
  static constexpr const auto& kProfile = Version::profile;

 public:
  using Appender = typename Version::RenderDrawable::Appender;

  // `counter`: where the stroke's count stands before the segment. `places`: room for the places, whatever it
  // holds; room of the run's own would be set to zero for each segment.
  StampRun(Appender& appender, const SegmentLook& look, StampCounter counter, Places& places)
      : mAppender(appender), mLook(look), mCounter(counter), mPlaces(places) {}

  // Where to write the places of the next stamps, at most kStampsAtOnce.
  SmPoint* places() { return mPlaces.data(); }
  // Places so many stamps where that says.
  void place(int count) {
    if (count == 0) return;
    const auto last = static_cast<std::size_t>(count) - 1;
    mLastStamp = {mPlaces[last].x, mPlaces[last].y};
    // Width and alpha where the ramps are at each stamp; then what follows from them.
    Floats widths, alphas;
    mLook.width = runUp(mLook.width, mLook.widthStep, count, widths);
    if constexpr (!kProfile.isOutline) {
      mLook.alpha = runUp(mLook.alpha, mLook.alphaStep, count, alphas);
      mLastAlpha = alphas[last];
    }
    Floats sizes, reaches;
    for (std::size_t i = 0; i <= last; ++i) {
      sizes[i] = kProfile.stampSize(widths[i]);
      reaches[i] = kProfile.stampReach(widths[i]);
      if constexpr (!kProfile.isOutline) alphas[i] = kProfile.stampAlpha(alphas[i]);
    }
    mBox.add(mPlaces.data(), reaches.data(), count);
    if constexpr (kProfile.isOutline) {
      // Kept: an outline's centres are cut to whole numbers; the area is not.
      for (std::size_t i = 0; i <= last; ++i) {
        mPlaces[i] = {std::trunc(mPlaces[i].x), std::trunc(mPlaces[i].y)};
      }
    }
    mAppender.AddPoints({count, mPlaces.data(), sizes.data(), alphas.data(), mCounter.take(count)},
                        {mLook.tiltBlend, mLook.direction});
  }

  // Leaves out the stamp at that distance, and goes on as if it had been placed.
  void passOver(float distance) {
    mCounter.take(1);
    mPassedOver = distance;
    mLastAlpha = mLook.advance();
  }

  // Call after the last stamp: `rect` takes in the area of all. `path` is the segment's.
  void finish(const SmPath& path, RectF* rect) {
    mBox.uniteInto(rect);
    SmPoint at;
    if (mPassedOver >= 0.0f && path.getPosTan(mPassedOver, &at, nullptr)) mLastStamp = {at.x, at.y};
  }

  StampCounter counter() const { return mCounter; }
  // Centre and alpha of the last stamp, where there was one.
  Vector2<float> lastStamp() const { return mLastStamp; }
  float lastAlpha() const { return mLastAlpha; }

 private:
  Appender& mAppender;
  SegmentLook mLook;
  StampCounter mCounter;
  Places& mPlaces;
  DirtyBox mBox;
  Vector2<float> mLastStamp;
  float mLastAlpha = 0.0f;
  float mPassedOver = -1.0f;  // where the last stamp left out would lie; below 0 when none was left out
};

}  // namespace Qelt
