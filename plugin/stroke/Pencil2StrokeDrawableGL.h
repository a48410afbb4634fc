#pragma once

#include "pencommon/PenStrokeDrawableGL.h"
#include "stroke/input/PenSettings.h"

namespace Qelt {

struct Pencil2Data;

// The base of every stroke version: reads the pen's record, and works out the scales that depend on the
// screen. Main thread.
class Pencil2StrokeDrawableGL : public PenStrokeDrawableGL {
 public:
  ~Pencil2StrokeDrawableGL() override;

  using PenStrokeDrawableGL::RedrawPen;
  // Lists are drawn stroke by stroke by the host; does nothing and returns true.
  bool RedrawPen(const List* list, RectF* rect) override;

  // The pen size, stroke units, read live.
  float getSize() const;
  // Shorter side of the screen over 360, and 1440 over it; both 1 without a screen.
  float getPixelScale() const;
  float getSpeedScale() const;
  // Replaces a NaN.
  static void checkNan(float* value, float fallback);
  // At most 1; a NaN stays.
  static float checkPressure(float pressure);

 protected:
  Pencil2StrokeDrawableGL(Pencil2Data* penData, PenGLDataManager* manager);

  // Smoothed replay of a whole stroke, then straight replay; see RedrawPen. Each unites into `rect` what the
  // stamps cover, and returns false with error 7 when there is no point to start from.
  virtual bool redraw(const MotionEvent* event, RectF* rect) = 0;
  virtual bool redraw(const ObjectStroke* stroke, RectF* rect) = 0;
  virtual bool redrawPen_NoCurve(const MotionEvent* event, RectF* rect) = 0;
  virtual bool redrawPen_NoCurve(const ObjectStroke* stroke, RectF* rect) = 0;

  PenSettings settings() const { return PenSettings(mPenData); }

  Pencil2Data* mPenData;  // the pen's; may be null when its allocation failed
};

}  // namespace Qelt
