#pragma once

#include "base/HostApi.h"

namespace Qelt {

class IGLMsgQueue;
class ISPBitmap;
class ISPCanvas;

// Makes bitmaps and canvases. Render thread. Makers return null when they fail; releasing null is allowed.
class QELT_HOST_API SPGraphicsFactory {
 public:
  // A width x height RGBA8 bitmap, with `pixels` as its first contents when given, else zeros. The pen
  // passes (queue, w, h, null, false, 0); the last two are the host's own.
  static ISPBitmap* CreateBitmap(IGLMsgQueue* queue, int width, int height, const void* pixels, bool shared,
                                 int flags);
  static void ReleaseBitmap(ISPBitmap* bitmap);

  // A canvas that draws into a bitmap, which outlives it; not into a layer's. What it draws comes back after
  // a loss of the context; what was uploaded to the bitmap does not. The pen passes flags 0.
  static ISPCanvas* CreateCanvas(IGLMsgQueue* queue, ISPBitmap* bitmap, int flags);
  static void ReleaseCanvas(ISPCanvas* canvas);
};

}  // namespace Qelt
