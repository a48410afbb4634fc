#pragma once

#include <tuple>

#include "stroke/StrokePipeline.h"
#include "stroke/StrokeVersions.h"

// The stroke drawables, one class per version; all that makes one stands in its row of StrokeVersions.h.
namespace Qelt {

extern template class StrokePipeline<StrokeV1>;
extern template class StrokePipeline<StrokeV2>;
extern template class StrokePipeline<StrokeV3>;
extern template class StrokePipeline<StrokeV4>;
extern template class StrokePipeline<StrokeV5>;
extern template class StrokePipeline<StrokeV7>;
extern template class StrokePipeline<StrokeV8>;

class Pencil2StrokeDrawableGLV1 final : public StrokePipeline<StrokeV1> {
 public:
  using StrokePipeline::StrokePipeline;
};

class Pencil2StrokeDrawableGLV2 final : public StrokePipeline<StrokeV2> {
 public:
  using StrokePipeline::StrokePipeline;
};

class Pencil2StrokeDrawableGLV3 final : public StrokePipeline<StrokeV3> {
 public:
  using StrokePipeline::StrokePipeline;
};

class Pencil2StrokeDrawableGLV4 final : public StrokePipeline<StrokeV4> {
 public:
  using StrokePipeline::StrokePipeline;
};

class Pencil2StrokeDrawableGLV5 final : public StrokePipeline<StrokeV5> {
 public:
  using StrokePipeline::StrokePipeline;
};

class Pencil2StrokeDrawableGLV7 final : public StrokePipeline<StrokeV7> {
 public:
  using StrokePipeline::StrokePipeline;
};

class Pencil2StrokeDrawableGLV8 final : public StrokePipeline<StrokeV8> {
 public:
  using StrokePipeline::StrokePipeline;
};

// Lists the classes for the factory. A version that is not in the list is drawn by version 1.
using StrokeDrawables =
    std::tuple<Pencil2StrokeDrawableGLV1, Pencil2StrokeDrawableGLV2, Pencil2StrokeDrawableGLV3,
               Pencil2StrokeDrawableGLV4, Pencil2StrokeDrawableGLV5, Pencil2StrokeDrawableGLV7,
               Pencil2StrokeDrawableGLV8>;

}  // namespace Qelt
