#pragma once

#include "render/Pencil2StrokeDrawableRT.h"
#include "render/StampRenderer.h"

namespace Qelt {

extern template class StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV1>;

// Squares, grain repeating every 150 stroke units.
class Pencil2StrokeDrawableRTV1 final : public StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV1> {
 public:
  explicit Pencil2StrokeDrawableRTV1(PenGLDataManager* manager);

  // Render thread: the first point of a stroke, stroke units; the grain is fixed to it.
  void SetStartPoint(float x, float y);
};

}  // namespace Qelt
