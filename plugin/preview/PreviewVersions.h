#pragma once

#include "pencommon/PenPreviewDrawableRT.h"
#include "render/BatchGuard.h"
#include "render/RenderDrawables.h"
#include "stroke/StrokeRules.h"

// The preview as a row in the form of the strokes' (StrokeVersions.h). There is one, whatever version the pen
// draws with.
namespace Qelt {

class Pencil2PreviewReturnCallback final : public BatchGuard<PenPreviewDrawableRT> {
 public:
  using BatchGuard::BatchGuard;
};

struct PreviewProfile {
  // Input.
  float unknownPressure;    // of finger, mouse, a stylus on a touch screen, and for NaN
  float touchSkipDistance;  // stroke units; shorter moves of those tools are taken every other time
  float tiltCap;            // radians
  // Mappings, see StrokeRules.h.
  float (*tiltBlend)(float meanTilt);
  float (*pointSize)(float size, float tiltBlend);
  float (*pressureAlpha)(float pressure, float colorAlpha, float size);
  // Placement. On curves at a spacing carried from segment to segment; straight segments get so many stamps,
  // evenly from their start. The count is the ramps' number of steps in both.
  float spacingPerSize;  // spacing as a share of the pen size
  int (*stampCount)(float length, float size);
  // Hand-over.
  float (*stampSize)(float width);
  float (*stampAlpha)(float alpha);
  float (*stampReach)(float width);
};

struct PreviewVersion {
  static constexpr const char* name = "Pencil2PreviewDrawableGL";
  static constexpr PreviewProfile profile{
      .unknownPressure = 0.5f,
      .touchSkipDistance = 50.0f,
      .tiltCap = 1.0f,
      .tiltBlend = rules::tiltBlendV5,
      .pointSize = rules::pointSizeV5,
      .pressureAlpha = rules::pressureAlphaV2,
      .spacingPerSize = 0.08f,
      .stampCount = rules::stampCountV3,
      .stampSize = rules::stampWidthPreview,
      .stampAlpha = rules::stampAlphaPreview,
      .stampReach = rules::stampReachPreview,
  };
  static constexpr int tiltWindow = 3;
  static constexpr int orientationWindow = 3;
  using RenderDrawable = Pencil2PreviewDrawableRT;
  using ReturnGuard = Pencil2PreviewReturnCallback;
};

}  // namespace Qelt
