#pragma once

#include "stroke/StrokePipeline.h"
#include "stroke/StrokeVersions.h"

namespace Qelt {

extern template class StrokePipeline<StrokeV8>;

// Stroke version 8; all that makes it stands in its row of StrokeVersions.h.
class Pencil2StrokeDrawableGLV8 final : public StrokePipeline<StrokeV8> {
 public:
  using StrokePipeline::StrokePipeline;
};

}  // namespace Qelt
