#include "StandardOutput.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <string>

#include "Refusal.h"

namespace QeltDesktop {

void finishStandardOutput() {
  errno = 0;
  const bool flushed = std::fflush(stdout) == 0 && std::ferror(stdout) == 0;
  if (flushed) return;
  const std::string why = errno != 0 ? std::string(": ") + std::strerror(errno) : std::string();
  throw Refusal("standard output cannot be written" + why);
}

}  // namespace QeltDesktop
