#pragma once

#include "render/PatternTextures.h"
#include "render/RenderVersions.h"
#include "shaders/Pencil2PreviewShader.h"

// The preview's render drawable, a row like those of RenderVersions.h. There is one.
namespace Qelt {

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

}  // namespace Qelt
