#pragma once

#include "base/Vector.h"
#include "pencommon/PenPredictionDrawableRT.h"
#include "prediction/PredictionRenderVersions.h"
#include "render/StampRenderer.h"

namespace Qelt {

extern template class StampRenderer<PenPredictionDrawableRT, PredictionRender>;

// The render-thread half of the prediction: anti-aliased stamps under one opacity.
class Pencil2PredictionDrawableRT final : public StampRenderer<PenPredictionDrawableRT, PredictionRender> {
 public:
  explicit Pencil2PredictionDrawableRT(PenGLDataManager* manager);

  // Render thread: the first point of the live stroke, stroke units; the grain is fixed to it.
  void SetStartPoint(float x, float y);
  // Main thread: stroke units a device pixel, before the stamps of a call are added.
  void SetInverseScale(const Vector2<float>& inverseScale);
};

}  // namespace Qelt
