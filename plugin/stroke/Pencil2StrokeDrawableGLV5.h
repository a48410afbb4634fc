#pragma once

#include "stroke/StrokePipeline.h"
#include "stroke/StrokeVersions.h"

namespace Qelt {

extern template class StrokePipeline<StrokeV5>;

// Stroke version 5; all that makes it stands in its row of StrokeVersions.h.
class Pencil2StrokeDrawableGLV5 final : public StrokePipeline<StrokeV5> {
 public:
  using StrokePipeline::StrokePipeline;
};

}  // namespace Qelt
