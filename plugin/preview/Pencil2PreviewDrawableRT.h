#pragma once

#include "pencommon/PenPreviewDrawableRT.h"
#include "render/PatternTextures.h"
#include "render/RenderVersions.h"
#include "render/StampRenderer.h"
#include "shaders/Pencil2PreviewShader.h"

namespace Qelt {

// The row of the preview's render drawable, in the form of RenderVersions.h.
struct PreviewRender {
  static constexpr RenderProfile profile{
      .className = "Pencil2PreviewDrawableRT",
      .expansion = StampExpansion::Square,
      .grainScale = 1.0f,
      .grainFollowsView = true,
      .points = PatternTextures::PointSource::StampShapes,
      .hasCacheBuffer = false,
      .hasOpacity = false,
      .logsSetup = true,
  };
  using Shader = Pencil2PreviewShader;
};

extern template class StampRenderer<PenPreviewDrawableRT, PreviewRender>;

// The render drawable of the settings preview: squares, and grain that repeats every 150 stroke units.
class Pencil2PreviewDrawableRT final : public StampRenderer<PenPreviewDrawableRT, PreviewRender> {
 public:
  explicit Pencil2PreviewDrawableRT(PenGLDataManager* manager) : StampRenderer(manager) {}

  // Render thread: the first point of a stroke, stroke units; the grain is fixed to it.
  void SetStartPoint(float x, float y) { setStartPoint(x, y); }
};

}  // namespace Qelt
