#include "render/Pencil2StrokeDrawableRTV3.h"

namespace Qelt {

template class StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV3>;

Pencil2StrokeDrawableRTV3::Pencil2StrokeDrawableRTV3(PenGLDataManager* manager) : StampRenderer(manager) {}

void Pencil2StrokeDrawableRTV3::SetStartPoint(float x, float y) {
  setStartPoint(x, y);
}

void Pencil2StrokeDrawableRTV3::SetInverseScale(const Vector2<float>& inverseScale) {
  setInverseScale(inverseScale);
}

}  // namespace Qelt
