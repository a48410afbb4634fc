#include "desktop/gl/GlCall.h"

#include <string>

#include "desktop/base/Log.h"

namespace QeltDesktop {

void reportGlErrors(const char* file, int line) {
  // A lost context reports an error for ever.
  constexpr int kMostErrors = 8;
  for (int i = 0; i < kMostErrors; ++i) {
    const GLenum error = glGetError();
    if (error == GL_NO_ERROR) return;
    logError("GL error " + std::to_string(error) + " at " + file + ":" + std::to_string(line));
  }
}

}  // namespace QeltDesktop
