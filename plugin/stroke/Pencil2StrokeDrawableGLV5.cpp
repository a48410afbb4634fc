#include "stroke/Pencil2StrokeDrawableGLV5.h"

namespace Qelt {

template class StrokePipeline<StrokeV5>;

}  // namespace Qelt
