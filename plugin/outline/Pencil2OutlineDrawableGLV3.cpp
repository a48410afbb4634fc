#include "outline/Pencil2OutlineDrawableGLV3.h"

namespace Qelt {

template class OutlinePipeline<OutlineV3>;

}  // namespace Qelt
