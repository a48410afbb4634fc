#include "base/String.h"

#include <charconv>
#include <new>
#include <string_view>

namespace Qelt {

namespace {

bool append(std::string& text, std::string_view more) {
  try {
    text.append(more);
    return true;
  } catch (const std::bad_alloc&) {
    return false;
  }
}

}  // namespace

String::String() = default;

String::String(const char* text) {
  Append(text);
}

String::~String() = default;

bool String::Append(int number) {
  char digits[16];
  const auto end = std::to_chars(digits, digits + sizeof digits, number);
  return append(mText, std::string_view(digits, static_cast<std::size_t>(end.ptr - digits)));
}

bool String::Append(char character) {
  return append(mText, std::string_view(&character, 1));
}

bool String::Append(const char* text) {
  return text == nullptr || append(mText, text);
}

const char* String::GetText() const {
  return mText.c_str();
}

}  // namespace Qelt
