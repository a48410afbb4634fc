#include "support/LogCapture.h"

#include <android/log.h>

#include <mutex>
#include <utility>

namespace QeltTests {

namespace {

std::mutex gLock;
std::vector<LogLine> gLines;

void keep(const __android_logger_data* about, const char* message) {
  const std::lock_guard<std::mutex> hold(gLock);
  gLines.push_back({about->priority, about->tag == nullptr ? "" : about->tag, message});
}

}  // namespace

LogCapture::LogCapture() {
  take();
  __android_log_set_logger(keep);
  // By itself the log drops what is below info.
  mMinimumPriority = __android_log_set_minimum_priority(ANDROID_LOG_VERBOSE);
}

LogCapture::~LogCapture() {
  __android_log_set_minimum_priority(mMinimumPriority);
  __android_log_set_logger(__android_log_stderr_logger);
}

std::vector<LogLine> LogCapture::take() {
  const std::lock_guard<std::mutex> hold(gLock);
  return std::exchange(gLines, {});
}

}  // namespace QeltTests
