#include "desktop/base/Log.h"

#include <android/log.h>

#include <array>
#include <cstdio>

namespace QeltDesktop {

void logError(const char* text) noexcept {
  __android_log_write(ANDROID_LOG_ERROR, "qel_log", text);
}

void logError(const char* what, const char* detail) noexcept {
  std::array<char, 512> line{};
  std::snprintf(line.data(), line.size(), "%s: %s", what, detail);
  logError(line.data());
}

}  // namespace QeltDesktop
