#pragma once

#include <cstdio>
#include <string>
#include <string_view>

namespace QeltDesktop {

// A file that is there whole or not at all: written beside its place under another name and moved there by
// `commit`. What is not a regular file ("-" for standard output, a device, a pipe) is written straight.
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
  void removeTemporary();
  [[noreturn]] void abandon();
  [[noreturn]] void refuse() const;

  std::string mShownPath;
  std::string mPath;
  std::string mTemporaryPath;  // empty when written straight
  std::FILE* mFile = nullptr;
};

}  // namespace QeltDesktop
