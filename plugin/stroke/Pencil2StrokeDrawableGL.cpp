#include "stroke/Pencil2StrokeDrawableGL.h"

#include "stroke/input/SampleCleaner.h"

namespace Qelt {

Pencil2StrokeDrawableGL::Pencil2StrokeDrawableGL(Pencil2Data* penData, PenGLDataManager* manager)
    : PenStrokeDrawableGL(manager), mPenData(penData) {}

Pencil2StrokeDrawableGL::~Pencil2StrokeDrawableGL() = default;

bool Pencil2StrokeDrawableGL::RedrawPen(const List*, RectF*) {
  return true;
}

float Pencil2StrokeDrawableGL::getSize() const {
  return settings().size();
}

float Pencil2StrokeDrawableGL::getPixelScale() const {
  return settings().pixelScale();
}

float Pencil2StrokeDrawableGL::getSpeedScale() const {
  return settings().speedScale(1.0f);
}

void Pencil2StrokeDrawableGL::checkNan(float* value, float fallback) {
  Qelt::checkNan(value, fallback);
}

float Pencil2StrokeDrawableGL::checkPressure(float pressure) {
  return Qelt::checkPressure(pressure);
}

}  // namespace Qelt
