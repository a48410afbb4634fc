#pragma once

#include "stroke/StrokePipeline.h"
#include "stroke/StrokeVersions.h"

namespace Qelt {

extern template class StrokePipeline<StrokeV4>;

// Stroke version 4; all that makes it stands in its row of StrokeVersions.h.
class Pencil2StrokeDrawableGLV4 final : public StrokePipeline<StrokeV4> {
 public:
  using StrokePipeline::StrokePipeline;
};

}  // namespace Qelt
