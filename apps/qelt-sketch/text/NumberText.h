#pragma once

#include <functional>
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

// Appends a finite number as a decimal that reads back as the same number, "-0" too: a short one where there
// is one, with at most 9 significant digits for a float and 17 for a double.
void appendNumber(std::string& out, float value);
void appendNumber(std::string& out, double value);
// The same where something else is to come of the decimal than `value`: it may be any for which `isRight`
// holds, given the double nearest to the decimal. If there is none, what is appended reads back as `value`.
void appendDecimal(std::string& out, double value, const std::function<bool(double)>& isRight);

// A float as JSON: the shortest decimal that reads back as the same float, always with a point or an
// exponent so that -0.0 survives; "NaN", "Infinity" and "-Infinity" as strings.
void appendJson(std::string& out, float value);

// Colours as "#RRGGBB" and "#AARRGGBB", with six and eight hexadecimal digits.
std::optional<unsigned int> parseRgb(std::string_view text);
std::optional<unsigned int> parseArgb(std::string_view text);
std::string formatArgb(unsigned int argb);

}  // namespace QeltDesktop
