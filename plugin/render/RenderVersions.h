#pragma once

#include "render/PatternTextures.h"
#include "render/StampVertices.h"
#include "shaders/PencilShaders.h"

// The render drawables of stamps side by side, a row each. A released row is frozen: documents drawn with it
// must look the same for ever. New behaviour is a new row. (Outlines have a render drawable of their own.)
namespace Qelt {

struct RenderProfile {
  const char* className;  // in debug names and log lines
  // kSquareVertex: a stamp's size is its width. kAntialiasedVertex: the size is half the width, and the
  // view's scale decides how the rim is smoothed.
  VertexLayout vertex;
  float grainScale;  // factor on the grain's period of 150
  // Whether the period is in stroke units, and so follows the zoom, or in window pixels.
  bool grainFollowsView;
  PatternTextures::PointSource points;
  bool hasCacheBuffer;  // draws from the stroke cache as well
  bool hasOpacity;      // an overall opacity in the shader
  bool logsSetup;       // notes Init and CreatePenCanvas in the debug log
};

struct StrokeRenderV1 {
  static constexpr RenderProfile profile{
      .className = "Pencil2StrokeDrawableRTV1",
      .vertex = kSquareVertex,
      .grainScale = 1.0f,
      .grainFollowsView = true,
      .points = PatternTextures::PointSource::StampShapes,
      .hasCacheBuffer = true,
      .hasOpacity = false,
      .logsSetup = false,
  };
  using Shader = Pencil2StrokeShaderV1;
};

struct StrokeRenderV2 {
  static constexpr RenderProfile profile{
      .className = "Pencil2StrokeDrawableRTV2",
      .vertex = kSquareVertex,
      .grainScale = 0.5f,
      .grainFollowsView = true,
      .points = PatternTextures::PointSource::StampShapes,
      .hasCacheBuffer = true,
      .hasOpacity = false,
      .logsSetup = false,
  };
  using Shader = Pencil2StrokeShaderV1;
};

struct StrokeRenderV3 {
  static constexpr RenderProfile profile{
      .className = "Pencil2StrokeDrawableRTV3",
      .vertex = kAntialiasedVertex,
      .grainScale = 0.5f,
      .grainFollowsView = true,
      .points = PatternTextures::PointSource::StampShapes,
      .hasCacheBuffer = true,
      .hasOpacity = false,
      .logsSetup = false,
  };
  using Shader = Pencil2StrokeShaderV2;
};

struct PreviewRender {
  static constexpr RenderProfile profile{
      .className = "Pencil2PreviewDrawableRT",
      .vertex = kSquareVertex,
      .grainScale = 1.0f,
      .grainFollowsView = true,
      .points = PatternTextures::PointSource::StampShapes,
      .hasCacheBuffer = false,
      .hasOpacity = false,
      .logsSetup = true,
  };
  using Shader = Pencil2PreviewShader;
};

struct PredictionRender {
  static constexpr RenderProfile profile{
      .className = "Pencil2PredictionDrawableRT",
      .vertex = kAntialiasedVertex,
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
