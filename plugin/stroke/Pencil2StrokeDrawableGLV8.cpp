#include "stroke/Pencil2StrokeDrawableGLV8.h"

namespace Qelt {

template class StrokePipeline<StrokeV8>;

}  // namespace Qelt
