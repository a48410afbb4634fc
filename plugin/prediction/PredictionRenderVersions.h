#pragma once

#include "render/PatternTextures.h"
#include "render/RenderVersions.h"
#include "shaders/Pencil2PredictionShader.h"

// The prediction's render drawable, a row like those of RenderVersions.h. There is one.
namespace Qelt {

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

}  // namespace Qelt
