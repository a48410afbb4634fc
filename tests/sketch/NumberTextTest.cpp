#include "text/NumberText.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <bit>
#include <clocale>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <limits>
#include <nlohmann/json.hpp>
#include <random>
#include <string>
#include <utility>

namespace QeltDesktop {
namespace {

std::string json(float value, std::string text = {}) {
  appendJson(text, value);
  return text;
}

TEST(NumberText, JsonIsShortAndReadsBackAsTheSameFloat) {
  const std::pair<float, const char*> cases[] = {{12.0f, "12.0"},
                                                 {0.1f, "0.1"},
                                                 {-0.0f, "-0.0"},
                                                 {NAN, "\"NaN\""},
                                                 {INFINITY, "\"Infinity\""},
                                                 {-INFINITY, "\"-Infinity\""}};
  for (const auto& [value, text] : cases) EXPECT_EQ(json(value), text);
  std::minstd_rand random(7);
  for (int i = 0; i < 20000; ++i) {
    const auto value = std::bit_cast<float>(static_cast<std::uint32_t>(random() * 2654435761u));
    if (!std::isfinite(value)) continue;
    // Reading as a double and narrowing must be enough.
    const auto read = static_cast<float>(nlohmann::json::parse(json(value)).get<double>());
    ASSERT_EQ(std::bit_cast<std::uint32_t>(read), std::bit_cast<std::uint32_t>(value)) << json(value);
  }
}

std::string shortest(auto value, std::string text = {}) {
  appendNumber(text, value);
  return text;
}

TEST(NumberText, WritesShortDecimalsInEveryLocale) {
  const auto expectShort = [] {
    const std::pair<float, const char*> floats[] = {{0.0f, "0"},         {-0.0f, "-0"},
                                                    {12.0f, "12"},       {-0.1f, "-0.1"},
                                                    {0.0125f, "0.0125"}, {16777216.0f, "16777216"},
                                                    {1e-30f, "1e-30"},   {-3.4028235e38f, "-3.4028235e+38"}};
    for (const auto& [value, text] : floats) EXPECT_EQ(shortest(value), text);
    const std::pair<double, const char*> doubles[] = {{0.1, "0.1"},
                                                      {1000.0 / 240.0, "4.166666666666667"},
                                                      {1e300, "1e+300"},
                                                      {1.0 / 3.0, "0.3333333333333333"}};
    for (const auto& [value, text] : doubles) EXPECT_EQ(shortest(value), text);
  };
  expectShort();
  // The C library's locales are files. Few machines have one with a comma; most can make one.
  const std::string folder = testing::TempDir() + "qelt-number-locale-" + std::to_string(getpid());
  const std::string make =
      "mkdir -p '" + folder + "' && localedef -i de_DE -f ISO-8859-1 '" + folder + "/de_DE' 2> /dev/null";
  if (std::system(make.c_str()) == 0) setenv("LOCPATH", folder.c_str(), 1);
  if (std::setlocale(LC_ALL, "de_DE") != nullptr) {
    char comma[8];
    std::snprintf(comma, sizeof comma, "%.1f", 0.5);
    EXPECT_STREQ(comma, "0,5");
    expectShort();
  }
  std::setlocale(LC_ALL, "C");
  unsetenv("LOCPATH");
  std::filesystem::remove_all(folder);
}

TEST(NumberText, FloatsBeyondTheRangeBecomeInfiniteOrZero) {
  EXPECT_EQ(parseFloat("1e99"), std::numeric_limits<float>::infinity());
  EXPECT_EQ(parseFloat("-1e99"), -std::numeric_limits<float>::infinity());
  EXPECT_EQ(parseFloat("1e-99"), 0.0f);
  EXPECT_EQ(parseFloat("1e-40"), 1e-40f);
  EXPECT_TRUE(std::isnan(parseFloat("nan").value_or(0.0f)));
  for (const char* text : {"", "+", "+-1", "1 ", " 1", "1,5", "0x10", "one"})
    EXPECT_FALSE(parseFloat(text)) << text;
}

TEST(NumberText, ColoursHaveAllTheirDigits) {
  EXPECT_EQ(parseArgb("#80fF0001"), 0x80FF0001u);
  EXPECT_EQ(parseRgb("#FF0001"), 0xFF0001u);
  for (const char* text : {"", "#", "FF000000", "#FF00000", "#FF00000G", "#-F000000", "#FF0000000"})
    EXPECT_FALSE(parseArgb(text)) << text;
  EXPECT_EQ(formatArgb(0x0000ABCDu), "#0000ABCD");
}

}  // namespace
}  // namespace QeltDesktop
