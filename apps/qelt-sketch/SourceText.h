#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "Refusal.h"

namespace QeltDesktop {

// A text file as UTF-8, its name, and which line each byte stands on.
class SourceText {
 public:
  // Reads the file; UTF-16 with a byte order mark is converted. Throws Refusal when it cannot be read.
  static SourceText fromFile(const std::string& path);
  SourceText(std::string name, std::string text);

  const std::string& text() const { return mText; }
  // Lines count from 1; "\n", "\r\n" and "\r" end one. An offset beyond the end lies on the last line.
  int lineAt(std::size_t offset) const;

  // "name:line: what: value", or without the value when it is empty.
  Refusal refusal(int line, const std::string& what, const std::string& value) const;

 private:
  std::string mName;
  std::string mText;
  std::vector<std::size_t> mLineStarts;
};

}  // namespace QeltDesktop
