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

TEST(Options, ReadsEveryDrawingOption) {
  const Options options = parsed(
      "trace in.inkml -o - --rendering-version -3 --size 2.5 --color #80102030 --no-curve --mode event "
      "--batch 7 "
      "--tool finger --source 99 --repeat 2 --zoom 0.5 --rotate -30 --page 800x600.5 --background #A0B0C0 "
      "--outline 3,#FF00FF00 --predict 4 --opacity 0.25 --points 12 --drawable outline");
  EXPECT_EQ(options.command, Command::Trace);
  EXPECT_EQ(options.input, "in.inkml");
  EXPECT_EQ(options.output, "-");
  EXPECT_EQ(options.renderingVersion, -3);
  EXPECT_EQ(options.size, 2.5f);
  EXPECT_EQ(options.argb, 0x80102030u);
  EXPECT_FALSE(options.curve);
  EXPECT_EQ(options.mode, Mode::Event);
  EXPECT_EQ(options.batch, 7);
  EXPECT_EQ(options.tool, 1);
  EXPECT_EQ(options.source, 99);
  EXPECT_EQ(options.repeat, 2);
  EXPECT_EQ(options.zoom, 0.5f);
  EXPECT_EQ(options.rotate, -30.0f);
  ASSERT_TRUE(options.page);
  EXPECT_EQ(options.page->width, 800.0f);
  EXPECT_EQ(options.page->height, 600.5f);
  EXPECT_EQ(options.background.rgb, 0xA0B0C0u);
  ASSERT_TRUE(options.outline);
  EXPECT_EQ(options.outline->size, 3.0f);
  EXPECT_EQ(options.outline->argb, 0xFF00FF00u);
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

class WrongUsage : public testing::TestWithParam<const char*> {};

TEST_P(WrongUsage, EndsWithStatusTwo) {
  const auto result = parse(GetParam());
  const auto* const end = std::get_if<UsageEnd>(&result);
  ASSERT_NE(end, nullptr);
  EXPECT_EQ(end->status, 2);
  EXPECT_FALSE(end->text.empty());
}

INSTANTIATE_TEST_SUITE_P(
    Lines, WrongUsage,
    testing::Values("", "paint -o a.png", "draw", "draw a.inkml b.inkml -o a.png", "draw -o a.png --sise 3",
                    "draw -o a.png --size", "draw -o a.png --size big", "draw -o a.png --size 3 --size 4",
                    "draw -o a.png --color red", "draw -o a.png --color #FFFFFF", "draw -o a.png --mode slow",
                    "draw -o a.png --batch 0", "draw -o a.png --batch 1.5", "draw -o a.png --tool quill",
                    "draw -o a.png --repeat 0", "draw -o a.png --zoom 0", "draw -o a.png --zoom inf",
                    "draw -o a.png --rotate nan", "draw -o a.png --page 800", "draw -o a.png --page 0x600",
                    "draw -o a.png --background grey", "draw -o a.png --outline 3",
                    "draw -o a.png --predict -1", "draw -o a.png --predict 2000000000",
                    "draw -o a.png --opacity 1.5", "draw -o a.png --points 0",
                    "draw -o a.png --drawable stroke", "draw -o a.png --rendering-version 99999999999",
                    "trace -o - --drawable line", "trace -o - --drawable prediction",
                    "trace -o - --drawable preview --mode stroke", "info -o a.txt"));

TEST(Options, HelpIsNoMistake) {
  for (const char* line : {"--help", "draw --help"}) {
    const auto result = parse(line);
    const auto* const end = std::get_if<UsageEnd>(&result);
    ASSERT_NE(end, nullptr);
    EXPECT_EQ(end->status, 0);
  }
}

}  // namespace
}  // namespace QeltDesktop
