#include <android/log.h>
#include <emscripten/console.h>

#include <array>
#include <cstdarg>
#include <cstdio>
#include <stdexcept>
#include <string_view>

#include "desktop/platform/Platform.h"

namespace Qelt {
class Pen;
}

// The pen's entry point, which is linked in: a page has no shared libraries.
extern "C" Qelt::Pen* createPenInst();

namespace {

bool gSilent = false;

}  // namespace

int __android_log_write(int priority, const char* tag, const char* text) {
  if (gSilent) return 0;
  std::array<char, 1024> line{};
  const int length = std::snprintf(line.data(), line.size(), "%s: %s", tag, text);
  if (priority >= ANDROID_LOG_ERROR) {
    emscripten_console_error(line.data());
  } else if (priority == ANDROID_LOG_WARN) {
    emscripten_console_warn(line.data());
  } else {
    emscripten_console_log(line.data());
  }
  return length;
}

int __android_log_print(int priority, const char* tag, const char* format, ...) {
  std::array<char, 1024> text{};
  va_list arguments;
  va_start(arguments, format);
  std::vsnprintf(text.data(), text.size(), format, arguments);
  va_end(arguments);
  return __android_log_write(priority, tag, text.data());
}

namespace QeltDesktop {

LoadedPlugin loadPlugin(const std::string&) {
  return {reinterpret_cast<void*>(&createPenInst), "linked into the page"};
}

void* findInPlugin(const LoadedPlugin& plugin, const char* name) {
  return std::string_view(name) == "createPenInst" ? plugin.handle : nullptr;
}

void writeError(const char* line) noexcept {
  __android_log_write(ANDROID_LOG_ERROR, "qel_log", line);
}

void silenceLog() {
  gSilent = true;
}

}  // namespace QeltDesktop
