#pragma once

#include <cstdint>

#include "base/Error.h"
#include "base/RectF.h"
#include "math/FloatRange.h"
#include "pen/Pencil2Data.h"
#include "pencommon/PenSettingData.h"
#include "stroke/StrokeRules.h"
#include "stroke/input/PenSample.h"

namespace Qelt {

// A pen's settings as its drawables see them, read live through the pen's record. The record, or the host's
// settings that it refers to, may be missing. Main thread.
class PenSettings {
 public:
  explicit PenSettings(const Pencil2Data* penData)
      : mPenData(penData), mSettings(penData != nullptr ? penData->mSettingData : nullptr) {}

  // False where the host's settings are missing. Then nothing can be drawn, and each of the numbers below is
  // 0, unless its comment says otherwise.
  bool exist() const { return mSettings != nullptr; }

  float size() const { return exist() ? mSettings->size : 0.0f; }  // stroke units
  // A pen whose size is not positive or not finite places nothing. Neither does one so small or so large that
  // the width or the alpha of its stamps would not fit into a float.
  bool hasUsableSize() const { return isUsableScale(size()); }
  std::uint32_t color() const { return exist() ? mSettings->color : 0u; }  // ARGB

  // Straight without a record.
  Smoothing smoothing() const {
    return mPenData != nullptr && mPenData->mCurveEnabled ? Smoothing::Curve : Smoothing::Straight;
  }

  // The shorter side of the screen over 360; 1 without a screen.
  float pixelScale() const {
    return exist() ? rules::getPixelScale(mSettings->screenWidth, mSettings->screenHeight) : 1.0f;
  }
  // 1440 over the shorter side of the screen.
  float speedScale(float withoutScreen) const {
    return exist() ? rules::getSpeedScale(mSettings->screenWidth, mSettings->screenHeight, withoutScreen)
                   : withoutScreen;
  }

 private:
  const Pencil2Data* mPenData;
  const PenSettingData* mSettings;
};

// Whether a drawable was given what its call needs: an event or a stroke, and a rectangle. Otherwise the
// host's error is set.
inline bool areGiven(const void* input, const RectF* rect) {
  if (input != nullptr && rect != nullptr) return true;
  Error::SetError(Error::kInvalidArgument);
  return false;
}

}  // namespace Qelt
