#include "Refusal.h"

#include <algorithm>
#include <cstddef>

namespace QeltDesktop {

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
