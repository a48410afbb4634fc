#include "SourceText.h"

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <memory>
#include <utility>

#include <pugixml.hpp>

namespace QeltDesktop {
namespace {

// Byte offsets and lines need the text in the encoding the XML parser works in.
std::string utf8FromUtf16(const std::string& bytes, bool bigEndian) {
  std::wstring wide;
  wide.reserve(bytes.size() / 2);
  const auto unit = [&](std::size_t at) -> std::uint32_t {
    const auto first = static_cast<unsigned char>(bytes[at]);
    const auto second = static_cast<unsigned char>(bytes[at + 1]);
    return bigEndian ? first << 8 | second : second << 8 | first;
  };
  for (std::size_t at = 2; at + 1 < bytes.size(); at += 2) {
    std::uint32_t code = unit(at);
    if (code >= 0xD800 && code < 0xDC00 && at + 3 < bytes.size()) {
      const std::uint32_t low = unit(at + 2);
      if (low >= 0xDC00 && low < 0xE000) {
        code = 0x10000 + ((code - 0xD800) << 10) + (low - 0xDC00);
        at += 2;
      }
    }
    wide.push_back(static_cast<wchar_t>(code));
  }
  return pugi::as_utf8(wide);
}

}  // namespace

SourceText SourceText::fromFile(const std::string& path) {
  const auto unreadable = [&] { return Refusal(path + ": cannot be read: " + std::strerror(errno)); };
  const std::unique_ptr<std::FILE, int (*)(std::FILE*)> file(std::fopen(path.c_str(), "rb"), &std::fclose);
  if (!file) throw unreadable();
  std::string bytes;
  char block[65536];
  while (const std::size_t count = std::fread(block, 1, sizeof block, file.get())) bytes.append(block, count);
  if (std::ferror(file.get())) throw unreadable();
  if (bytes.starts_with("\xFE\xFF")) bytes = utf8FromUtf16(bytes, true);
  if (bytes.starts_with("\xFF\xFE")) bytes = utf8FromUtf16(bytes, false);
  return SourceText(path, std::move(bytes));
}

SourceText::SourceText(std::string name, std::string text) : mName(std::move(name)), mText(std::move(text)) {
  mLineStarts.push_back(0);
  for (std::size_t at = 0; at < mText.size(); ++at) {
    const bool endsLine = mText[at] == '\n' || (mText[at] == '\r' && mText.compare(at + 1, 1, "\n") != 0);
    if (endsLine) mLineStarts.push_back(at + 1);
  }
}

int SourceText::lineAt(std::size_t offset) const {
  const auto next = std::upper_bound(mLineStarts.begin(), mLineStarts.end(), std::min(offset, mText.size()));
  return static_cast<int>(next - mLineStarts.begin());
}

Refusal SourceText::refusal(int line, const std::string& what, const std::string& value) const {
  std::string text = mName + ":" + std::to_string(line) + ": " + what;
  if (!value.empty()) text += ": " + oneLine(value);
  return Refusal(text);
}

}  // namespace QeltDesktop
