#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace QeltDesktop {

// The length in bytes of the UTF-8 character at `at`; 0 where no character begins.
std::size_t utf8BytesAt(std::string_view text, std::size_t at);
bool isUtf8(std::string_view text);

// `bytes`, which begin with a byte order mark, as UTF-8 without it. Half a surrogate pair becomes bytes that
// are not UTF-8.
std::string utf8FromUtf16(std::string_view bytes, bool bigEndian);

}  // namespace QeltDesktop
