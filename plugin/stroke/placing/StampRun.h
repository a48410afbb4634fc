#pragma once

#include <cmath>
#include <concepts>
#include <cstdint>
#include <limits>

#include "base/RectF.h"
#include "base/Vector.h"
#include "graphics/SmPath.h"

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
    // Written so that an edge that is NaN changes nothing.
    const float left = x - reach, top = y - reach, right = x + reach, bottom = y + reach;
    mLeft = left < mLeft ? left : mLeft;
    mTop = top < mTop ? top : mTop;
    mRight = right > mRight ? right : mRight;
    mBottom = bottom > mBottom ? bottom : mBottom;
  }

  void uniteInto(RectF* rect) const {
    if (mLeft > mRight || mTop > mBottom) return;
    RectF box;
    box.Set(mLeft, mTop, mRight, mBottom);
    rect->Union(box);
  }

 private:
  float mLeft = std::numeric_limits<float>::infinity();
  float mTop = std::numeric_limits<float>::infinity();
  float mRight = -std::numeric_limits<float>::infinity();
  float mBottom = -std::numeric_limits<float>::infinity();
};

// Counts the stamps of a stroke. The three stamp shapes take turns by the count.
class StampCounter {
 public:
  static constexpr int kShapes = 3;

  explicit StampCounter(std::int32_t count = 0) : mCount(count) {}
  std::int32_t count() const { return mCount; }

  // The shape of the next stamp, 0 to 2.
  int next() {
    const int shape = mCount % kShapes;
    // Past the largest count, whose shape is 1, the count begins again at 2: the shapes stay in turn.
    mCount = mCount == INT32_MAX ? 2 : mCount + 1;
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
  float width, alpha;
  float widthStep, alphaStep;
  float tiltBlend;
  Vector2<float> direction;  // see stampDirection
};

// The stamps of one segment: hands them to the render drawable and gathers the area they cover. Its state is
// local to the segment, so that the walk runs in registers. The walks of StampWalk.h take it as `place`;
// `finish` is called once afterwards.
template <StampRow Version>
class StampRun {
  static constexpr const auto& kProfile = Version::profile;

 public:
  using Appender = typename Version::RenderDrawable::Appender;

  // `counter`: where the stroke's count stands before the segment.
  StampRun(Appender& appender, const SegmentLook& look, StampCounter counter)
      : mAppender(appender), mLook(look), mCounter(counter) {
    mStamp[1] = look.direction;
  }

  // Places a stamp.
  void operator()(SmPoint at) {
    mBox.add(at.x, at.y, kProfile.stampReach(mLook.width));
    [[maybe_unused]] const int shape = mCounter.next();
    if constexpr (kProfile.isOutline) {
      // Kept: an outline's centres are cut to whole numbers; the area is not.
      mStamp[0] = {std::trunc(at.x), std::trunc(at.y)};
      mAppender.AddPoint(mStamp, kProfile.stampSize(mLook.width), mLook.tiltBlend);
    } else {
      mStamp[0] = {at.x, at.y};
      mAppender.AddPoint(mStamp, kProfile.stampSize(mLook.width), kProfile.stampAlpha(mLook.alpha),
                         mLook.tiltBlend, shape);
    }
    advance();
  }

  // Leaves out the stamp at that distance, and goes on as if it had been placed.
  void passOver(float distance) {
    mCounter.next();
    mPassedOver = distance;
    advance();
  }

  // Call after the last stamp: from then on the batch holds all stamps, and `rect` takes in their area.
  // `path` is the segment's.
  void finish(const SmPath& path, RectF* rect) {
    mAppender.flush();
    mBox.uniteInto(rect);
    SmPoint at;
    if (mPassedOver >= 0.0f && path.getPosTan(mPassedOver, &at, nullptr)) mStamp[0] = {at.x, at.y};
  }

  StampCounter counter() const { return mCounter; }
  // Centre and alpha of the last stamp, where there was one.
  Vector2<float> lastStamp() const { return mStamp[0]; }
  float lastAlpha() const { return mLastAlpha; }

 private:
  void advance() {
    mLastAlpha = mLook.alpha;
    mLook.width += mLook.widthStep;
    mLook.alpha += mLook.alphaStep;
  }

  Appender& mAppender;
  SegmentLook mLook;
  float mLastAlpha = 0.0f;
  float mPassedOver = -1.0f;  // where the last stamp left out would lie; below 0 when none was left out
  StampCounter mCounter;
  DirtyBox mBox;
  Vector2<float> mStamp[2];  // centre, direction
};

}  // namespace Qelt
