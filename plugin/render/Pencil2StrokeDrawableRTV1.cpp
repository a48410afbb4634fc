#include "render/Pencil2StrokeDrawableRTV1.h"

namespace Qelt {

template class StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV1>;

Pencil2StrokeDrawableRTV1::Pencil2StrokeDrawableRTV1(PenGLDataManager* manager) : StampRenderer(manager) {}

void Pencil2StrokeDrawableRTV1::SetStartPoint(float x, float y) {
  setStartPoint(x, y);
}

}  // namespace Qelt
