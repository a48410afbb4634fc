#pragma once

#include <tuple>

#include "outline/OutlinePipeline.h"
#include "outline/OutlineVersions.h"

// The outline drawables, one class per version; all that makes one stands in its row of OutlineVersions.h.
namespace Qelt {

extern template class OutlinePipeline<OutlineV1>;
extern template class OutlinePipeline<OutlineV2>;
extern template class OutlinePipeline<OutlineV3>;
extern template class OutlinePipeline<OutlineV4>;
extern template class OutlinePipeline<OutlineV5>;

class Pencil2OutlineDrawableGLV1 final : public OutlinePipeline<OutlineV1> {
 public:
  using OutlinePipeline::OutlinePipeline;
};

class Pencil2OutlineDrawableGLV2 final : public OutlinePipeline<OutlineV2> {
 public:
  using OutlinePipeline::OutlinePipeline;
};

class Pencil2OutlineDrawableGLV3 final : public OutlinePipeline<OutlineV3> {
 public:
  using OutlinePipeline::OutlinePipeline;
};

class Pencil2OutlineDrawableGLV4 final : public OutlinePipeline<OutlineV4> {
 public:
  using OutlinePipeline::OutlinePipeline;
};

class Pencil2OutlineDrawableGLV5 final : public OutlinePipeline<OutlineV5> {
 public:
  using OutlinePipeline::OutlinePipeline;
};

// Lists the classes for the factory. A version that is not in the list is drawn by version 1.
using OutlineDrawables =
    std::tuple<Pencil2OutlineDrawableGLV1, Pencil2OutlineDrawableGLV2, Pencil2OutlineDrawableGLV3,
               Pencil2OutlineDrawableGLV4, Pencil2OutlineDrawableGLV5>;

}  // namespace Qelt
