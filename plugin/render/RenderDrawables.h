#pragma once

#include "pencommon/PenPredictionDrawableRT.h"
#include "pencommon/PenPreviewDrawableRT.h"
#include "pencommon/PenStrokeDrawableRT.h"
#include "render/RenderVersions.h"
#include "render/StampRenderer.h"

// The render drawables of strokes, preview and prediction, each a row of RenderVersions.h.
namespace Qelt {

// The base of the stroke render drawables; adds nothing to the host's.
class Pencil2StrokeDrawableRT : public PenStrokeDrawableRT {
 public:
  using PenStrokeDrawableRT::PenStrokeDrawableRT;
};

extern template class StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV1>;
extern template class StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV2>;
extern template class StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV3>;
extern template class StampRenderer<PenPreviewDrawableRT, PreviewRender>;
extern template class StampRenderer<PenPredictionDrawableRT, PredictionRender>;

// Draws square stamps; the grain repeats every 150 stroke units.
class Pencil2StrokeDrawableRTV1 final : public StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV1> {
 public:
  using StampRenderer::StampRenderer;
};

// As RTV1, with the grain at half the size: it repeats every 75 stroke units.
class Pencil2StrokeDrawableRTV2 final : public StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV2> {
 public:
  using StampRenderer::StampRenderer;
};

// Draws anti-aliased stamps, smoothed by the view's scale; the grain repeats every 75 stroke units.
class Pencil2StrokeDrawableRTV3 final : public StampRenderer<Pencil2StrokeDrawableRT, StrokeRenderV3> {
 public:
  using StampRenderer::StampRenderer;
};

// Draws the settings preview with square stamps; the grain repeats every 150 stroke units.
class Pencil2PreviewDrawableRT final : public StampRenderer<PenPreviewDrawableRT, PreviewRender> {
 public:
  using StampRenderer::StampRenderer;
};

// Draws the prediction with anti-aliased stamps, under one opacity; the grain repeats every 150 window
// pixels.
class Pencil2PredictionDrawableRT final : public StampRenderer<PenPredictionDrawableRT, PredictionRender> {
 public:
  using StampRenderer::StampRenderer;
};

}  // namespace Qelt
