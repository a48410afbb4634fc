#include "text/Refusal.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdio>

#include "text/Utf8.h"

namespace QeltDesktop {
namespace {

// The bytes of the character at `at`; 0 for a control character and for a stray byte.
std::size_t shownBytes(const std::string& text, std::size_t at) {
  const auto first = static_cast<unsigned char>(text[at]);
  const std::size_t count = utf8BytesAt(text, at);
  // U+0080 to U+009F are control characters too.
  const bool control = first < 0x20 || first == 0x7F ||
                       (first == 0xC2 && count == 2 && static_cast<unsigned char>(text[at + 1]) < 0xA0);
  return control ? 0 : count;
}

}  // namespace

std::string printable(const std::string& text) {
  std::string shown;
  for (std::size_t at = 0; at < text.size();) {
    if (const std::size_t count = shownBytes(text, at)) {
      shown.append(text, at, count);
      at += count;
      continue;
    }
    std::array<char, 8> code{};
    std::snprintf(code.data(), code.size(), "\\x%02X",
                  static_cast<unsigned int>(static_cast<unsigned char>(text[at])));
    shown += text[at] == '\n' ? "\\n" : code.data();
    ++at;
  }
  return shown;
}

std::string oneLine(const std::string& text) {
  constexpr std::size_t kLongest = 60;
  std::string line = text;
  if (line.size() > kLongest) {
    std::size_t end = kLongest;
    // No cut inside a UTF-8 character.
    while (end > 0 && (static_cast<unsigned char>(line[end]) & 0xC0) == 0x80) --end;
    line.resize(end);
    line += "...";
  }
  std::replace_if(
      line.begin(), line.end(), [](char c) { return static_cast<unsigned char>(c) < 0x20 || c == 0x7F; },
      ' ');
  return line;
}

}  // namespace QeltDesktop
