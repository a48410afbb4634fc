#pragma once

#include <sys/stat.h>
#include <unistd.h>

#include <optional>
#include <string>
#include <utility>

namespace QeltDesktop {

// Closes the file with its owner. A number below 0 means no file.
class FileDescriptor {
 public:
  FileDescriptor() = default;
  explicit FileDescriptor(int number) : mNumber(number) {}
  FileDescriptor(FileDescriptor&& other) noexcept : mNumber(other.release()) {}
  FileDescriptor& operator=(FileDescriptor&& other) noexcept {
    std::swap(mNumber, other.mNumber);
    return *this;
  }
  ~FileDescriptor() {
    if (mNumber >= 0) close(mNumber);
  }

  explicit operator bool() const { return mNumber >= 0; }
  int number() const { return mNumber; }
  int release() { return std::exchange(mNumber, -1); }

 private:
  int mNumber = -1;
};

// Where the path of a file to be written leads, once its symbolic links have been followed one by one.
struct OutputPlace {
  FileDescriptor folder;               // usable only with openat and its like
  std::string name;                    // in that folder; not a symbolic link
  std::optional<struct stat> present;  // the file there now, if any
  // The descriptor that /dev/stdout, /dev/fd/N or /proc/self/fd/N stands for; then nothing else counts.
  std::optional<int> descriptor;
};

// Throws Refusal, with `path` in front, where the path leads nowhere. A link to a file that does not exist
// yet is followed too, and the file is made there. A link that another user put into a folder open to
// everybody is refused, as the kernel does where it is configured to.
OutputPlace outputPlaceOf(const std::string& path);

}  // namespace QeltDesktop
