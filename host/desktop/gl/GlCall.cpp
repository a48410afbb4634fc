#include "desktop/gl/GlCall.h"

#include <string>

#include "desktop/base/Log.h"

namespace QeltDesktop {

namespace {

// A lost context reports an error for ever.
constexpr int kMostErrors = 8;

}  // namespace

void reportGlErrors(const char* file, int line) {
  for (int i = 0; i < kMostErrors; ++i) {
    const GLenum error = glGetError();
    if (error == GL_NO_ERROR) return;
    logError("GL error " + std::to_string(error) + " at " + file + ":" + std::to_string(line));
  }
}

bool takeGlErrors() {
  int errors = 0;
  while (errors < kMostErrors && glGetError() != GL_NO_ERROR) ++errors;
  return errors == 0;
}

}  // namespace QeltDesktop
