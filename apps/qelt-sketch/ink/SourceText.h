#pragma once

#include <cstddef>
#include <cstdio>
#include <string>
#include <string_view>

#include "text/Refusal.h"

namespace QeltDesktop {

// How often a line ends in the text: with "\n", "\r\n" or "\r".
int lineEndsIn(std::string_view text);

// The text of a file, with its name, for messages that say where something stands.
class SourceText {
 public:
  // Reads the file, or standard input to its end, which is called so; UTF-16 with a byte order mark is
  // converted. Throws Refusal when it cannot be read.
  static SourceText fromFile(const std::string& path);
  static SourceText fromStandardInput();
  SourceText(std::string name, std::string text);

  const std::string& name() const { return mName; }
  const std::string& text() const { return mText; }
  // The line of the byte at `offset`, from 1; an offset beyond the end lies on the last line. Slow, because
  // it counts through the text before: lines are only needed to refuse something.
  int lineAt(std::size_t offset) const;

  // "name:line: what: value", or without the value when it is empty.
  Refusal refusal(int line, const std::string& what, const std::string& value) const;
  Refusal refusalAt(std::size_t offset, const std::string& what, const std::string& value) const;

 private:
  static SourceText fromStream(const std::string& name, std::FILE* stream);

  std::string mName;
  std::string mText;
};

}  // namespace QeltDesktop
