#include "render/RenderDrawables.h"

namespace Qelt {

template class StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV1>;
template class StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV2>;
template class StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV3>;
template class StampRenderer<PenPreviewDrawableRT, PreviewRender>;
template class StampRenderer<PenPredictionDrawableRT, PredictionRender>;

}  // namespace Qelt
