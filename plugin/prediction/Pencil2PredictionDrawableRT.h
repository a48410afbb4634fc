#pragma once

#include "base/Vector.h"
#include "pencommon/PenPredictionDrawableRT.h"
#include "render/PatternTextures.h"
#include "render/RenderVersions.h"
#include "render/StampRenderer.h"
#include "shaders/Pencil2PredictionShader.h"

namespace Qelt {

// The row of the prediction's render drawable, in the form of RenderVersions.h.
struct PredictionRender {
  static constexpr RenderProfile profile{
      .className = "Pencil2PredictionDrawableRT",
      .expansion = StampExpansion::Antialiased,
      .grainScale = 1.0f,
      .grainFollowsView = false,  // Kept: the grain of a prediction has one size on screen, whatever the zoom
      .points = PatternTextures::PointSource::PaperGrain,
      .hasCacheBuffer = false,
      .hasOpacity = true,
      .logsSetup = true,
  };
  using Shader = Pencil2PredictionShader;
};

extern template class StampRenderer<PenPredictionDrawableRT, PredictionRender>;

// The render drawable of the prediction: stamps with a smoothed rim, under one opacity.
class Pencil2PredictionDrawableRT final : public StampRenderer<PenPredictionDrawableRT, PredictionRender> {
 public:
  explicit Pencil2PredictionDrawableRT(PenGLDataManager* manager) : StampRenderer(manager) {}

  // Render thread: the first point of the live stroke, stroke units; the grain is fixed to it.
  void SetStartPoint(float x, float y) { setStartPoint(x, y); }
  // Main thread, before the stamps of a call are added: how many stroke units a device pixel takes.
  void SetInverseScale(const Vector2<float>& inverseScale) { setInverseScale(inverseScale); }
};

}  // namespace Qelt
