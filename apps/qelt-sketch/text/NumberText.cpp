#include "text/NumberText.h"

#include <locale.h>
#include <charconv>
#include <cmath>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <system_error>

namespace QeltDesktop {
namespace {

locale_t plainLocale() {
  static const locale_t kPlain = newlocale(LC_ALL_MASK, "C", nullptr);
  return kPlain;
}

float fromPlain(const char* text, float) {
  return strtof_l(text, nullptr, plainLocale());
}
double fromPlain(const char* text, double) {
  return strtod_l(text, nullptr, plainLocale());
}

template <typename Number>
std::optional<Number> parse(std::string_view text) {
  if (!text.empty() && text.front() == '+') {
    text.remove_prefix(1);
    if (text.empty() || text.front() == '-') return std::nullopt;
  }
  Number value{};
  const char* const end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, value);
  if (stop != end || error == std::errc::invalid_argument) return std::nullopt;
  // from_chars reports too large and too small alike and leaves the value alone; strtof tells them apart.
  if (error == std::errc::result_out_of_range) return fromPlain(std::string(text).c_str(), Number{});
  return value;
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

}  // namespace

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
  char text[32];
  const auto [end, error] = std::to_chars(text, text + sizeof text, value);
  static_cast<void>(error);  // 32 characters hold any float
  const std::string_view digits(text, static_cast<std::size_t>(end - text));
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
