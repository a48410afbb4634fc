#pragma once

#include "stroke/StrokePipeline.h"
#include "stroke/StrokeVersions.h"

namespace Qelt {

extern template class StrokePipeline<StrokeV3>;

// Stroke version 3; all that makes it stands in its row of StrokeVersions.h.
class Pencil2StrokeDrawableGLV3 final : public StrokePipeline<StrokeV3> {
 public:
  using StrokePipeline::StrokePipeline;
};

}  // namespace Qelt
