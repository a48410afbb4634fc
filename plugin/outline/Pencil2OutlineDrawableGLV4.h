#pragma once

#include "outline/OutlinePipeline.h"
#include "outline/OutlineVersions.h"

namespace Qelt {

extern template class OutlinePipeline<OutlineV4>;

// Outline version 4; all that makes it stands in its row of OutlineVersions.h.
class Pencil2OutlineDrawableGLV4 final : public OutlinePipeline<OutlineV4> {
 public:
  using OutlinePipeline::OutlinePipeline;
};

}  // namespace Qelt
