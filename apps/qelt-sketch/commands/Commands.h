#pragma once

#include "play/Options.h"

namespace QeltDesktop {

// Does what the options ask for: draw, trace, preview, sheet or info. Writes the output whole or throws
// Refusal, or another std::exception whose text is one line.
void runCommand(const Options& options);

}  // namespace QeltDesktop
