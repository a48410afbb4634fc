#include "preview/Pencil2PreviewDrawableRT.h"

namespace Qelt {

template class StampRenderer<PenPreviewDrawableRT, PreviewRender>;

Pencil2PreviewDrawableRT::Pencil2PreviewDrawableRT(PenGLDataManager* manager) : StampRenderer(manager) {}

void Pencil2PreviewDrawableRT::SetStartPoint(float x, float y) {
  setStartPoint(x, y);
}

}  // namespace Qelt
