#include "Options.h"

#include <gtest/gtest.h>

#include <cmath>
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

Options parsed(const std::string& line) {
  const auto result = parse(line);
  if (const auto* const end = std::get_if<UsageEnd>(&result)) {
    ADD_FAILURE() << line << "\n" << end->text;
    return {};
  }
  return std::get<Options>(result);
}

// What the program's own tests see at work is not looked at again.
TEST(Options, ReadsEveryDrawingOption) {
  const Options options = parsed(
      "trace in.inkml -o - --rendering-version -3 --size 2.5 --color #80102030 --batch 7 --tool finger "
      "--source 99 --repeat 2 --zoom 0.5 --rotate -30 --page 800x600.5 --outline 3,#FF00FF00 --predict 4 "
      "--opacity 0.25 --points 12 --drawable outline");
  EXPECT_EQ(options.command, Command::Trace);
  EXPECT_EQ(options.input, "in.inkml");
  EXPECT_EQ(options.output, "-");
  EXPECT_EQ(options.renderingVersion, -3);
  EXPECT_EQ(options.size, 2.5f);
  EXPECT_EQ(options.argb, 0x80102030u);
  EXPECT_EQ(options.batch, 7);
  EXPECT_EQ(options.tool, 1);
  EXPECT_EQ(options.source, 99);
  EXPECT_EQ(options.repeat, 2);
  EXPECT_EQ(options.zoom, 0.5f);
  EXPECT_EQ(options.rotate, -30.0f);
  ASSERT_TRUE(options.page && options.outline);
  EXPECT_EQ(options.page->height, 600.5f);
  EXPECT_EQ(options.outline->size, 3.0f);
  EXPECT_EQ(options.predict, 4);
  EXPECT_EQ(options.opacity, 0.25f);
  EXPECT_EQ(options.points, 12);
  EXPECT_EQ(options.drawable, DrawableKind::Outline);
}

TEST(Options, HasTheDefaultsThatTheHelpTells) {
  const Options options = parsed("draw -o a.png");
  EXPECT_EQ(options.command, Command::Draw);
  EXPECT_FALSE(options.input);
  EXPECT_EQ(options.renderingVersion, 8);
  EXPECT_FALSE(options.size);
  EXPECT_FALSE(options.argb);
  EXPECT_TRUE(options.curve);
  EXPECT_EQ(options.mode, Mode::Live);
  EXPECT_EQ(options.batch, 4);
  EXPECT_EQ(options.background.rgb, 0xFFFFFFu);
  EXPECT_FALSE(options.background.transparent);
  EXPECT_EQ(options.opacity, 0.5f);
  EXPECT_TRUE(parsed("draw -o a.png --background transparent").background.transparent);
}

TEST(Options, TakesAnyFloatAsAPenSize) {
  EXPECT_EQ(parsed("draw -o a.png --size -3").size, -3.0f);
  EXPECT_TRUE(std::isnan(parsed("draw -o a.png --size nan").size.value_or(0.0f)));
  EXPECT_EQ(parsed("draw -o a.png --size -inf").size, -INFINITY);
  EXPECT_EQ(parsed("preview -o a.png --size 1e99").size, INFINITY);
}

TEST(Options, WrongUsageEndsWithStatusTwoAndHelpWithNone) {
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
