#include "desktop/base/Log.h"

#include <android/log.h>

namespace QeltDesktop {

void logError(const std::string& text) noexcept {
  __android_log_write(ANDROID_LOG_ERROR, "qel_log", text.c_str());
}

}  // namespace QeltDesktop
