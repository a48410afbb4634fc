#include "pen/Pencil2.h"

#include <new>
#include <utility>

#include "base/String.h"
#include "log/Log.h"
#include "outline/Pencil2OutlineDrawableGL.h"
#include "pen/DrawableFactory.h"
#include "pen/Pencil2Data.h"
#include "pen/ReleasedName.h"
#include "pen/RenderingVersions.h"
#include "pencommon/PenGLDataManager.h"
#include "prediction/Pencil2PredictionDrawableGL.h"
#include "preview/Pencil2PreviewDrawableGL.h"
#include "stroke/Pencil2StrokeDrawableGL.h"

namespace Qelt {
namespace {

constexpr float kMinSize = 0.477f;  // stroke units
constexpr float kMaxSize = 6.571f;
constexpr std::uint32_t kDefaultColor = 0xFF000000u;
constexpr int kAdvancedSettingVersion = 8;

// The newest stroke version that predictions continue.
constexpr std::int32_t kPredictionVersion = [] {
  std::int32_t newest = 0;
  for (const RenderingVersion& version : kRenderingVersions) {
    if (version.predicts) newest = version.strokeVersion;
  }
  return newest;
}();

}  // namespace

Pencil2::Pencil2() {
  record();
  String setting;
  setting.Append(kAdvancedSettingVersion);
  setting.Append(';');
  SetAdvancedSetting(&setting);
  SetSize(kMinSize);
  SetColor(static_cast<int>(kDefaultColor));
}

// The drawables go first, then the data that they leave on the render thread. The record goes last, since the
// drawables' destructors may still read it.
Pencil2::~Pencil2() {
  delete std::exchange(mStrokeDrawable, nullptr);
  delete std::exchange(mPredictionDrawable, nullptr);
  delete std::exchange(mOutlineDrawable, nullptr);
  delete std::exchange(mPreviewDrawable, nullptr);
  releasePenData();
  delete mData;
}

void Pencil2::releasePenData() {
  PenGLDataManager* manager = getPenDataManager();
  if (manager == nullptr) return;
  if (IGLMsgQueue* queue = manager->GetMsgQueue(); queue != nullptr) ReleasedName::release(manager, queue);
  setPenDataManager(nullptr);
}

Pencil2Data* Pencil2::record() {
  if (mData != nullptr) return mData;
  mData = new (std::nothrow) Pencil2Data{};
  if (mData == nullptr) return nullptr;
  mData->mSettingData = getSettingData();
  mData->mCurveEnabled = true;
  mData->mLastAlpha = -1.0f;
  return mData;
}

float Pencil2::GetMinSize() {
  return kMinSize;
}

float Pencil2::GetMaxSize() {
  return kMaxSize;
}

bool Pencil2::GetPenAttribute(IPen::PenAttribute attribute) {
  switch (static_cast<int>(attribute)) {
    case 0:
    case 1:
    case 2:
    case 4:
      return true;
    default:
      return false;
  }
}

PenStrokeDrawableGL* Pencil2::GetStrokeDrawableGL() {
  const std::int32_t version = renderingVersionOf(getVersion()).strokeVersion;
  if (mStrokeDrawable != nullptr && mStrokeVersion == version) return mStrokeDrawable;
  delete std::exchange(mStrokeDrawable, nullptr);
  mStrokeDrawable = createStrokeDrawable(version, record(), getPenDataManager());
  mStrokeVersion = version;
  return mStrokeDrawable;
}

IPenPredictionDrawableGL* Pencil2::GetPredictionStrokeDrawableGL() {
  const RenderingVersion& rendering = renderingVersionOf(getVersion());
  // Kept: stored although no stroke drawable is made here, so that the next getter of strokes may keep one of
  // another version.
  mStrokeVersion = rendering.strokeVersion;
  if (!rendering.predicts) {
    // Kept: the two versions are named the wrong way round.
    __android_log_print(
        kLogError, kLogTag, "%s - Stroke drawble version (%d) does not match prediction drawable(%d).",
        "virtual Qelt::IPenPredictionDrawableGL *Qelt::Pencil2::GetPredictionStrokeDrawableGL()",
        static_cast<int>(kPredictionVersion), static_cast<int>(rendering.strokeVersion));
    __android_log_print(kLogError, kLogTag, "%s",
                        "Please, update prediction drawable to last stroke drawable and update "
                        "PEN_PREDICTION_CURRENT_VERSION");
    return nullptr;
  }
  if (mPredictionDrawable == nullptr) {
    mPredictionDrawable = createPredictionDrawable(record(), getPenDataManager());
  }
  return mPredictionDrawable;
}

PenOutlineDrawableGL* Pencil2::GetOutlineDrawableGL() {
  const std::int32_t version = renderingVersionOf(getVersion()).outlineVersion;
  if (mOutlineDrawable != nullptr && mOutlineVersion == version) return mOutlineDrawable;
  delete std::exchange(mOutlineDrawable, nullptr);
  mOutlineDrawable = createOutlineDrawable(version, record(), getPenDataManager());
  mOutlineVersion = version;
  return mOutlineDrawable;
}

PenPreviewDrawableGL* Pencil2::GetPreviewDrawableGL() {
  if (mPreviewDrawable == nullptr) {
    mPreviewDrawable = createPreviewDrawable(record(), getPenDataManager());
  }
  return mPreviewDrawable;
}

IPenMorphable* Pencil2::GetMorphable() {
  return this;
}

IGLMsgQueue* Pencil2::GetMsgQueue() {
  if (PenGLDataManager* manager = getPenDataManager(); manager != nullptr) mMsgQueue = manager->GetMsgQueue();
  return mMsgQueue;
}

bool Pencil2::SetCurveEnabled(bool enabled) {
  if (Pencil2Data* data = record(); data != nullptr) data->mCurveEnabled = enabled;
  return true;
}

bool Pencil2::IsCurveEnabled() {
  return record() != nullptr && mData->mCurveEnabled;
}

bool Pencil2::SetFixedWidthEnabled(bool enabled) {
  if (Pencil2Data* data = record(); data != nullptr) data->mFixedWidthEnabled = enabled;
  return true;
}

bool Pencil2::IsFixedWidthEnabled() {
  return mData != nullptr && mData->mFixedWidthEnabled;
}

bool Pencil2::SetFixedWidth(float width) {
  if (Pencil2Data* data = record(); data != nullptr) data->mFixedWidth = width;
  return true;
}

float Pencil2::GetFixedWidth() {
  return mData != nullptr ? mData->mFixedWidth : 0.0f;
}

}  // namespace Qelt

Qelt::Pen* createPenInst() {
  return new (std::nothrow) Qelt::Pencil2;
}
