#pragma once

#include "base/PointF.h"
#include "base/RectF.h"
#include "graphics/SmPath.h"
#include "stroke/input/PenSample.h"

namespace Qelt {

// Builds the path of one segment at a time. Curves run from mid point to mid point with the input point
// between them as control, so that they meet without a corner:
//
//     mid --( last )-- new mid        to, the new input point
//
// All in stroke units. Allocates nothing after its construction.
class SegmentPath {
 public:
  SegmentPath() { mPath.incReserve(3); }
  ~SegmentPath() { mPath.freeMemory(); }
  SegmentPath(const SegmentPath&) = delete;
  SegmentPath& operator=(const SegmentPath&) = delete;

  // Begins a stroke, which stands at its first point.
  void start(PointF at) { start(at, at); }
  // Takes a stroke over where another drawable left it.
  void start(PointF mid, PointF last) {
    mMid = mid;
    mLast = last;
  }
  void setLast(PointF at) { mLast = at; }
  PointF last() const { return mLast; }
  PointF mid() const { return mMid; }

  // Builds the segment towards an accepted point and returns its length. A curve moves the mid point on.
  float extend(PointF to, Smoothing smoothing) {
    if (smoothing == Smoothing::Straight) return line(to);
    const PointF newMid{(mLast.x + to.x) / 2.0f, (mLast.y + to.y) / 2.0f};
    const float length = curve(newMid);
    mMid = newMid;
    return length;
  }

  // Builds the closing segment, which ends at the point itself, and returns its length.
  float close(PointF to, Smoothing smoothing) {
    return smoothing == Smoothing::Straight ? line(to) : curve(to);
  }

  const SmPath& path() const { return mPath; }

  // Sets `rect` to where the stroke stands: from the mid point to the last point.
  void setToJoint(RectF* rect) const {
    rect->Set(mMid.x, mMid.y, mMid.x, mMid.y);
    rect->MakeRect(&mLast);
  }

 private:
  float curve(PointF to) {
    mPath.rewind();
    mPath.moveTo(mMid.x, mMid.y);
    mPath.quadTo(mLast.x, mLast.y, to.x, to.y);
    mPath.resetPath(0);
    return mPath.getLength();
  }

  float line(PointF to) {
    mPath.rewind();
    mPath.moveTo(mLast.x, mLast.y);
    mPath.lineTo(to.x, to.y);
    mPath.resetPath(0);
    return mPath.getLength();
  }

  SmPath mPath;
  PointF mLast;
  PointF mMid;
};

}  // namespace Qelt
