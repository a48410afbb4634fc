#pragma once

#include "pencommon/PenStrokeDrawableRT.h"

namespace Qelt {

// The base of the stroke render drawables; adds nothing to the host's.
class Pencil2StrokeDrawableRT : public PenStrokeDrawableRT {
 public:
  using PenStrokeDrawableRT::PenStrokeDrawableRT;
};

}  // namespace Qelt
