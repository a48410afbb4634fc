#include "outline/Pencil2OutlineDrawableGLV2.h"

namespace Qelt {

template class OutlinePipeline<OutlineV2>;

}  // namespace Qelt
