#include "stroke/Pencil2StrokeDrawableGLV4.h"

namespace Qelt {

template class StrokePipeline<StrokeV4>;

}  // namespace Qelt
