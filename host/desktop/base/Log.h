#pragma once

#include <string>

#include "base/HostApi.h"

namespace QeltDesktop {

// Writes one line of priority error to where the pens' own lines go. Any thread. Takes no memory.
QELT_HOST_API void logError(const char* text) noexcept;
// Writes "what: detail"; a long detail is cut.
QELT_HOST_API void logError(const char* what, const char* detail) noexcept;
inline void logError(const std::string& text) noexcept {
  logError(text.c_str());
}

}  // namespace QeltDesktop
