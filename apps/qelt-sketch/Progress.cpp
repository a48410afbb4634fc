#include "Progress.h"

#include <unistd.h>

#include <cstdio>
#include <utility>

namespace QeltDesktop {

Progress::Progress(std::string what, std::size_t total)
    : mWhat(std::move(what)),
      mTotal(total),
      mOnTerminal(isatty(STDERR_FILENO) != 0),
      mNextShow(Clock::now() + std::chrono::milliseconds(300)) {}

Progress::~Progress() {
  if (mShown) std::fputs("\r\033[K", stderr);
}

void Progress::step() {
  ++mDone;
  if (!mOnTerminal || Clock::now() < mNextShow) return;
  mNextShow = Clock::now() + std::chrono::milliseconds(100);
  mShown = true;
  std::fprintf(stderr, "\r%s %zu of %zu\033[K", mWhat.c_str(), mDone, mTotal);
  std::fflush(stderr);
}

}  // namespace QeltDesktop
