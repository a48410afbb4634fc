#pragma once

#include "render/Pencil2StrokeDrawableRT.h"
#include "render/StampRenderer.h"

namespace Qelt {

extern template class StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV3>;

// Anti-aliased stamps that know the view's scale; grain repeating every 75 stroke units.
class Pencil2StrokeDrawableRTV3 final : public StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV3> {
 public:
  explicit Pencil2StrokeDrawableRTV3(PenGLDataManager* manager);

  // Render thread: the first point of a stroke, stroke units; the grain is fixed to it.
  void SetStartPoint(float x, float y);
  // Main thread: stroke units a device pixel, before the stamps of a call are added.
  void SetInverseScale(const Vector2<float>& inverseScale);
};

}  // namespace Qelt
