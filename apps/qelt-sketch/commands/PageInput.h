#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "ink/Ink.h"

namespace QeltDesktop {

// The keyword of the text chunk (iTXt) in which a picture carries its page, and the most bytes of text in it.
constexpr const char* kInkKeyword = "InkML";
constexpr std::size_t kMostInkBytes = std::size_t{128} << 20;

// The processing instruction behind a page in a picture, which holds the options that it was drawn with.
constexpr const char* kInstructionTarget = "qelt-sketch";

struct PageInput {
  Page page;
  // Those of a picture that has them; what they mean is not looked at.
  std::optional<std::string> drawnWith;
};

// The path that stands for standard input.
constexpr const char* kStandardInput = "-";

// Reads a page of InkML, or a PNG picture that carries one; a picture is told by its first bytes. Throws
// Refusal, for what is wrong with the page with its line, within a picture the line of the text that it
// carries.
PageInput readPageInput(const std::string& path);

// Whether a file may be a PNG picture: it begins like one, or is standard input, which can be read only once.
// False where it cannot be read.
bool maybePng(const std::string& path);

}  // namespace QeltDesktop
