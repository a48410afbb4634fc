#pragma once

#include "base/HostApi.h"
#include "base/Vector.h"

namespace Qelt {

// State of the current GL context, by GL's own numbers. Render thread.
class QELT_HOST_API OpenGLRenderer {
 public:
  static void enableState(unsigned int capability);
  static void disableState(unsigned int capability);
  // Source and destination factor of colour, then of alpha.
  static void setBlendFuncFactors(unsigned int sourceColor, unsigned int destinationColor,
                                  unsigned int sourceAlpha, unsigned int destinationAlpha);
  // x, y, width and height in window pixels.
  static Vector4<int> getViewport();
  // Tells the driver that attachments are done with: bit 1 depth, bit 2 stencil. Chosen here: the bits
  // (the pen passes 6; the colour must survive).
  static void discardFramebuffer(int attachments);
};

}  // namespace Qelt
