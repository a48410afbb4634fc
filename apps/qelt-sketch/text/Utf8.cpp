#include "text/Utf8.h"

#include <cstdint>

namespace QeltDesktop {
namespace {

unsigned char byteAt(std::string_view text, std::size_t at) {
  return at < text.size() ? static_cast<unsigned char>(text[at]) : 0;
}

void appendUtf8(std::string& text, std::uint32_t code) {
  const auto follow = [&](int shift) { text += static_cast<char>(0x80 | (code >> shift & 0x3F)); };
  if (code < 0x80) {
    text += static_cast<char>(code);
  } else if (code < 0x800) {
    text += static_cast<char>(0xC0 | code >> 6);
    follow(0);
  } else if (code < 0x10000) {
    text += static_cast<char>(0xE0 | code >> 12);
    follow(6);
    follow(0);
  } else {
    text += static_cast<char>(0xF0 | code >> 18);
    follow(12);
    follow(6);
    follow(0);
  }
}

}  // namespace

std::size_t utf8BytesAt(std::string_view text, std::size_t at) {
  if (at >= text.size()) return 0;
  const unsigned char first = byteAt(text, at);
  if (first < 0x80) return 1;
  if (first < 0xC2 || first > 0xF4) return 0;
  const std::size_t count = first >= 0xF0 ? 4 : first >= 0xE0 ? 3 : 2;
  for (std::size_t i = 1; i < count; ++i) {
    if ((byteAt(text, at + i) & 0xC0) != 0x80) return 0;
  }
  const unsigned char second = byteAt(text, at + 1);
  // Overlong encodings, surrogates, and codes beyond the last character.
  const bool wrong = (first == 0xE0 && second < 0xA0) || (first == 0xED && second > 0x9F) ||
                     (first == 0xF0 && second < 0x90) || (first == 0xF4 && second > 0x8F);
  return wrong ? 0 : count;
}

bool isUtf8(std::string_view text) {
  for (std::size_t at = 0; at < text.size();) {
    const std::size_t count = utf8BytesAt(text, at);
    if (count == 0) return false;
    at += count;
  }
  return true;
}

std::string utf8FromUtf16(std::string_view bytes, bool bigEndian) {
  const auto unit = [&](std::size_t at) -> std::uint32_t {
    const std::uint32_t first = byteAt(bytes, at), second = byteAt(bytes, at + 1);
    return bigEndian ? first << 8 | second : second << 8 | first;
  };
  std::string text;
  text.reserve(bytes.size() / 2);
  for (std::size_t at = 2; at + 1 < bytes.size(); at += 2) {
    std::uint32_t code = unit(at);
    if (code >= 0xD800 && code < 0xDC00 && at + 3 < bytes.size()) {
      const std::uint32_t low = unit(at + 2);
      if (low >= 0xDC00 && low < 0xE000) {
        code = 0x10000 + ((code - 0xD800) << 10) + (low - 0xDC00);
        at += 2;
      }
    }
    appendUtf8(text, code);
  }
  return text;
}

}  // namespace QeltDesktop
