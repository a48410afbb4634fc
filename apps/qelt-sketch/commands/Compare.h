#pragma once

#include "play/Options.h"

namespace QeltDesktop {

// Compares two pictures, or the pictures of the same names in two folders, and tells on standard output which
// differ and by how much. Answers the exit status: 0 when none differs beyond the tolerance. Throws Refusal
// where nothing can be compared; in a folder, a picture that cannot be read is told on standard error, counts
// as different, and the others are compared all the same.
int compare(const CompareOptions& options);

}  // namespace QeltDesktop
