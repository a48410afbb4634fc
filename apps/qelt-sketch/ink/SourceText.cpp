#include "ink/SourceText.h"

#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <memory>
#include <utility>

#include "text/Utf8.h"

namespace QeltDesktop {
namespace {

// For the error that just happened.
Refusal unreadable(const std::string& name) {
  return Refusal(name + ": cannot be read: " + std::strerror(errno));
}

}  // namespace

int lineEndsIn(std::string_view text) {
  int ends = 0;
  for (std::size_t at = 0; at < text.size(); ++at) {
    if (text[at] == '\n' || (text[at] == '\r' && text.substr(at + 1, 1) != "\n")) ++ends;
  }
  return ends;
}

SourceText SourceText::fromFile(const std::string& path) {
  const std::unique_ptr<std::FILE, int (*)(std::FILE*)> file(std::fopen(path.c_str(), "rb"), &std::fclose);
  if (!file) throw unreadable(path);
  return fromStream(path, file.get());
}

SourceText SourceText::fromStandardInput() {
  return fromStream("standard input", stdin);
}

SourceText SourceText::fromStream(const std::string& name, std::FILE* stream) {
  std::string bytes;
  // A text that grows piece by piece is held twice at times.
  struct stat status {};
  if (fstat(fileno(stream), &status) == 0 && S_ISREG(status.st_mode))
    bytes.reserve(static_cast<std::size_t>(status.st_size));
  char block[65536];
  while (const std::size_t count = std::fread(block, 1, sizeof block, stream)) bytes.append(block, count);
  if (std::ferror(stream)) throw unreadable(name);
  if (bytes.starts_with("\xFE\xFF")) bytes = utf8FromUtf16(bytes, true);
  if (bytes.starts_with("\xFF\xFE")) bytes = utf8FromUtf16(bytes, false);
  return SourceText(name, std::move(bytes));
}

SourceText::SourceText(std::string name, std::string text) : mName(std::move(name)), mText(std::move(text)) {}

int SourceText::lineAt(std::size_t offset) const {
  const std::string_view text = mText;
  const std::size_t end = std::min(offset, text.size());
  // Between the two bytes of "\r\n" the line has not ended yet.
  const bool splits = end > 0 && end < text.size() && text[end - 1] == '\r' && text[end] == '\n';
  return 1 + lineEndsIn(text.substr(0, end)) - (splits ? 1 : 0);
}

Refusal SourceText::refusal(int line, const std::string& what, const std::string& value) const {
  std::string text = mName + ":" + std::to_string(line) + ": " + what;
  if (!value.empty()) text += ": " + oneLine(value);
  return Refusal(text);
}

Refusal SourceText::refusalAt(std::size_t offset, const std::string& what, const std::string& value) const {
  return refusal(lineAt(offset), what, value);
}

}  // namespace QeltDesktop
