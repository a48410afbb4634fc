#pragma once

#include <string>
#include <variant>

#include "play/Options.h"

namespace QeltDesktop {

// The program ends at once: what to print, and with which status. Help goes to standard output (status 0),
// wrong usage to standard error (status 2).
struct UsageEnd {
  std::string text;
  int status;
};

std::variant<Options, UsageEnd> parseOptions(int argc, const char* const* argv);

}  // namespace QeltDesktop
