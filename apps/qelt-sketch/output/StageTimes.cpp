#include "output/StageTimes.h"

#include <cstdio>
#include <fstream>
#include <optional>
#include <sstream>

namespace QeltDesktop {
namespace {

// In KiB. The figure that getrusage gives may be that of the process that started this one.
std::optional<long> peakMemory() {
  std::ifstream status("/proc/self/status");
  for (std::string line; std::getline(status, line);) {
    std::istringstream words(line);
    std::string name;
    long kibibytes = 0;
    if (words >> name >> kibibytes && name == "VmHWM:") return kibibytes;
  }
  return std::nullopt;
}

}  // namespace

void StageTimes::add(Stage stage, Clock::duration time) {
  const std::lock_guard guard(mLock);
  mTimes[static_cast<std::size_t>(stage)] += time;
}

std::string StageTimes::report() {
  std::string lines;
  const auto tell = [&lines](const char* what, Clock::duration time) {
    std::array<char, 64> line{};
    std::snprintf(line.data(), line.size(), "%-9s %8.3f s\n", what,
                  std::chrono::duration<double>(time).count());
    lines += line.data();
  };
  const std::lock_guard guard(mLock);
  for (std::size_t i = 0; i < kNames.size(); ++i) tell(kNames[i], mTimes[i]);
  tell("whole", Clock::now() - mBegin);
  if (const std::optional<long> peak = peakMemory()) {
    std::array<char, 64> line{};
    std::snprintf(line.data(), line.size(), "%-9s %8.1f MiB\n", "memory",
                  static_cast<double>(*peak) / 1024.0);
    lines += line.data();
  }
  return lines;
}

}  // namespace QeltDesktop
