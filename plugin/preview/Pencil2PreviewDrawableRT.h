#pragma once

#include "pencommon/PenPreviewDrawableRT.h"
#include "preview/PreviewRenderVersions.h"
#include "render/StampRenderer.h"

namespace Qelt {

extern template class StampRenderer<PenPreviewDrawableRT, PreviewRender>;

// The render-thread half of the settings preview: squares, grain repeating every 150 stroke units.
class Pencil2PreviewDrawableRT final : public StampRenderer<PenPreviewDrawableRT, PreviewRender> {
 public:
  explicit Pencil2PreviewDrawableRT(PenGLDataManager* manager);

  // Render thread: the first point of a stroke, stroke units; the grain is fixed to it.
  void SetStartPoint(float x, float y);
};

}  // namespace Qelt
