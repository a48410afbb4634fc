#include "stroke/StrokeDrawables.h"

namespace Qelt {

template class StrokePipeline<StrokeV1>;
template class StrokePipeline<StrokeV2>;
template class StrokePipeline<StrokeV3>;
template class StrokePipeline<StrokeV4>;
template class StrokePipeline<StrokeV5>;
template class StrokePipeline<StrokeV7>;
template class StrokePipeline<StrokeV8>;

}  // namespace Qelt
