#include "outline/Pencil2OutlineDrawableGLV4.h"

namespace Qelt {

template class OutlinePipeline<OutlineV4>;

}  // namespace Qelt
