#include "outline/OutlineDrawables.h"

namespace Qelt {

template class OutlinePipeline<OutlineV1>;
template class OutlinePipeline<OutlineV2>;
template class OutlinePipeline<OutlineV3>;
template class OutlinePipeline<OutlineV4>;
template class OutlinePipeline<OutlineV5>;

}  // namespace Qelt
