#pragma once

#include "pencommon/PenOutlineDrawableGL.h"
#include "stroke/input/PenSettings.h"

namespace Qelt {

struct Pencil2Data;

// The base of every outline version: reads the pen's record, and works out the scales that depend on the
// screen. Main thread.
class Pencil2OutlineDrawableGL : public PenOutlineDrawableGL {
 public:
  ~Pencil2OutlineDrawableGL() override;

  // The pen size, stroke units, read live.
  float getSize() const;
  // Shorter side of the screen over 360; 1 without a screen.
  float getPixelScale() const;
  // 1440 over the shorter side of the screen. Kept: 0 without a screen, where a stroke returns 1.
  float getSpeedScale() const;
  // Replaces a NaN.
  static void checkNan(float* value, float fallback);
  // At most 1; a NaN stays.
  static float checkPressure(float pressure);

 protected:
  Pencil2OutlineDrawableGL(Pencil2Data* penData, PenGLDataManager* manager);

  PenSettings settings() const;

 private:
  Pencil2Data* mPenData;  // the pen's; may be null when its allocation failed
};

}  // namespace Qelt
