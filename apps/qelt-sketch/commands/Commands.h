#pragma once

#include "play/Options.h"

namespace QeltDesktop {

// Does what the options ask for, and answers the exit status: 0, or 1 where pictures that were compared
// differ. Writes the output whole or throws Refusal, or another std::exception whose text is one line.
int runCommand(const Options& options);

}  // namespace QeltDesktop
