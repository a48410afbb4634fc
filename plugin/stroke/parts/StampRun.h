#pragma once

#include <cmath>

#include "base/RectF.h"
#include "base/Vector.h"
#include "graphics/SmPath.h"
#include "stroke/parts/DirtyBox.h"
#include "stroke/parts/StampCounter.h"

namespace Qelt {

// The rotation axis of stamps of a pen orientation (radians).
inline Vector2<float> stampDirection(float orientation) {
  float sine, cosine;
  sincosf(orientation, &sine, &cosine);
  return {-sine, cosine};
}

// Where width and alpha stand at a segment's first stamp, and what they change by from stamp to stamp.
struct SegmentRamps {
  float width, alpha;
  float widthStep, alphaStep;
};

// The stamps of one segment: hands them to the render drawable and gathers the area they cover. `Version`
// names the RenderDrawable, and in its profile stampSize, stampAlpha and stampReach, the hand-over. Local
// state, so that the walk runs in registers. This is what the walks of StampWalk.h take as `place`.
template <typename Version>
class StampRun {
  static constexpr const auto& kProfile = Version::profile;

 public:
  using Appender = typename Version::RenderDrawable::Appender;

  StampRun(Appender& appender, const SegmentRamps& ramps, float blend, Vector2<float> direction,
           StampCounter counter)
      : mAppender(appender), mRamps(ramps), mBlend(blend), mCounter(counter) {
    mStamp[1] = direction;
  }

  // Places a stamp.
  void operator()(SmPoint at) {
    mStamp[0] = {at.x, at.y};
    mBox.add(at.x, at.y, kProfile.stampReach(mRamps.width));
    mAppender.AddPoint(mStamp, kProfile.stampSize(mRamps.width), kProfile.stampAlpha(mRamps.alpha), mBlend,
                       mCounter.next());
    advance();
  }

  // Leaves the stamp at that distance out, and goes on as if it had been placed.
  void passOver(float distance) {
    mCounter.next();
    mPassedOver = distance;
    advance();
  }

  // All stamps are in the batch from here on, and their area in `rect`. `path`: the segment's.
  void finish(const SmPath& path, RectF* rect) {
    mAppender.flush();
    mBox.uniteInto(rect);
    SmPoint at;
    if (mPassedOver >= 0.0f && path.getPosTan(mPassedOver, &at, nullptr)) mStamp[0] = {at.x, at.y};
  }

  StampCounter counter() const { return mCounter; }
  // Centre and alpha of the last stamp; only where there was one.
  Vector2<float> lastStamp() const { return mStamp[0]; }
  float lastAlpha() const { return mLastAlpha; }

 private:
  void advance() {
    mLastAlpha = mRamps.alpha;
    mRamps.width += mRamps.widthStep;
    mRamps.alpha += mRamps.alphaStep;
  }

  Appender& mAppender;
  SegmentRamps mRamps;
  float mBlend;
  float mLastAlpha = 0.0f;
  float mPassedOver = -1.0f;  // where the last stamp left out would lie; below 0: none was
  StampCounter mCounter;
  DirtyBox mBox;
  Vector2<float> mStamp[2];  // centre, direction
};

}  // namespace Qelt
