#pragma once

#include <string>

#include "play/Options.h"

namespace QeltDesktop {

// The plug-in that was asked for, else the one that comes with the program. Throws Refusal where that is
// gone.
std::string pluginPath(const Options& options);

// The page that was asked for, else the sample page. Throws Refusal where that is gone.
std::string inputPath(const Options& options);

}  // namespace QeltDesktop
