#pragma once

#include <string>
#include <string_view>

#include "FileDescriptor.h"

namespace QeltDesktop {

// The names of unfinished files, and the care that none stays behind. A name is short whatever the finished
// file is called, begins with what tells that file apart in its folder, and ends by chance, so that nobody
// can put a link there beforehand. Whoever writes such a file holds a lock on it.

// Makes and locks a new one in `folder`, for the file called `name`, with these permissions less the
// process's mask; sets `temporaryName`. None, and errno, when that fails.
FileDescriptor makeUnfinished(int folder, std::string_view name, unsigned int permissions,
                              std::string& temporaryName);

// Removes the unfinished files of `name` whose writers are gone.
void removeAbandoned(int folder, std::string_view name);

// From now on a signal that would end the process removes the file first. One file at a time; the folder
// stays open until it is forgotten. Signals that are ignored or handled already are left alone.
void guardUnfinished(int folder, const std::string& temporaryName);
void forgetUnfinished();

}  // namespace QeltDesktop
