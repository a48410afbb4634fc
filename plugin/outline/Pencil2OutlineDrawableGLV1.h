#pragma once

#include "outline/OutlinePipeline.h"
#include "outline/OutlineVersions.h"

namespace Qelt {

extern template class OutlinePipeline<OutlineV1>;

// Outline version 1; all that makes it stands in its row of OutlineVersions.h.
class Pencil2OutlineDrawableGLV1 final : public OutlinePipeline<OutlineV1> {
 public:
  using OutlinePipeline::OutlinePipeline;
};

}  // namespace Qelt
