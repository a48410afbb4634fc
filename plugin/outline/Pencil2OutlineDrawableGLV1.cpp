#include "outline/Pencil2OutlineDrawableGLV1.h"

namespace Qelt {

template class OutlinePipeline<OutlineV1>;

}  // namespace Qelt
