#include "text/NumberText.h"

#include <locale.h>
#include <array>
#include <charconv>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <limits>
#include <string>
#include <system_error>

namespace QeltDesktop {
namespace {

locale_t plainLocale() {
  static const locale_t kPlain = newlocale(LC_ALL_MASK, "C", nullptr);
  return kPlain;
}

float fromPlain(const char* text, float, char** stop = nullptr) {
  return strtof_l(text, stop, plainLocale());
}
double fromPlain(const char* text, double, char** stop = nullptr) {
  return strtod_l(text, stop, plainLocale());
}

#ifdef __cpp_lib_to_chars
template <typename Number>
std::optional<Number> parsePlain(std::string_view text) {
  Number value{};
  const char* const end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, value);
  if (stop != end || error == std::errc::invalid_argument) return std::nullopt;
  // from_chars reports too large and too small alike and leaves the value alone; strtof tells them apart.
  if (error == std::errc::result_out_of_range) return fromPlain(std::string(text).c_str(), Number{});
  return value;
}

std::string_view print(float value, std::array<char, 32>& text) {
  const auto [end, error] = std::to_chars(text.data(), text.data() + text.size(), value);
  static_cast<void>(error);  // 32 characters hold any float
  return {text.data(), static_cast<std::size_t>(end - text.data())};
}
#else
// This C++ library has neither for floating point.
template <typename Number>
std::optional<Number> parsePlain(std::string_view text) {
  // What strtof reads beyond from_chars: white space and a plus in front, and hexadecimal digits.
  const std::size_t first = text.find_first_not_of('-');
  if (first > 1 || text[first] == '+' || text.find_first_of("xX \t\n\v\f\r") != std::string_view::npos) {
    return std::nullopt;
  }
  const std::string copy(text);
  char* stop = nullptr;
  const Number value = fromPlain(copy.c_str(), Number{}, &stop);
  return stop == copy.c_str() + copy.size() ? std::optional(value) : std::nullopt;
}

std::string_view print(float value, std::array<char, 32>& text) {
  int length = 0;
  for (int digits = 1; digits <= 9; ++digits) {
    length = std::snprintf(text.data(), text.size(), "%.*g", digits, static_cast<double>(value));
    if (fromPlain(text.data(), value) == value) break;
  }
  return {text.data(), static_cast<std::size_t>(length)};
}
#endif

template <typename Number>
std::optional<Number> parse(std::string_view text) {
  if (!text.empty() && text.front() == '+') {
    text.remove_prefix(1);
    if (text.empty() || text.front() == '-') return std::nullopt;
  }
  return parsePlain<Number>(text);
}

std::optional<unsigned int> parseHexColor(std::string_view text, std::size_t digits) {
  if (text.size() != digits + 1 || text.front() != '#') return std::nullopt;
  text.remove_prefix(1);
  unsigned int value = 0;
  const char* const end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, value, 16);
  if (stop != end || error != std::errc{}) return std::nullopt;
  return value;
}

// `digits` / 10^`places`, as a decimal.
void appendFixed(std::string& out, bool negative, std::uint64_t digits, std::size_t places) {
  char text[24];
  const auto [end, error] = std::to_chars(text, text + sizeof text, digits);
  static_cast<void>(error);  // 24 characters hold any of them
  const std::string_view written(text, static_cast<std::size_t>(end - text));
  if (negative) out += '-';
  if (written.size() > places) {
    out += written.substr(0, written.size() - places);
  } else {
    out += '0';
  }
  if (places == 0) return;
  out += '.';
  if (written.size() < places) out.append(places - written.size(), '0');
  out += written.size() > places ? written.substr(written.size() - places) : written;
}

// Appends the decimal near `value` with the fewest digits after the point for which `isRight` holds, given
// the double nearest to it; false if none has so few digits in all.
template <typename IsRight>
bool appendShort(std::string& out, double value, double mostDigits, const IsRight& isRight) {
  constexpr std::size_t kMostPlaces = 16;
  const double size = std::fabs(value);
  double scale = 1.0;
  for (std::size_t places = 0; places <= kMostPlaces; ++places, scale *= 10.0) {
    const double digits = std::nearbyint(size * scale);
    if (!(digits < mostDigits)) return false;
    // Both are exact, so the quotient is the double nearest to the decimal.
    if (!isRight(std::copysign(digits / scale, value))) continue;
    appendFixed(out, std::signbit(value), static_cast<std::uint64_t>(digits), places);
    return true;
  }
  return false;
}

// For numbers of many digits, and for very large and very small ones.
template <typename Number>
void appendLong(std::string& out, Number value) {
  constexpr int kFewest = 6, kMost = std::numeric_limits<Number>::max_digits10;
  // printf writes the decimal point of the locale.
  const locale_t before = uselocale(plainLocale());
  char text[40];
  for (int digits = kFewest; digits <= kMost; ++digits) {
    std::snprintf(text, sizeof text, "%.*g", digits, static_cast<double>(value));
    if (fromPlain(text, Number{}) == value) break;
  }
  uselocale(before);
  out += text;
}

}  // namespace

void appendDecimal(std::string& out, double value, const std::function<bool(double)>& isRight) {
  if (!appendShort(out, value, 1e15, isRight)) appendLong(out, value);
}

void appendNumber(std::string& out, double value) {
  if (!appendShort(out, value, 1e15, [value](double decimal) { return decimal == value; }))
    appendLong(out, value);
}

void appendNumber(std::string& out, float value) {
  // The decimal is rounded once when it is read. That gives the same float as rounding by way of a double
  // unless the double lies in the middle between two floats.
  const auto isRight = [value](double decimal) {
    constexpr double kInfinity = std::numeric_limits<double>::infinity();
    return static_cast<float>(decimal) == value &&
           static_cast<float>(std::nextafter(decimal, -kInfinity)) == value &&
           static_cast<float>(std::nextafter(decimal, kInfinity)) == value;
  };
  if (!appendShort(out, static_cast<double>(value), 1e9, isRight)) appendLong(out, value);
}

std::optional<float> parseFloat(std::string_view text) {
  return parse<float>(text);
}

std::optional<double> parseDouble(std::string_view text) {
  return parse<double>(text);
}

std::optional<int> parseInt(std::string_view text) {
  int value = 0;
  const char* const end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, value);
  if (stop != end || error != std::errc{}) return std::nullopt;
  return value;
}

void appendJson(std::string& out, float value) {
  if (std::isnan(value)) {
    out += "\"NaN\"";
    return;
  }
  if (std::isinf(value)) {
    out += value > 0.0f ? "\"Infinity\"" : "\"-Infinity\"";
    return;
  }
  std::array<char, 32> text;
  const std::string_view digits = print(value, text);
  out += digits;
  if (digits.find_first_of(".e") == std::string_view::npos) out += ".0";
}

std::optional<unsigned int> parseRgb(std::string_view text) {
  return parseHexColor(text, 6);
}

std::optional<unsigned int> parseArgb(std::string_view text) {
  return parseHexColor(text, 8);
}

std::string formatArgb(unsigned int argb) {
  char text[16];
  std::snprintf(text, sizeof text, "#%08X", argb);
  return text;
}

}  // namespace QeltDesktop
