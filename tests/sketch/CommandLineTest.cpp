#include "commands/CommandLine.h"

#include <gtest/gtest.h>

#include <sstream>
#include <string>
#include <variant>
#include <vector>

namespace QeltDesktop {
namespace {

std::variant<Options, UsageEnd> parse(const std::string& line) {
  std::vector<std::string> words{"qelt-sketch"};
  std::istringstream stream(line);
  for (std::string word; stream >> word;) words.push_back(word);
  std::vector<const char*> arguments;
  for (const std::string& word : words) arguments.push_back(word.c_str());
  return parseOptions(static_cast<int>(arguments.size()), arguments.data());
}

TEST(CommandLine, WrongUsageEndsWithStatusTwoAndHelpWithNone) {
  const auto endOf = [](const std::string& line) {
    const auto result = parse(line);
    const auto* const end = std::get_if<UsageEnd>(&result);
    return end == nullptr ? UsageEnd{"", -1} : *end;
  };
  std::istringstream lines(
      ";paint -o a.png;draw;draw a.inkml b.inkml -o a.png;info -o a.txt;trace -o - --drawable line;"
      "trace -o - --drawable prediction;trace -o - --drawable preview --mode stroke");
  std::istringstream drawOptions(
      "--sise 3;--size;--size big;--size 3 --size 4;--color red;--color #FFFFFF;--mode slow;--batch 0;"
      "--batch 1.5;--tool quill;--repeat 0;--zoom 0;--zoom inf;--rotate nan;--page 800;--page 0x600;"
      "--background grey;--outline 3;--predict -1;--predict 2000000000;--opacity 1.5;--points 0;"
      "--drawable stroke;--rendering-version 99999999999");
  std::vector<std::string> wrong;
  for (std::string line; std::getline(lines, line, ';');) wrong.push_back(line);
  for (std::string option; std::getline(drawOptions, option, ';');)
    wrong.push_back("draw -o a.png " + option);
  EXPECT_EQ(wrong.size(), 32u);
  for (const std::string& line : wrong) {
    EXPECT_EQ(endOf(line).status, 2) << line;
    EXPECT_NE(endOf(line).text, "") << line;
  }
  for (const char* const line : {"--help", "draw --help"}) EXPECT_EQ(endOf(line).status, 0) << line;
}

}  // namespace
}  // namespace QeltDesktop
