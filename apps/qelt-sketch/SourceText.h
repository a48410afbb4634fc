#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "Refusal.h"

namespace QeltDesktop {

// Line ends: "\n", "\r\n" and "\r".
int lineEndsIn(std::string_view text);

// A text file, its name, and which line each byte stands on.
class SourceText {
 public:
  // Reads the file; UTF-16 with a byte order mark is converted. Throws Refusal when it cannot be read.
  static SourceText fromFile(const std::string& path);
  SourceText(std::string name, std::string text);

  const std::string& text() const { return mText; }
  // Lines count from 1. An offset beyond the end lies on the last line. Counts through the whole text before:
  // lines are only asked for where a text is refused.
  int lineAt(std::size_t offset) const;

  // "name:line: what: value", or without the value when it is empty.
  Refusal refusal(int line, const std::string& what, const std::string& value) const;
  Refusal refusalAt(std::size_t offset, const std::string& what, const std::string& value) const;

 private:
  std::string mName;
  std::string mText;
};

}  // namespace QeltDesktop
