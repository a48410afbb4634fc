#pragma once

#include "render/Pencil2StrokeDrawableRT.h"
#include "render/StampRenderer.h"

namespace Qelt {

extern template class StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV2>;

// Version 1 with the grain at half the size: it repeats every 75 stroke units.
class Pencil2StrokeDrawableRTV2 final : public StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV2> {
 public:
  explicit Pencil2StrokeDrawableRTV2(PenGLDataManager* manager);

  // Render thread: the first point of a stroke, stroke units; the grain is fixed to it.
  void SetStartPoint(float x, float y);
};

}  // namespace Qelt
