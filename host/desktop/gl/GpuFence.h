#pragma once

#include <GLES3/gl3.h>

#include "base/HostApi.h"
#include "desktop/gl/GlDevice.h"

namespace QeltDesktop {

// Tells whether the GPU has done with everything up to a point, or waits for that. Render thread.
class QELT_HOST_API GpuFence final : public GlResource {
 public:
  GpuFence() = default;
  ~GpuFence() override;

  // The point is here; an earlier one is forgotten.
  void set();
  // Whether the GPU is past the point. True as well where there is none, and while there is no context. In a
  // browser the answer changes only between two turns of its event loop.
  bool hasPassed();
  // Waits until the GPU is past the point. Not in a browser, which forbids it.
  void wait();

 private:
  void forget() noexcept override { mFence = nullptr; }
  void remake() noexcept override {}
  void drop();

  GLsync mFence = nullptr;
};

}  // namespace QeltDesktop
