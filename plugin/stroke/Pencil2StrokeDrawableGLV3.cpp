#include "stroke/Pencil2StrokeDrawableGLV3.h"

namespace Qelt {

template class StrokePipeline<StrokeV3>;

}  // namespace Qelt
