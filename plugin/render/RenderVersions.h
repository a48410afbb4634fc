#pragma once

#include "render/PatternTextures.h"
#include "shaders/Pencil2StrokeShaderV1.h"
#include "shaders/Pencil2StrokeShaderV2.h"

// The stroke render drawables side by side. A released row is frozen: documents drawn with it must look the
// same for ever. New behaviour is a new row. (The preview's and the prediction's rows stand beside their
// drawables, in the same form.)
namespace Qelt {

// How a stamp's size becomes vertices.
enum class StampExpansion {
  Square,       // the size is the stamp's width; 9 floats a vertex
  Antialiased,  // the size is the half width; 11 floats a vertex, with the rim's ramp
};

struct RenderProfile {
  const char* className;  // in debug names and log lines
  StampExpansion expansion;
  float grainScale;       // the grain's size on screen, as a share of its natural one
  bool grainFollowsView;  // natural: 150 stroke units under the view's transform; else 150 window pixels
  PatternTextures::PointSource points;
  bool hasCacheBuffer;  // draws from the stroke-data cache as well
  bool hasOpacity;      // an overall opacity in the shader
  bool logsSetup;       // notes Init and CreatePenCanvas in the debug log
};

struct StrokeRenderV1 {
  static constexpr RenderProfile profile{
      .className = "Pencil2StrokeDrawableRTV1",
      .expansion = StampExpansion::Square,
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
      .expansion = StampExpansion::Square,
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
      .expansion = StampExpansion::Antialiased,
      .grainScale = 0.5f,
      .grainFollowsView = true,
      .points = PatternTextures::PointSource::StampShapes,
      .hasCacheBuffer = true,
      .hasOpacity = false,
      .logsSetup = false,
  };
  using Shader = Pencil2StrokeShaderV2;
};

}  // namespace Qelt
