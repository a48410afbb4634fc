#pragma once

#include <cstdint>
#include <vector>

#include "base/HostApi.h"
#include "base/PointF.h"
#include "model/ObjectStroke.h"

namespace QeltDesktop {

// A stroke of a page, its samples in vectors. Main thread. Whoever changes it marks its cached drawing
// stale (`SetRedrawingCacheDirtyFlag`).
class QELT_HOST_API StoredStroke : public Qelt::ObjectStroke {
 public:
  // `toolType`: 1 finger, 2 stylus, 3 mouse. Without angles, tilt and orientation are null.
  explicit StoredStroke(int toolType, bool hasAngles = true);
  ~StoredStroke() override;

  // Adds one sample: position in stroke units, time in milliseconds, pressure from 0 to 1, tilt in radians
  // from upright, orientation in radians clockwise from up.
  void addPoint(Qelt::PointF at, std::int64_t time, float pressure, float tilt = 0.0f,
                float orientation = 0.0f);
  void reserve(int points);

  int GetPointCount() const override;
  const Qelt::PointF* GetPoint() const override;
  const std::int64_t* GetTimeStamp() const override;
  const float* GetPressure() const override;
  const float* GetTilt() const override;
  const float* GetOrientation() const override;
  int GetToolType() const override;

 private:
  std::vector<Qelt::PointF> mPoints;
  std::vector<std::int64_t> mTimes;
  std::vector<float> mPressures;
  std::vector<float> mTilts;
  std::vector<float> mOrientations;
  int mToolType;
  bool mHasAngles;
};

}  // namespace QeltDesktop
