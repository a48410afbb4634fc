#include <android/log.h>
#include <dlfcn.h>
#include <link.h>

#include <stdexcept>

#include "desktop/platform/Platform.h"

namespace QeltDesktop {

LoadedPlugin loadPlugin(const std::string& path) {
  void* const handle = dlopen(path.c_str(), RTLD_NOW | RTLD_LOCAL | RTLD_NODELETE);
  if (handle == nullptr) {
    const char* const reason = dlerror();
    throw std::runtime_error(reason != nullptr ? reason : path);
  }
  const link_map* found = nullptr;
  const bool isNamed = dlinfo(handle, RTLD_DI_LINKMAP, &found) == 0 && found->l_name[0] != '\0';
  return {handle, isNamed ? found->l_name : path};
}

void* findInPlugin(const LoadedPlugin& plugin, const char* name) {
  return dlsym(plugin.handle, name);
}

// The Android log library, as Debian packages it.
void writeError(const char* line) noexcept {
  __android_log_write(ANDROID_LOG_ERROR, "qel_log", line);
}

void silenceLog() {
  __android_log_set_minimum_priority(ANDROID_LOG_SILENT);
}

}  // namespace QeltDesktop
