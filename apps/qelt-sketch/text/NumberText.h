#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace QeltDesktop {

// Numbers as text, in the same way in every locale.

// The float nearest to a decimal ("-12.5e3"; one leading '+' is allowed), rounded once. A number too small
// becomes zero, one too large infinite. "nan", "inf" and "infinity" are read too, in capitals or not. None
// for any other text.
std::optional<float> parseFloat(std::string_view text);
std::optional<double> parseDouble(std::string_view text);
std::optional<int> parseInt(std::string_view text);

// A float as JSON: the shortest decimal that reads back as the same float, always with a point or an
// exponent so that -0.0 survives; "NaN", "Infinity" and "-Infinity" as strings.
void appendJson(std::string& out, float value);

// Colours as "#RRGGBB" and "#AARRGGBB", with six and eight hexadecimal digits.
std::optional<unsigned int> parseRgb(std::string_view text);
std::optional<unsigned int> parseArgb(std::string_view text);
std::string formatArgb(unsigned int argb);

}  // namespace QeltDesktop
