#include "outline/Pencil2OutlineDrawableGLV5.h"

namespace Qelt {

template class OutlinePipeline<OutlineV5>;

}  // namespace Qelt
