#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace QeltDesktop {

// How many bytes the UTF-8 character at `at` has; 0 where none begins.
std::size_t utf8BytesAt(std::string_view text, std::size_t at);
bool isUtf8(std::string_view text);

// `bytes` without its byte order mark. Half a surrogate pair becomes what is no UTF-8.
std::string utf8FromUtf16(std::string_view bytes, bool bigEndian);

}  // namespace QeltDesktop
