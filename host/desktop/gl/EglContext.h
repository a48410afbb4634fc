#pragma once

#include <string>

#include "base/HostApi.h"

namespace QeltDesktop {

// One OpenGL ES 3.0 context without a window. The only place that knows how a context is made; a build for
// another platform replaces its source file. All calls come from the thread that draws.
class QELT_HOST_API EglContext {
 public:
  // Makes a context; it is not current yet. Throws std::runtime_error when the machine has none.
  EglContext();
  ~EglContext();
  EglContext(const EglContext&) = delete;
  EglContext& operator=(const EglContext&) = delete;

  // Makes this the calling thread's context; throws std::runtime_error when that fails.
  void makeCurrent();
  // Leaves the calling thread without a context.
  void clearCurrent();

 private:
  void* mDisplay = nullptr;
  void* mSurface = nullptr;  // a 1 x 1 stand-in, where contexts without any surface are not offered
  void* mContext = nullptr;
};

}  // namespace QeltDesktop
