#pragma once

#include <chrono>
#include <cstdio>
#include <ctime>
#include <optional>
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
  // What a run that was killed left behind of the same file. Whoever writes many files to a folder removes it
  // for all of them at once (`removeAbandoned`), since that reads the folder.
  enum class Abandoned { Remove, Leave };

  // Throws Refusal when the file cannot be written, or when it is `input`, which would be lost.
  explicit OutputFile(const std::string& path, const std::string& input = {},
                      Abandoned abandoned = Abandoned::Remove);
  // Removes the file unless it was committed.
  ~OutputFile();
  OutputFile(const OutputFile&) = delete;
  OutputFile& operator=(const OutputFile&) = delete;

  void write(std::string_view bytes);
  // The time that the file is to say it was changed at; by itself it is the time at which it is finished.
  void setTime(std::chrono::time_point<std::chrono::system_clock, std::chrono::nanoseconds> time);
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
  std::optional<timespec> mTime;
  Abandoned mAbandoned;
};

}  // namespace QeltDesktop
