#include "pen/Pencil2.h"

#include <atomic>
#include <new>
#include <utility>

#include "base/String.h"
#include "log/Log.h"
#include "outline/Pencil2OutlineDrawableGL.h"
#include "pen/DrawableFactory.h"
#include "pen/Pencil2Data.h"
#include "pen/VersionTable.h"
#include "pen/WholeDrawable.h"
#include "pencommon/PenGLDataManager.h"
#include "pencommon/PenManager.h"
#include "prediction/Pencil2PredictionDrawableGL.h"
#include "preview/Pencil2PreviewDrawableGL.h"
#include "render/Posting.h"
#include "stroke/Pencil2StrokeDrawableGL.h"

namespace Qelt {
namespace {

constexpr float kMinSize = 0.477f;  // stroke units
constexpr float kMaxSize = 6.571f;
constexpr std::uint32_t kOpaqueBlack = 0xFF000000u;
constexpr int kAdvancedSettingVersion = 8;
constexpr std::int32_t kPredictionVersion = 8;  // the stroke version that predictions continue

// The name that a dying pen has its data released by.
class ReleasedName final : public String {
 public:
  explicit ReleasedName(IGLMsgQueue* queue) : String(PenManager::QELT_PENCIL2_NAME), mQueue(queue) {}

  // Of names whose release a queue took, and refused their deletion: the release may yet read them. The next
  // pen that dies by that queue has them deleted, after it.
  static void keep(ReleasedName* name) {
    name->mNext = unclaimed.load();
    while (!unclaimed.compare_exchange_weak(name->mNext, name)) {
    }
  }

  static void settle(IGLMsgQueue* queue) {
    ReleasedName* name = unclaimed.exchange(nullptr);
    while (name != nullptr) {
      ReleasedName* const next = name->mNext;
      if (name->mQueue != queue || !postDelete<String>(queue, name)) keep(name);
      name = next;
    }
  }

 private:
  // Of all pens: several may die at once, each on its own host's thread.
  static inline std::atomic<ReleasedName*> unclaimed{nullptr};

  IGLMsgQueue* mQueue;
  ReleasedName* mNext = nullptr;
};

}  // namespace

Pencil2::Pencil2() {
  record();
  String setting;
  setting.Append(kAdvancedSettingVersion);
  setting.Append(';');
  SetAdvancedSetting(&setting);
  SetSize(kMinSize);
  SetColor(static_cast<int>(kOpaqueBlack));
}

// Drawables go before the data they leave on the render thread, and the record last: their destructors may
// still read it.
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
  IGLMsgQueue* queue = manager->GetMsgQueue();
  if (queue != nullptr) {
    ReleasedName::settle(queue);
    auto* name = new (std::nothrow) ReleasedName(queue);
    if (name != nullptr && !post(queue, manager, &PenGLDataManager::ReleasePenData, name)) {
      delete name;
    } else if (name != nullptr && !postDelete<String>(queue, name)) {
      ReleasedName::keep(name);
    }
  }
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
  const std::int32_t version = versionTable[versionRow(getVersion())][0];
  if (mStrokeDrawable != nullptr && mStrokeVersion == version) return mStrokeDrawable;
  delete std::exchange(mStrokeDrawable, nullptr);
  mStrokeDrawable = createStrokeDrawable(version, record(), getPenDataManager());
  mStrokeVersion = version;
  return mStrokeDrawable;
}

IPenPredictionDrawableGL* Pencil2::GetPredictionStrokeDrawableGL() {
  const std::int32_t version = versionTable[versionRow(getVersion())][0];
  // Kept: stored although no stroke drawable is made here, so that the next getter of strokes may keep one of
  // another version.
  mStrokeVersion = version;
  if (version != kPredictionVersion) {
    // Kept: the two versions are named the wrong way round.
    __android_log_print(
        kLogError, kLogTag, "%s - Stroke drawble version (%d) does not match prediction drawable(%d).",
        "virtual Qelt::IPenPredictionDrawableGL *Qelt::Pencil2::GetPredictionStrokeDrawableGL()",
        static_cast<int>(kPredictionVersion), static_cast<int>(version));
    __android_log_print(kLogError, kLogTag, "%s",
                        "Please, update prediction drawable to last stroke drawable and update "
                        "PEN_PREDICTION_CURRENT_VERSION");
    return nullptr;
  }
  if (mPredictionDrawable == nullptr) {
    mPredictionDrawable = makeWhole<Pencil2PredictionDrawableGL>(record(), getPenDataManager());
  }
  return mPredictionDrawable;
}

PenOutlineDrawableGL* Pencil2::GetOutlineDrawableGL() {
  const std::int32_t version = versionTable[versionRow(getVersion())][1];
  if (mOutlineDrawable != nullptr && mOutlineVersion == version) return mOutlineDrawable;
  delete std::exchange(mOutlineDrawable, nullptr);
  mOutlineDrawable = createOutlineDrawable(version, record(), getPenDataManager());
  mOutlineVersion = version;
  return mOutlineDrawable;
}

PenPreviewDrawableGL* Pencil2::GetPreviewDrawableGL() {
  if (mPreviewDrawable == nullptr) {
    mPreviewDrawable = makeWhole<Pencil2PreviewDrawableGL>(record(), getPenDataManager());
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
