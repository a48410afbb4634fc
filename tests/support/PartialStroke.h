#pragma once

#include <cstdint>
#include <vector>

#include "base/PointF.h"
#include "engine/MotionEvent.h"
#include "model/ObjectStroke.h"

namespace QeltTests {

// A stored stroke, any of whose arrays may be missing.
class PartialStroke final : public Qelt::ObjectStroke {
 public:
  int GetPointCount() const override { return count; }
  const Qelt::PointF* GetPoint() const override { return unlessMissing(1, points); }
  const std::int64_t* GetTimeStamp() const override { return unlessMissing(2, times); }
  const float* GetPressure() const override { return unlessMissing(4, pressures); }
  const float* GetTilt() const override { return unlessMissing(8, tilts); }
  const float* GetOrientation() const override { return unlessMissing(16, orientations); }
  int GetToolType() const override { return tool; }

  int count = 0;    // may be below 0, never more than there are points
  int missing = 0;  // bits: 1 points, 2 times, 4 pressures, 8 tilts, 16 orientations
  int tool = Qelt::kToolStylus;
  std::vector<Qelt::PointF> points;
  std::vector<std::int64_t> times;
  std::vector<float> pressures, tilts, orientations;

 private:
  template <typename Value>
  const Value* unlessMissing(int bit, const std::vector<Value>& values) const {
    return (missing & bit) != 0 ? nullptr : values.data();
  }
};

}  // namespace QeltTests
