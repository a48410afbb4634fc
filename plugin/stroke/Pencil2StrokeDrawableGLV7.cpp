#include "stroke/Pencil2StrokeDrawableGLV7.h"

namespace Qelt {

template class StrokePipeline<StrokeV7>;

}  // namespace Qelt
