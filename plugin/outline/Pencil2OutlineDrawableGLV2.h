#pragma once

#include "outline/OutlinePipeline.h"
#include "outline/OutlineVersions.h"

namespace Qelt {

extern template class OutlinePipeline<OutlineV2>;

// Outline version 2; all that makes it stands in its row of OutlineVersions.h.
class Pencil2OutlineDrawableGLV2 final : public OutlinePipeline<OutlineV2> {
 public:
  using OutlinePipeline::OutlinePipeline;
};

}  // namespace Qelt
