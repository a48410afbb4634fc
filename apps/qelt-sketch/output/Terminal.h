#pragma once

#include <chrono>
#include <cstddef>
#include <string>

namespace QeltDesktop {

// Flushes standard output. Throws Refusal when that, or an earlier print to it, failed.
void finishStandardOutput();

// One line on the terminal that counts what is done, and tells how fast and how long it will take. Prints
// nothing when standard error is not a terminal, nor in the first moments of a run.
class Progress {
 public:
  Progress(std::string what, std::size_t total);
  // One that never prints.
  static Progress silent();
  ~Progress() { clear(); }
  Progress(const Progress&) = delete;
  Progress& operator=(const Progress&) = delete;

  void step();
  // Clears the line, so that something else can be told; the next step may show it again.
  void clear();

 private:
  using Clock = std::chrono::steady_clock;

  Progress() = default;

  std::string mWhat;
  std::size_t mTotal = 0;
  std::size_t mDone = 0;
  bool mOnTerminal = false;
  bool mShown = false;
  const Clock::time_point mBegin = Clock::now();
  Clock::time_point mNextShow;
};

}  // namespace QeltDesktop
