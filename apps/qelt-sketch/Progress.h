#pragma once

#include <chrono>
#include <cstddef>
#include <string>

namespace QeltDesktop {

// One line on the terminal that counts what is done. Silent when standard error is no terminal, and while a
// run is short.
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
