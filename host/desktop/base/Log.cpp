#include "desktop/base/Log.h"

#include <array>
#include <cstdio>

#include "desktop/platform/Platform.h"

namespace QeltDesktop {

void logError(const char* text) noexcept {
  writeError(text);
}

void logError(const char* what, const char* detail) noexcept {
  std::array<char, 512> line{};
  std::snprintf(line.data(), line.size(), "%s: %s", what, detail);
  logError(line.data());
}

}  // namespace QeltDesktop
