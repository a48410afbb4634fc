#pragma once

#include <cstdio>
#include <string>
#include <string_view>

#include "output/OutputPlace.h"

namespace QeltDesktop {

// A file that appears complete or not at all: it is written under another name in the same folder, and
// `commit` renames it. Symbolic links stay and are followed. An older file's permissions stay; one that
// nobody may write, or that has a second name (a hard link), is refused. Anything but a regular file ("-" for
// standard output, /dev/stdout and other descriptors, a device, a pipe) is written directly.
//
// While the file is unfinished, a signal that ends the process removes it, unless the process was started
// with that signal ignored. A file that SIGKILL leaves behind is removed by the next run onto the same file.
class OutputFile {
 public:
  // Throws Refusal when the file cannot be written, or when it is `input`, which would be lost.
  explicit OutputFile(const std::string& path, const std::string& input = {});
  // Removes the file unless it was committed.
  ~OutputFile();
  OutputFile(const OutputFile&) = delete;
  OutputFile& operator=(const OutputFile&) = delete;

  void write(std::string_view bytes);
  void commit();

 private:
  void openDirectly(const OutputPlace& place);
  void openBeside(OutputPlace place);
  void removeTemporary();
  void flush();
  [[noreturn]] void refuse() const;

  std::string mShownPath;
  FileDescriptor mFolder;
  std::string mName;           // in mFolder
  std::string mTemporaryName;  // there too; empty when written directly
  std::FILE* mFile = nullptr;
};

}  // namespace QeltDesktop
