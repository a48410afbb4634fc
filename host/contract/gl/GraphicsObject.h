#pragma once

#include "base/HostApi.h"

namespace Qelt {

// A vertex buffer with its layout and primitive type. Render thread.
class QELT_HOST_API GraphicsObject {
 public:
  // Uploads `vertexCount` vertices, replacing what buffer `index` held. The data is copied.
  virtual void updateBuffer(int index, const void* data, int vertexCount) = 0;
  // Draws `count` vertices from `first`; -1 means all uploaded. The pen passes (0, -1, true, 0).
  virtual void draw(int first, int count, bool useVertexState, int instances) = 0;
  // Destroys the object.
  virtual void release() = 0;

 protected:
  virtual ~GraphicsObject();
};

}  // namespace Qelt
