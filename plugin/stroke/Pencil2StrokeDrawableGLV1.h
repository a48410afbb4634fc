#pragma once

#include "stroke/StrokePipeline.h"
#include "stroke/StrokeVersions.h"

namespace Qelt {

extern template class StrokePipeline<StrokeV1>;

// Stroke version 1; all that makes it stands in its row of StrokeVersions.h.
class Pencil2StrokeDrawableGLV1 final : public StrokePipeline<StrokeV1> {
 public:
  using StrokePipeline::StrokePipeline;
};

}  // namespace Qelt
