#pragma once

#include <cmath>
#include <cstdint>

#include "pen/Pencil2Data.h"
#include "pencommon/PenSettingData.h"
#include "stroke/StrokeRules.h"
#include "stroke/parts/SegmentPath.h"

namespace Qelt {

// A pen's settings as its drawables see them: read live through the pen's record, either of which may be
// missing. Main thread.
class PenSettings {
 public:
  explicit PenSettings(const Pencil2Data* penData)
      : mPenData(penData), mRecord(penData != nullptr ? penData->mSettingData : nullptr) {}

  // True when there is something to draw by. Without it all that follows answers 0, if nothing else is said.
  bool exist() const { return mRecord != nullptr; }

  float size() const { return exist() ? mRecord->size : 0.0f; }  // stroke units
  // A pen whose size is not positive or not finite places nothing. Nor does one so small or so large that a
  // stamp's width or alpha would not fit into a float.
  static bool isUsableSize(float size) { return size >= 1e-30f && size <= 1e30f; }
  bool hasUsableSize() const { return isUsableSize(size()); }
  std::uint32_t color() const { return exist() ? mRecord->color : 0u; }  // ARGB

  // Straight without a record.
  Smoothing smoothing() const {
    return mPenData != nullptr && mPenData->mCurveEnabled ? Smoothing::Curve : Smoothing::Straight;
  }

  // Shorter side of the screen over 360; 1 without a screen.
  float pixelScale() const {
    return exist() ? rules::pixelScale(mRecord->screenWidth, mRecord->screenHeight) : 1.0f;
  }
  // 1440 over the shorter side of the screen.
  float speedScale(float withoutScreen) const {
    return exist() ? rules::speedScale(mRecord->screenWidth, mRecord->screenHeight, withoutScreen)
                   : withoutScreen;
  }

 private:
  const Pencil2Data* mPenData;
  const PenSettingData* mRecord;
};

}  // namespace Qelt
