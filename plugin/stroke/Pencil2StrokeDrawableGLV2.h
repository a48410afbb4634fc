#pragma once

#include "stroke/StrokePipeline.h"
#include "stroke/StrokeVersions.h"

namespace Qelt {

extern template class StrokePipeline<StrokeV2>;

// Stroke version 2; all that makes it stands in its row of StrokeVersions.h.
class Pencil2StrokeDrawableGLV2 final : public StrokePipeline<StrokeV2> {
 public:
  using StrokePipeline::StrokePipeline;
};

}  // namespace Qelt
