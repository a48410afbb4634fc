#pragma once

#include <sys/stat.h>

#include <optional>
#include <string>

#include "FileDescriptor.h"

namespace QeltDesktop {

// Where a path that is to be written leads, its symbolic links followed one by one.
struct OutputPlace {
  FileDescriptor folder;               // only good for the calls that take a folder (openat and its like)
  std::string name;                    // in that folder; no link
  std::optional<struct stat> present;  // what stands there now
  // The number that /dev/stdout, /dev/fd/N or /proc/self/fd/N name; then nothing else is set.
  std::optional<int> descriptor;
};

// Throws Refusal, `path` in front, where the path leads nowhere. A link that leads to no file is followed
// like any other: the file comes to be where it points. A link that somebody else planted in a folder open to
// everybody is refused, as the kernel does it where it is set up to.
OutputPlace outputPlaceOf(const std::string& path);

}  // namespace QeltDesktop
