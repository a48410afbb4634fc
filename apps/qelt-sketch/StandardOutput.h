#pragma once

namespace QeltDesktop {

// Hands over what was printed to standard output. Throws Refusal when that, or any print before, failed.
void finishStandardOutput();

}  // namespace QeltDesktop
