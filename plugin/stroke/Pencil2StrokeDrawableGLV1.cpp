#include "stroke/Pencil2StrokeDrawableGLV1.h"

namespace Qelt {

template class StrokePipeline<StrokeV1>;

}  // namespace Qelt
