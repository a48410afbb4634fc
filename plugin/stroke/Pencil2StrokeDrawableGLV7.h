#pragma once

#include "stroke/StrokePipeline.h"
#include "stroke/StrokeVersions.h"

namespace Qelt {

extern template class StrokePipeline<StrokeV7>;

// Stroke version 7; all that makes it stands in its row of StrokeVersions.h.
class Pencil2StrokeDrawableGLV7 final : public StrokePipeline<StrokeV7> {
 public:
  using StrokePipeline::StrokePipeline;
};

}  // namespace Qelt
