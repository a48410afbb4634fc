#include "outline/Pencil2OutlineDrawableGL.h"

#include "stroke/input/SampleCleaner.h"

namespace Qelt {

Pencil2OutlineDrawableGL::Pencil2OutlineDrawableGL(Pencil2Data* penData, PenGLDataManager* manager)
    : PenOutlineDrawableGL(manager), mPenData(penData) {}

Pencil2OutlineDrawableGL::~Pencil2OutlineDrawableGL() = default;

PenSettings Pencil2OutlineDrawableGL::settings() const {
  return PenSettings(mPenData);
}

float Pencil2OutlineDrawableGL::getSize() const {
  return settings().size();
}

float Pencil2OutlineDrawableGL::getPixelScale() const {
  return settings().pixelScale();
}

float Pencil2OutlineDrawableGL::getSpeedScale() const {
  return settings().speedScale(0.0f);
}

void Pencil2OutlineDrawableGL::checkNan(float* value, float fallback) {
  Qelt::checkNan(value, fallback);
}

float Pencil2OutlineDrawableGL::checkPressure(float pressure) {
  return Qelt::checkPressure(pressure);
}

}  // namespace Qelt
