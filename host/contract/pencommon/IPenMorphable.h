#pragma once

#include "base/HostApi.h"

namespace Qelt {

// Options of a pen that change the shape of its strokes. Main thread. Setters return true when the pen
// takes the value. Slots: destructor pair, then as declared.
class QELT_HOST_API IPenMorphable {
 public:
  virtual ~IPenMorphable();
  virtual bool SetCurveEnabled(bool enabled) = 0;
  virtual bool IsCurveEnabled() = 0;
  virtual bool SetFixedWidthEnabled(bool enabled) = 0;
  virtual bool IsFixedWidthEnabled() = 0;
  virtual bool SetFixedWidth(float width) = 0;
  virtual float GetFixedWidth() = 0;
};

}  // namespace Qelt
