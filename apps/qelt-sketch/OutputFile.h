#pragma once

#include <cstdio>
#include <string>
#include <string_view>

#include "FileDescriptor.h"

namespace QeltDesktop {

struct OutputPlace;

// A file that is there whole or not at all: written beside its place under another name and moved there by
// `commit`. Symbolic links stay and are followed; the permissions of an older file stay, and one that nobody
// may write, or that has a second name (a hard link), is refused. What is not a regular file ("-" for
// standard output, /dev/stdout and other descriptors, a device, a pipe) is written straight.
//
// While the file is unfinished, a signal that ends the process removes it, unless the process was started
// with that signal ignored. What SIGKILL leaves behind the next run onto the same file removes.
class OutputFile {
 public:
  // Throws Refusal when the file cannot be written, or is `input`: what is read is not lost.
  explicit OutputFile(const std::string& path, const std::string& input = {});
  // Removes what was not committed.
  ~OutputFile();
  OutputFile(const OutputFile&) = delete;
  OutputFile& operator=(const OutputFile&) = delete;

  void write(std::string_view bytes);
  void commit();

 private:
  void openStraight(const OutputPlace& place);
  void openBeside(OutputPlace place);
  void removeTemporary();
  void flush();
  [[noreturn]] void refuse() const;

  std::string mShownPath;
  FileDescriptor mFolder;
  std::string mName;           // in mFolder
  std::string mTemporaryName;  // there too; empty when written straight
  std::FILE* mFile = nullptr;
};

}  // namespace QeltDesktop
