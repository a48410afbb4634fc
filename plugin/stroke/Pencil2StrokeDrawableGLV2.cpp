#include "stroke/Pencil2StrokeDrawableGLV2.h"

namespace Qelt {

template class StrokePipeline<StrokeV2>;

}  // namespace Qelt
