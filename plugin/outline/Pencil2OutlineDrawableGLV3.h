#pragma once

#include "outline/OutlinePipeline.h"
#include "outline/OutlineVersions.h"

namespace Qelt {

extern template class OutlinePipeline<OutlineV3>;

// Outline version 3; all that makes it stands in its row of OutlineVersions.h.
class Pencil2OutlineDrawableGLV3 final : public OutlinePipeline<OutlineV3> {
 public:
  using OutlinePipeline::OutlinePipeline;
};

}  // namespace Qelt
