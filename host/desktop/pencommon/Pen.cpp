#include "pencommon/Pen.h"

#include <cmath>
#include <cstdint>

#include "pencommon/PenGLDataManager.h"

namespace Qelt {

Pen::Pen() = default;
Pen::~Pen() = default;

void Pen::SetSize(float size) {
  mSettingData.size = size;
}
float Pen::GetSize() {
  return mSettingData.size;
}
float Pen::GetMinSize() {
  return 0.0f;
}
float Pen::GetMaxSize() {
  return 0.0f;
}
void Pen::SetColor(int argb) {
  mSettingData.color = static_cast<std::uint32_t>(argb);
}
int Pen::GetColor() {
  return static_cast<int>(mSettingData.color);
}

void Pen::SetScreenResolution(int width, int height) {
  mSettingData.screenWidth = width;
  mSettingData.screenHeight = height;
}

void Pen::SetAdvancedSetting(const String* setting) {
  mAdvancedSetting = setting != nullptr ? *setting : String();
}
const String* Pen::GetAdvancedSetting() {
  return &mAdvancedSetting;
}

void Pen::SetParticleDensity(int density) {
  mSettingData.particleDensity = density;
}
int Pen::GetParticleDensity() {
  return mSettingData.particleDensity;
}
void Pen::SetParticleSize(float size) {
  mSettingData.particleSize = size;
}
float Pen::GetParticleSize() {
  return mSettingData.particleSize;
}
void Pen::SetRenderingLevel(int level) {
  mSettingData.renderingLevel = level;
}
int Pen::GetRenderingLevel() {
  return mSettingData.renderingLevel;
}
void Pen::SetEnhancedAntiAlias(bool enabled) {
  mSettingData.enhancedAntiAlias = enabled;
}

bool Pen::GetPenAttribute(IPen::PenAttribute) {
  return false;
}
PenStrokeDrawableGL* Pen::GetStrokeDrawableGL() {
  return nullptr;
}
IPenPredictionDrawableGL* Pen::GetPredictionStrokeDrawableGL() {
  return nullptr;
}
PenOutlineDrawableGL* Pen::GetOutlineDrawableGL() {
  return nullptr;
}
PenPreviewDrawableGL* Pen::GetPreviewDrawableGL() {
  return nullptr;
}
void* Pen::GetTestDrawableGL() {
  return nullptr;
}
void* Pen::GetWetDryable() {
  return nullptr;
}
IPenMorphable* Pen::GetMorphable() {
  return nullptr;
}

IGLMsgQueue* Pen::GetMsgQueue() {
  return mDataManager != nullptr ? mDataManager->GetMsgQueue() : nullptr;
}

RectF Pen::GetStrokeRect(PointF* points, float*, long*, int count, float size, bool, String*) {
  RectF rect;
  bool begun = false;
  for (int i = 0; points != nullptr && i < count; ++i) {
    const PointF& point = points[i];
    if (!std::isfinite(point.x) || !std::isfinite(point.y)) continue;
    if (!begun) rect.Set(point.x, point.y, point.x, point.y);
    begun = true;
    rect.MakeRect(&point);
  }
  // Smoothed curves stay inside the hull of their points; no stamp reaches further than the size.
  if (begun && size > 0.0f) rect.IncreaseRect(size);
  return rect;
}

void Pen::setPenDataManager(PenGLDataManager* manager) {
  mDataManager = manager;
}

int Pen::getVersion() const {
  return mVersion;
}

void Pen::setVersion(int renderingVersion) {
  mVersion = renderingVersion;
}

PenSettingData* Pen::getSettingData() {
  return &mSettingData;
}

PenGLDataManager* Pen::getPenDataManager() const {
  return mDataManager;
}

}  // namespace Qelt
