#pragma once

#include <cstdint>

#include "base/PointF.h"
#include "model/ObjectBase.h"

namespace Qelt {

// A stored stroke: parallel arrays of `GetPointCount` samples, borrowed until the stroke changes.
// The interface is abstract here so that documents choose their own storage. Main thread.
class QELT_HOST_API ObjectStroke : public ObjectBase {
 public:
  ObjectStroke();
  ~ObjectStroke() override;

  virtual int GetPointCount() const = 0;
  virtual const PointF* GetPoint() const = 0;            // stroke units
  virtual const std::int64_t* GetTimeStamp() const = 0;  // milliseconds
  virtual const float* GetPressure() const = 0;          // 0 to 1
  virtual const float* GetTilt() const = 0;              // radians from upright; may be null
  virtual const float* GetOrientation() const = 0;       // radians, clockwise from up; may be null
  virtual int GetToolType() const = 0;                   // 1 finger, 2 stylus, 3 mouse
};

}  // namespace Qelt
