#include "stroke/Pencil2StrokeDrawableGL.h"

#include <cmath>

#include "pen/Pencil2Data.h"
#include "pencommon/PenSettingData.h"
#include "stroke/StrokeRules.h"

namespace Qelt {

Pencil2StrokeDrawableGL::Pencil2StrokeDrawableGL(Pencil2Data* penData, PenGLDataManager* manager)
    : PenStrokeDrawableGL(manager), mPenData(penData) {}

Pencil2StrokeDrawableGL::~Pencil2StrokeDrawableGL() = default;

bool Pencil2StrokeDrawableGL::RedrawPen(const List*, RectF*) {
  return true;
}

bool Pencil2StrokeDrawableGL::hasSettings() const {
  return mPenData != nullptr && mPenData->mSettingData != nullptr;
}

float Pencil2StrokeDrawableGL::getSize() const {
  return hasSettings() ? mPenData->mSettingData->size : 0.0f;
}

std::uint32_t Pencil2StrokeDrawableGL::getColor() const {
  return hasSettings() ? mPenData->mSettingData->color : 0u;
}

float Pencil2StrokeDrawableGL::getPixelScale() const {
  if (!hasSettings()) return 1.0f;
  return rules::pixelScale(mPenData->mSettingData->screenWidth, mPenData->mSettingData->screenHeight);
}

float Pencil2StrokeDrawableGL::getSpeedScale() const {
  if (!hasSettings()) return 1.0f;
  return rules::speedScale(mPenData->mSettingData->screenWidth, mPenData->mSettingData->screenHeight, 1.0f);
}

void Pencil2StrokeDrawableGL::checkNan(float* value, float fallback) {
  if (std::isnan(*value)) *value = fallback;
}

float Pencil2StrokeDrawableGL::checkPressure(float pressure) {
  return pressure > 1.0f ? 1.0f : pressure;
}

}  // namespace Qelt
