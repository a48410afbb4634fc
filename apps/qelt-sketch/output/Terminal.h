#pragma once

#include <chrono>
#include <cstddef>
#include <string>

namespace QeltDesktop {

// Flushes standard output. Throws Refusal when that, or an earlier print to it, failed.
void finishStandardOutput();

// One line on the terminal that counts what is done. Prints nothing when standard error is not a terminal,
// nor in the first moments of a run.
class Progress {
 public:
  Progress(std::string what, std::size_t total);
  // Clears the line.
  ~Progress();
  Progress(const Progress&) = delete;
  Progress& operator=(const Progress&) = delete;

  void step();

 private:
  using Clock = std::chrono::steady_clock;

  std::string mWhat;
  std::size_t mTotal;
  std::size_t mDone = 0;
  bool mOnTerminal;
  bool mShown = false;
  Clock::time_point mNextShow;
};

}  // namespace QeltDesktop
