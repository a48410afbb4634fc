#include "prediction/Pencil2PredictionDrawableRT.h"

namespace Qelt {

template class StampRenderer<PenPredictionDrawableRT, PredictionRender>;

Pencil2PredictionDrawableRT::Pencil2PredictionDrawableRT(PenGLDataManager* manager)
    : StampRenderer(manager) {}

void Pencil2PredictionDrawableRT::SetStartPoint(float x, float y) {
  setStartPoint(x, y);
}

void Pencil2PredictionDrawableRT::SetInverseScale(const Vector2<float>& inverseScale) {
  setInverseScale(inverseScale);
}

}  // namespace Qelt
