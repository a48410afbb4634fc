#pragma once

#include <string>

#include "base/HostApi.h"

namespace QeltDesktop {

// Writes one line to the Android log under the tag the pens use, priority error. Any thread.
QELT_HOST_API void logError(const std::string& text) noexcept;

}  // namespace QeltDesktop
