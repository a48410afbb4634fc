#include "render/Pencil2StrokeDrawableRTV2.h"

namespace Qelt {

template class StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV2>;

Pencil2StrokeDrawableRTV2::Pencil2StrokeDrawableRTV2(PenGLDataManager* manager) : StampRenderer(manager) {}

void Pencil2StrokeDrawableRTV2::SetStartPoint(float x, float y) {
  setStartPoint(x, y);
}

}  // namespace Qelt
