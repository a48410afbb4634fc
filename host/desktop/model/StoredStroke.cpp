#include "desktop/model/StoredStroke.h"

#include <algorithm>
#include <cstddef>

namespace QeltDesktop {

StoredStroke::StoredStroke(int toolType, bool hasAngles) : mToolType(toolType), mHasAngles(hasAngles) {}

StoredStroke::~StoredStroke() = default;

void StoredStroke::addPoint(Qelt::PointF at, std::int64_t time, float pressure, float tilt,
                            float orientation) {
  mPoints.push_back(at);
  mTimes.push_back(time);
  mPressures.push_back(pressure);
  mTilts.push_back(tilt);
  mOrientations.push_back(orientation);
}

void StoredStroke::reserve(int points) {
  const auto count = static_cast<std::size_t>(std::max(points, 0));
  mPoints.reserve(count);
  mTimes.reserve(count);
  mPressures.reserve(count);
  mTilts.reserve(count);
  mOrientations.reserve(count);
}

int StoredStroke::GetPointCount() const {
  return static_cast<int>(mPoints.size());
}

const Qelt::PointF* StoredStroke::GetPoint() const {
  return mPoints.data();
}

const std::int64_t* StoredStroke::GetTimeStamp() const {
  return mTimes.data();
}

const float* StoredStroke::GetPressure() const {
  return mPressures.data();
}

const float* StoredStroke::GetTilt() const {
  return mHasAngles ? mTilts.data() : nullptr;
}

const float* StoredStroke::GetOrientation() const {
  return mHasAngles ? mOrientations.data() : nullptr;
}

int StoredStroke::GetToolType() const {
  return mToolType;
}

}  // namespace QeltDesktop
