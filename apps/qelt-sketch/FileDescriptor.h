#pragma once

#include <unistd.h>

#include <utility>

namespace QeltDesktop {

// An open file, closed with its owner. Below 0: none.
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

}  // namespace QeltDesktop
