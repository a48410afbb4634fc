#pragma once

#include <string>
#include <string_view>

#include "output/OutputPlace.h"

namespace QeltDesktop {

// Unfinished files, and how they are removed. Their names are short whatever the finished file is called;
// they begin with a hash of its name and end at random, so that nobody can put a link there beforehand.
// Whoever writes an unfinished file holds a lock on it.

// Makes and locks an unfinished file in `folder` for the file called `name`, with these permissions less the
// process's mask, and sets `temporaryName`. Returns no file, and sets errno, when that fails.
FileDescriptor makeUnfinished(int folder, std::string_view name, unsigned int permissions,
                              std::string& temporaryName);

// Removes the unfinished files of `name` whose writers are gone.
void removeAbandoned(int folder, std::string_view name);
// The same for every file in the folder.
void removeAbandoned(const std::string& folder);

// From now on a signal that would end the process removes the file first. One file at a time; its folder
// stays open until `forgetUnfinished`. Signals that are ignored or handled already are left alone.
void guardUnfinished(int folder, const std::string& temporaryName);
void forgetUnfinished();

}  // namespace QeltDesktop
