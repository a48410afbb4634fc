#pragma once

#include "play/Options.h"

namespace QeltDesktop {

// Tells on standard output about the plug-in, the renderer, the version table and the pen's limits. Throws
// Refusal where there is no plug-in, or one that is no pen.
void info(const Options& options);

}  // namespace QeltDesktop
