#include "desktop/gl/GpuFence.h"

#include "desktop/gl/GlCall.h"

namespace QeltDesktop {

GpuFence::~GpuFence() {
  drop();
}

void GpuFence::set() {
  if (!isLive()) return;
  drop();
  mFence = gl(glFenceSync)(GL_SYNC_GPU_COMMANDS_COMPLETE, 0);
  // What is never sent on is never passed.
  gl(glFlush)();
}

bool GpuFence::hasPassed() {
  if (mFence == nullptr || !isLive()) return true;
  if (gl(glClientWaitSync)(mFence, 0, 0) == GL_TIMEOUT_EXPIRED) return false;
  drop();
  return true;
}

void GpuFence::wait() {
  constexpr GLuint64 kSecond = 1'000'000'000;  // ns; drivers may not take more
  while (mFence != nullptr && isLive() && gl(glClientWaitSync)(mFence, 0, kSecond) == GL_TIMEOUT_EXPIRED) {
  }
  drop();
}

void GpuFence::drop() {
  if (mFence != nullptr && isLive()) gl(glDeleteSync)(mFence);
  mFence = nullptr;
}

}  // namespace QeltDesktop
