#pragma once

#include <android/log.h>

namespace Qelt {

inline constexpr const char* kLogTag = "qel_log";

// Priorities of the platform log that the pen uses.
inline constexpr int kLogDebug = ANDROID_LOG_DEBUG;
inline constexpr int kLogInfo = ANDROID_LOG_INFO;
inline constexpr int kLogError = ANDROID_LOG_ERROR;

static_assert(kLogDebug == 3 && kLogInfo == 4 && kLogError == 6);

}  // namespace Qelt
