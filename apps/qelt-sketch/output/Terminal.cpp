#include "output/Terminal.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <utility>

#include "text/Refusal.h"

namespace QeltDesktop {

void finishStandardOutput() {
  errno = 0;
  const bool flushed = std::fflush(stdout) == 0 && std::ferror(stdout) == 0;
  if (flushed) return;
  const std::string why = errno != 0 ? std::string(": ") + std::strerror(errno) : std::string();
  throw Refusal("standard output cannot be written" + why);
}

Progress::Progress(std::string what, std::size_t total)
    : mWhat(std::move(what)),
      mTotal(total),
      mOnTerminal(isatty(STDERR_FILENO) != 0),
      mNextShow(mBegin + std::chrono::milliseconds(300)) {}

Progress Progress::silent() {
  return Progress();
}

void Progress::clear() {
  if (std::exchange(mShown, false)) std::fputs("\r\033[K", stderr);
}

void Progress::step() {
  ++mDone;
  if (!mOnTerminal || Clock::now() < mNextShow) return;
  mNextShow = Clock::now() + std::chrono::milliseconds(100);
  mShown = true;
  const double seconds = std::chrono::duration<double>(Clock::now() - mBegin).count();
  const double rate = static_cast<double>(mDone) / seconds;
  // Three digits; whole numbers, never in powers of ten, where those are not enough.
  const bool isLarge = rate >= 100.0;
  std::fprintf(stderr, "\r%s %zu of %zu, %.*g a second, %.0f s left\033[K", mWhat.c_str(), mDone, mTotal,
               isLarge ? 15 : 3, isLarge ? std::round(rate) : rate,
               static_cast<double>(mTotal - std::min(mDone, mTotal)) / rate);
  std::fflush(stderr);
}

}  // namespace QeltDesktop
