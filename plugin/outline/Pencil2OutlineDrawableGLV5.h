#pragma once

#include "outline/OutlinePipeline.h"
#include "outline/OutlineVersions.h"

namespace Qelt {

extern template class OutlinePipeline<OutlineV5>;

// Outline version 5; all that makes it stands in its row of OutlineVersions.h.
class Pencil2OutlineDrawableGLV5 final : public OutlinePipeline<OutlineV5> {
 public:
  using OutlinePipeline::OutlinePipeline;
};

}  // namespace Qelt
