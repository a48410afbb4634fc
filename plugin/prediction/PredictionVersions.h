#pragma once

#include "pencommon/PenPredictionDrawableRT.h"
#include "render/BatchGuard.h"
#include "render/RenderDrawables.h"
#include "stroke/StrokeRules.h"

// The prediction as a row in the form of the strokes' (StrokeVersions.h). There is one; it continues strokes
// of version 8.
namespace Qelt {

class Pencil2PredictionReturnCallback final : public BatchGuard<PenPredictionDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

struct PredictionProfile {
  float stampSpacing;  // stroke units
  // Hand-over.
  float (*stampSize)(float width);
  float (*stampAlpha)(float alpha);
  float (*stampReach)(float width);
};

struct PredictionVersion {
  static constexpr const char* name = "Pencil2PredictionDrawableGL";
  static constexpr PredictionProfile profile{
      .stampSpacing = 1.0f,
      .stampSize = rules::stampHalfWidthV8,
      .stampAlpha = rules::stampAlphaPrediction,
      .stampReach = rules::stampReachV8,
  };
  using RenderDrawable = Pencil2PredictionDrawableRT;
  using ReturnGuard = Pencil2PredictionReturnCallback;
};

}  // namespace Qelt
