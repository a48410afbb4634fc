#pragma once

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
  void add(float x, float y, float reach) {
    const Four edges = Four{x, y, -x, -y} - Four{reach, reach, reach, reach};
    // Written so that an edge that is NaN changes nothing.
    mLeast = edges < mLeast ? edges : mLeast;
  }

  void uniteInto(RectF* rect) const {
    // Subtracted, so that no zero becomes a negative one.
    const float left = mLeast[0], top = mLeast[1], right = 0.0f - mLeast[2], bottom = 0.0f - mLeast[3];
    if (left > right || top > bottom) return;
    RectF box;
    box.Set(left, top, right, bottom);
    rect->Union(box);
  }

 private:
  static constexpr float kInfinity = std::numeric_limits<float>::infinity();

  // Left and top, and right and bottom negated, so that all four grow downwards.
  Four mLeast{kInfinity, kInfinity, kInfinity, kInfinity};
};

// Counts the stamps of a stroke. The three stamp shapes take turns by the count.
class StampCounter {
 public:
  static constexpr int kShapes = 3;

  explicit StampCounter(std::int32_t count = 0) : mCount(count) {}
  std::int32_t count() const { return mCount; }

  // Counts so many stamps, at least one, and returns the first one's shape, 0 to 2.
  int take(int stamps) {
    const int shape = mCount % kShapes;
    // Past the largest count, whose shape is 1, the count begins again at 2: the shapes stay in turn.
    const int left = INT32_MAX - mCount;
    mCount = stamps <= left ? mCount + stamps : 1 + stamps - left;
    return shape;
  }
  // The shape of the stamp after one of that shape.
  static int shapeAfter(int shape) { return shape + 1 == kShapes ? 0 : shape + 1; }

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

// The stamps of one segment: gathers their places, hands the stamps to the render drawable some at a time,
// and gathers the area they cover. The walks of StampWalk.h take it as `run`; `finish` is called once
// afterwards.
//
// Some at a time, because the path is asked for each place by a call, and no register keeps a float across a
// call: whatever goes on from stamp to stamp would be loaded and stored again for each.
template <StampRow Version>
class StampRun {
  static constexpr const auto& kProfile = Version::profile;

 public:
  using Appender = typename Version::RenderDrawable::Appender;

  // `counter`: where the stroke's count stands before the segment.
  StampRun(Appender& appender, const SegmentLook& look, StampCounter counter)
      : mAppender(appender), mLook(look), mCounter(counter) {}

  // Where to write the place of the next stamp.
  SmPoint* next() { return mNext; }
  // Places a stamp where that says.
  void place() {
    if (++mNext == mPlaces.data() + mPlaces.size()) handOver();
  }

  // Leaves out the stamp at that distance, and goes on as if it had been placed.
  void passOver(float distance) {
    handOver();
    mCounter.take(1);
    mPassedOver = distance;
    mLastAlpha = mLook.advance();
  }

  // Call after the last stamp: from then on all stamps are handed over, and `rect` takes in their area.
  // `path` is the segment's.
  void finish(const SmPath& path, RectF* rect) {
    handOver();
    mBox.uniteInto(rect);
    SmPoint at;
    if (mPassedOver >= 0.0f && path.getPosTan(mPassedOver, &at, nullptr)) mLastStamp = {at.x, at.y};
  }

  StampCounter counter() const { return mCounter; }
  // Centre and alpha of the last stamp, where there was one.
  Vector2<float> lastStamp() const { return mLastStamp; }
  float lastAlpha() const { return mLastAlpha; }

 private:
  // Hands over the stamps whose places have been gathered.
  void handOver() {
    const auto count = static_cast<int>(mNext - mPlaces.data());
    if (count == 0) return;
    // Copies, which stay in registers.
    SegmentLook look = mLook;
    DirtyBox box = mBox;
    float lastAlpha = 0.0f;
    int tile = mCounter.take(count);
    mAppender.AddPoints(count, {look.tiltBlend, look.direction}, [&](int i) {
      SmPoint centre = mPlaces[static_cast<std::size_t>(i)];
      box.add(centre.x, centre.y, kProfile.stampReach(look.width));
      // Kept: an outline's centres are cut to whole numbers; the area is not.
      if constexpr (kProfile.isOutline) centre = {std::trunc(centre.x), std::trunc(centre.y)};
      PlacedStamp stamp{centre, kProfile.stampSize(look.width), 0.0f, tile};
      if constexpr (!kProfile.isOutline) stamp.alpha = kProfile.stampAlpha(look.alpha);
      tile = StampCounter::shapeAfter(tile);
      lastAlpha = look.advance();
      return stamp;
    });
    mLook = look;
    mBox = box;
    mLastAlpha = lastAlpha;
    mLastStamp = {mNext[-1].x, mNext[-1].y};
    mNext = mPlaces.data();
  }

  Appender& mAppender;
  SegmentLook mLook;
  StampCounter mCounter;
  DirtyBox mBox;
  std::array<SmPoint, 16> mPlaces;
  SmPoint* mNext = mPlaces.data();
  Vector2<float> mLastStamp;
  float mLastAlpha = 0.0f;
  float mPassedOver = -1.0f;  // where the last stamp left out would lie; below 0 when none was left out
};

}  // namespace Qelt
