#include "Refusal.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdio>

namespace QeltDesktop {
namespace {

unsigned char byteAt(const std::string& text, std::size_t at) {
  return at < text.size() ? static_cast<unsigned char>(text[at]) : 0;
}

// The bytes of the character that begins at `at`; 0 for a control character and for a stray byte.
std::size_t shownBytes(const std::string& text, std::size_t at) {
  const unsigned char first = byteAt(text, at);
  if (first < 0x80) return first >= 0x20 && first != 0x7F ? 1 : 0;
  const std::size_t count = first >= 0xF0 ? 4 : first >= 0xE0 ? 3 : 2;
  if (first < 0xC2 || first > 0xF4) return 0;
  for (std::size_t i = 1; i < count; ++i) {
    if ((byteAt(text, at + i) & 0xC0) != 0x80) return 0;
  }
  // U+0080 to U+009F are control characters too.
  return first == 0xC2 && byteAt(text, at + 1) < 0xA0 ? 0 : count;
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
    std::snprintf(code.data(), code.size(), "\\x%02X", static_cast<unsigned int>(byteAt(text, at)));
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
