#pragma once

#include "pencommon/PenOutlineDrawableRT.h"

namespace Qelt {

// The base of the outline render drawables; adds nothing to the host's.
class Pencil2OutlineDrawableRT : public PenOutlineDrawableRT {
 public:
  using PenOutlineDrawableRT::PenOutlineDrawableRT;
};

}  // namespace Qelt
