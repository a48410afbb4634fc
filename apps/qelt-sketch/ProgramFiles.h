#pragma once

#include <string>

#include "Options.h"

namespace QeltDesktop {

// Files that come with the program. They are looked for beside it and where its build tree has them, so that
// the tree may be moved.

// The plug-in to load: the one asked for, in this folder if it stands here, else the one built with the
// program.
std::string pluginPath(const Options& options);

// The page to read: the one asked for, else the sample page.
std::string inputPath(const Options& options);

}  // namespace QeltDesktop
