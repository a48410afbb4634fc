#include "InkmlReader.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstddef>
#include <cstdio>
#include <iterator>
#include <string>
#include <vector>

#include "Ink.h"
#include "Refusal.h"
#include "SourceText.h"

namespace QeltDesktop {
namespace {

Page read(const std::string& text) {
  return readInkml(SourceText("page.inkml", text));
}

// A page of one trace, in the channels given.
std::vector<Sample> samplesOf(const std::string& channels, const std::string& trace) {
  const Page page =
      read("<ink><traceFormat>" + channels + "</traceFormat><trace>" + trace + "</trace></ink>");
  return page.traces.at(0).samples;
}

constexpr const char* kXY = R"(<channel name="X"/><channel name="Y"/>)";

std::string refusalOf(const std::string& text) {
  try {
    read(text);
  } catch (const Refusal& refusal) {
    return refusal.what();
  }
  return "not refused";
}

TEST(InkmlReader, ReadsXAndYWithoutATraceFormat) {
  const Page page = read("<ink><trace>1 2, 3.5 -4e1</trace></ink>");
  ASSERT_EQ(page.traces.size(), 1u);
  const std::vector<Sample>& samples = page.traces[0].samples;
  ASSERT_EQ(samples.size(), 2u);
  EXPECT_EQ(samples[1].x, 3.5f);
  EXPECT_EQ(samples[1].y, -40.0f);
  EXPECT_EQ(samples[1].pressure, 1.0f);
  EXPECT_EQ(samples[1].tilt, 0.0f);
  EXPECT_EQ(samples[1].orientation, 0.0f);
  EXPECT_DOUBLE_EQ(samples[1].time, 1000.0 / 240.0);
  EXPECT_FALSE(page.traces[0].tool);
  EXPECT_FALSE(page.traces[0].brush.width);
}

TEST(InkmlReader, RoundsADecimalToTheNearestFloatOnce) {
  // Just above the middle of 1 and the next float, but so little that a double lands on the middle, which
  // would round to even: down.
  const auto samples = samplesOf(kXY, "1.00000005960464477539062500000000001 0");
  EXPECT_EQ(samples[0].x, std::nextafter(1.0f, 2.0f));
}

TEST(InkmlReader, TakesChannelsInAnyOrderAndLeavesOthersOut) {
  const auto samples = samplesOf(
      R"(<channel name="T" units="s"/><channel name="F" max="1023"/><channel name="B" type="boolean"/>
         <channel name="Y"/><channel name="W" type="integer"/><channel name="X"/>)",
      "0.5 1023 T 20 #1f 10, 0.75 341 F 21 -#A 11");
  ASSERT_EQ(samples.size(), 2u);
  EXPECT_EQ(samples[0].x, 10.0f);
  EXPECT_EQ(samples[0].y, 20.0f);
  EXPECT_EQ(samples[0].pressure, 1.0f);
  EXPECT_EQ(samples[0].time, 500.0);
  EXPECT_EQ(samples[1].pressure, 341.0f / 1023.0f);
  EXPECT_EQ(samples[1].time, 750.0);
}

// The recommendation's own example of differences, with its intermittent switches at the end.
TEST(InkmlReader, AddsUpDifferencesWrittenWithoutSpaces) {
  const auto samples = samplesOf(
      std::string(kXY) +
          R"(<intermittentChannels><channel name="S1" type="boolean"/><channel name="S2" type="boolean"/>
             </intermittentChannels>)",
      "1125 18432,'23'43,\"7\"-8,3-5,7 -3,6 2,6 8,3 6 T,2 4*T,3 6,3-6 F F");
  const float x[] = {1125, 1148, 1178, 1211, 1251, 1297, 1349, 1404, 1461, 1521, 1584};
  const float y[] = {18432, 18475, 18510, 18540, 18567, 18596, 18633, 18676, 18723, 18776, 18823};
  ASSERT_EQ(samples.size(), std::size(x));
  for (std::size_t i = 0; i < samples.size(); ++i) {
    EXPECT_EQ(samples[i].x, x[i]) << i;
    EXPECT_EQ(samples[i].y, y[i]) << i;
  }
}

TEST(InkmlReader, KeepsAPrefixForItsChannelUntilTheNextOne) {
  //                                   x 10, 12, 14, 100, 100; y 0, 0, 1, 3, 6
  const auto samples = samplesOf(kXY, "10 0, '2 *, * '1, !100 \"1, * *");
  const float x[] = {10, 12, 14, 100, 100};
  const float y[] = {0, 0, 1, 3, 6};
  ASSERT_EQ(samples.size(), std::size(x));
  for (std::size_t i = 0; i < samples.size(); ++i) {
    EXPECT_EQ(samples[i].x, x[i]) << i;
    EXPECT_EQ(samples[i].y, y[i]) << i;
  }
}

TEST(InkmlReader, KeepsTheLastReadingWhereOneIsNotReported) {
  const auto samples = samplesOf(std::string(kXY) + R"(<channel name="F"/>)", "1 1 ?, 2 2 0.5, 3 3 ?");
  EXPECT_EQ(samples[0].pressure, 1.0f);
  EXPECT_EQ(samples[1].pressure, 0.5f);
  EXPECT_EQ(samples[2].pressure, 0.5f);
}

constexpr float kPi = 3.14159265f;

TEST(InkmlReader, TurnsElevationAndAzimuthIntoTiltAndOrientation) {
  const std::string degrees = std::string(kXY) + R"(<channel name="OE"/><channel name="OA" units="deg"/>)";
  const auto samples = samplesOf(degrees, "0 0 60 90, 0 0 90 270, 0 0 0 -180, 0 0 30 540");
  EXPECT_NEAR(samples[0].tilt, kPi / 6, 1e-6f);
  EXPECT_NEAR(samples[0].orientation, kPi / 2, 1e-6f);
  EXPECT_NEAR(samples[1].tilt, 0.0f, 1e-6f);
  EXPECT_NEAR(samples[1].orientation, -kPi / 2, 1e-6f);
  EXPECT_NEAR(samples[2].tilt, kPi / 2, 1e-6f);
  // Half a turn is plus pi, whichever way it was written.
  EXPECT_EQ(samples[2].orientation, kPi);
  EXPECT_EQ(samples[3].orientation, kPi);

  const std::string radians = std::string(kXY) + R"(<channel name="OE" units="rad"/>)";
  EXPECT_NEAR(samplesOf(radians, "0 0 1")[0].tilt, kPi / 2 - 1.0f, 1e-6f);
  EXPECT_EQ(samplesOf(radians, "0 0 1")[0].orientation, 0.0f);
  const std::string azimuth = std::string(kXY) + R"(<channel name="OA" units="rad"/>)";
  EXPECT_EQ(samplesOf(azimuth, "0 0 1")[0].orientation, 1.0f);
  EXPECT_EQ(samplesOf(azimuth, "0 0 1")[0].tilt, 0.0f);
}

TEST(InkmlReader, TurnsTiltsAlongTheAxesIntoTiltAndOrientation) {
  const std::string axes = R"(<channel name="OTx"/><channel name="OTy"/>)";
  const auto samples = samplesOf(kXY + axes, "0 0 45 0, 0 0 0 -30, 0 0 0 30, 0 0 45 -45");
  EXPECT_NEAR(samples[0].tilt, kPi / 4, 1e-6f);
  EXPECT_NEAR(samples[0].orientation, kPi / 2, 1e-6f);  // towards +x: a quarter clockwise from up
  EXPECT_NEAR(samples[1].tilt, kPi / 6, 1e-6f);
  EXPECT_NEAR(samples[1].orientation, 0.0f, 1e-6f);  // towards -y: up
  EXPECT_NEAR(samples[2].orientation, kPi, 1e-6f);
  EXPECT_NEAR(samples[3].tilt, std::atan(std::sqrt(2.0f)), 1e-6f);
  EXPECT_NEAR(samples[3].orientation, kPi / 4, 1e-6f);

  // Where elevation is recorded the axes do not count.
  const auto both = samplesOf(kXY + axes + R"(<channel name="OE"/>)", "0 0 45 0 90");
  EXPECT_NEAR(both[0].tilt, 0.0f, 1e-6f);
  EXPECT_EQ(both[0].orientation, 0.0f);
}

TEST(InkmlReader, FindsTheFormatOfATraceThroughItsContext) {
  const Page page = read(R"(<i:ink xmlns:i="http://www.w3.org/2003/InkML">
    <i:definitions>
      <i:inkSource xml:id="tablet"><i:traceFormat>
        <i:channel name="Y"/><i:channel name="X"/></i:traceFormat></i:inkSource>
      <i:traceFormat xml:id="pressed"><i:channel name="F"/><i:channel name="X"/><i:channel name="Y"/></i:traceFormat>
      <i:context xml:id="a" inkSourceRef="#tablet"/>
      <i:context xml:id="b" traceFormatRef="#pressed"/>
      <i:context xml:id="c" contextRef="#a"/>
      <i:trace>9 9</i:trace>
    </i:definitions>
    <i:trace contextRef="#a">1 2</i:trace>
    <i:traceGroup contextRef="#b"><i:trace>0.5 1 2</i:trace><i:trace contextRef="#c">1 2</i:trace></i:traceGroup>
    <i:trace>0.25 1 2</i:trace>
    <i:context inkSourceRef="#tablet"/>
    <i:trace>1 2</i:trace>
    <i:trace type="penUp">1 2</i:trace>
  </i:ink>)");
  ASSERT_EQ(page.traces.size(), 5u);
  const float x[] = {2, 1, 2, 1, 2};
  const float pressure[] = {1, 0.5f, 1, 0.25f, 1};
  for (std::size_t i = 0; i < page.traces.size(); ++i) {
    EXPECT_EQ(page.traces[i].samples.at(0).x, x[i]) << i;
    EXPECT_EQ(page.traces[i].samples.at(0).pressure, pressure[i]) << i;
  }
}

TEST(InkmlReader, ChoosesTheBrushNearestToTheTrace) {
  const std::string width = R"(<brushProperty name="width" value=)";
  const Page page = read(
      "<ink><definitions>"
      "<brush xml:id='own'>" +
      width +
      "'1'/></brush>"
      "<brush xml:id='group'>" +
      width +
      "'2'/></brush>"
      "<brush xml:id='context'>" +
      width +
      "'3'/></brush>"
      "<context xml:id='c' brushRef='#context'/></definitions>"
      "<traceGroup brushRef='#group' contextRef='#c'>"
      "<trace brushRef='#own'>0 0</trace><trace>0 0</trace></traceGroup>"
      "<traceGroup contextRef='#c'><trace>0 0</trace></traceGroup>"
      "<brush>" +
      width +
      "'4'/></brush><trace>0 0</trace>"
      "<brush xml:id='late'><brushProperty name='color' value='#102030'/></brush>"
      "<trace>0 0</trace></ink>");
  ASSERT_EQ(page.traces.size(), 5u);
  for (int i = 0; i < 4; ++i) EXPECT_EQ(page.traces[i].brush.width, i + 1.0f) << i;
  EXPECT_FALSE(page.traces[4].brush.width);
  EXPECT_EQ(page.traces[4].brush.rgb, 0x102030u);
}

TEST(InkmlReader, BuildsABrushOnAnotherOne) {
  const Page page = read(R"(<ink><brush xml:id="b"><brushProperty name="width" value="7"/>
      <brushProperty name="transparency" value="64"/></brush>
    <brush brushRef="#b"><brushProperty name="transparency" value="0"/></brush><trace>0 0</trace></ink>)");
  EXPECT_EQ(page.traces[0].brush.width, 7.0f);
  EXPECT_EQ(page.traces[0].brush.transparency, 0);
}

TEST(InkmlReader, NamesTheToolOfATraceOrItsGroup) {
  const Page page = read(R"(<ink><traceGroup><traceGroup><annotation type="tool"> Touch </annotation>
      <trace>0 0</trace><trace><annotation type="tool">mouse</annotation>0 0</trace></traceGroup>
      <trace>0 0</trace><annotation type="note">pen</annotation></traceGroup>
      <trace><annotation type="tool">pen</annotation>0 0</trace></ink>)");
  ASSERT_EQ(page.traces.size(), 4u);
  EXPECT_EQ(page.traces[0].tool, 1);
  EXPECT_EQ(page.traces[1].tool, 3);
  EXPECT_FALSE(page.traces[2].tool);
  EXPECT_EQ(page.traces[3].tool, 2);
}

TEST(InkmlReader, ReadsTextAroundCommentsCharacterDataAndEntities) {
  const auto samples = samplesOf(kXY, "1 <!-- , 5 -->2,<![CDATA[ 3 4 ]]>, &apos;1&#39;2");
  ASSERT_EQ(samples.size(), 3u);
  EXPECT_EQ(samples[1].y, 4.0f);
  EXPECT_EQ(samples[2].x, 4.0f);
  EXPECT_EQ(samples[2].y, 6.0f);
}

TEST(InkmlReader, ReadsUtf16) {
  std::string bytes("\xFF\xFE", 2);
  for (const char c : std::string("<ink>\n<trace>1 2</trace></ink>")) bytes += {c, '\0'};
  const std::string path = testing::TempDir() + "qelt-utf16.inkml";
  std::FILE* const file = std::fopen(path.c_str(), "wb");
  ASSERT_NE(file, nullptr);
  std::fwrite(bytes.data(), 1, bytes.size(), file);
  std::fclose(file);
  EXPECT_EQ(readInkmlFile(path).traces.at(0).samples.at(0).y, 2.0f);
  std::remove(path.c_str());
}

TEST(InkmlReader, RefusesAnUnreadableFile) {
  EXPECT_THROW(readInkmlFile(testing::TempDir() + "not/there.inkml"), Refusal);
  EXPECT_THROW(readInkmlFile(testing::TempDir()), Refusal);
}

struct Malformed {
  std::string name;
  std::string text;
  std::string refusal;  // after "page.inkml:", to its beginning
};

class MalformedInkml : public testing::TestWithParam<Malformed> {};

TEST_P(MalformedInkml, IsRefusedWithFileLineAndValue) {
  const std::string refusal = refusalOf(GetParam().text);
  EXPECT_TRUE(refusal.starts_with("page.inkml:" + GetParam().refusal)) << refusal;
  EXPECT_EQ(refusal.find('\n'), std::string::npos) << refusal;
}

std::string trace(const std::string& text) {
  return "<ink>\n<trace>" + text + "</trace></ink>";
}

std::string format(const std::string& channels, const std::string& points = "0 0 0") {
  return "<ink><traceFormat>\n" + channels + "</traceFormat><trace>" + points + "</trace></ink>";
}

std::string xyAnd(const std::string& channel) {
  return std::string(kXY) + "\n" + channel;
}

std::string brush(const std::string& property) {
  return "<ink>\n\n<brush>" + property + "</brush><trace>0 0</trace></ink>";
}

INSTANTIATE_TEST_SUITE_P(
    Pages, MalformedInkml,
    testing::Values(
        Malformed{"NotXml", "hello", "1: not XML"}, Malformed{"Empty", "", "1: not XML"},
        Malformed{"TagNotClosed", "<ink>\n<trace>1 2</trac></ink>", "2: not XML"},
        Malformed{"NulByte", std::string("<ink>\n\0</ink>", 13), "2: not XML"},
        Malformed{"TwoRoots", "<ink><trace>0 0</trace></ink>\n<ink/>", "2: not XML"},
        Malformed{"OtherRoot", "\n<svg/>", "2: not InkML, the root element is: svg"},
        Malformed{"NoTrace", "<ink>\n</ink>", "1: no trace in the page"},
        Malformed{"EmptyTrace", trace(" \n "), "2: trace without points"},
        Malformed{"WordForNumber", trace("1 2,\r\n3 x7, 5 6"), "3: not a number: x7"},
        Malformed{"TwoPoints", trace("1.2.3 4"), "2: not a number: 1.2.3"},
        Malformed{"SignAlone", trace("1 -"), "2: not a number: -"},
        Malformed{"ExponentAlone", trace("1 2e"), "2: not a number: 2e"},
        Malformed{"UnitOnNumber", trace("1px 2"), "2: not a number: 1px"},
        Malformed{"NaN", trace("1 NaN"), "2: not a number: NaN"},
        Malformed{"Infinity", trace("1 -inf"), "2: not a number: -inf"},
        Malformed{"OutOfRange", trace("1 2,\n3 1e39"), "3: number out of range: 1e39"},
        Malformed{"SumOutOfRange", trace("1 3e38,\n'1'3e38"), "3: number out of range: '3e38"},
        Malformed{"TooFewValues", trace("1 2,\n3\n, 4 5"),
                  "3: point does not have the 2 values of its format: 3"},
        Malformed{"TooManyValues", trace("1 2,\n3 4 5"),
                  "3: point does not have the 2 values of its format: 3 4 5"},
        Malformed{"EmptyPoint", trace("1 2,,3 4"), "2: point does not have the 2 values of its format: \"\""},
        Malformed{"TrailingComma", trace("1 2,"), "2: nothing follows the last comma"},
        Malformed{"DifferenceFirst", trace("'1'2"), "2: a difference needs a value before it: '1'2"},
        Malformed{"RepeatFirst", trace("* 2"), "2: nothing before it to repeat: *"},
        Malformed{"SwitchForNumber", trace("1 T"), "2: not a number: T"},
        Malformed{"ElementInTrace", trace("1 2<br/>"), "2: element that a trace cannot hold: br"},
        Malformed{"NoY", format(R"(<channel name="X"/>)"), "1: traceFormat without channel: Y"},
        Malformed{"NoX", format(R"(<channel name="Y"/>)"), "1: traceFormat without channel: X"},
        Malformed{"NamelessChannel", format(xyAnd("<channel/>")), "3: channel without a name"},
        Malformed{"ChannelTwice", format(xyAnd(R"(<channel name="X"/>)")), "3: channel named twice: X"},
        Malformed{"MaxOfZero", format(xyAnd(R"(<channel name="F" max="0"/>)")),
                  "3: max of channel F must be a number above 0: 0"},
        Malformed{"MaxNoNumber", format(xyAnd(R"(<channel name="F" max="inf"/>)")),
                  "3: max of channel F must be a number above 0: inf"},
        Malformed{"UnknownUnit", format(xyAnd(R"(<channel name="OE" units="grad"/>)")),
                  "3: unknown unit of channel OE: grad"},
        Malformed{"UnknownTimeUnit", format(xyAnd(R"(<channel name="T" units="h"/>)")),
                  "3: unknown unit of channel T: h"},
        Malformed{"BooleanX", format(R"(<channel name="X" type="boolean"/><channel name="Y"/>)", "T 0"),
                  "2: channel X cannot be: boolean"},
        Malformed{"UnknownBrush", "<ink>\n<trace brushRef='#none'>0 0</trace></ink>",
                  "2: unknown brushRef: #none"},
        Malformed{"UnknownContext", "<ink>\n<trace contextRef='#none'>0 0</trace></ink>",
                  "2: unknown contextRef: #none"},
        Malformed{"ReferenceToAnotherKind",
                  "<ink><brush xml:id='b'/>\n<trace contextRef='#b'>0 0</trace></ink>",
                  "2: unknown contextRef: #b"},
        Malformed{"ContextsInACircle",
                  "<ink><context xml:id='a' contextRef='#b'/><context xml:id='b' contextRef='#a'/><trace>0 "
                  "0</trace></ink>",
                  "1: contextRef leads back to itself"},
        Malformed{"BrushesInACircle", "<ink><brush xml:id='a' brushRef='#a'/><trace>0 0</trace></ink>",
                  "1: brushRef leads back to itself"},
        Malformed{"IdTwice", "<ink><brush xml:id='a'/>\n<brush xml:id='a'/><trace>0 0</trace></ink>",
                  "2: id given twice: a"},
        Malformed{"WidthNoNumber", brush("<brushProperty name='width' value='wide'/>"),
                  "3: brush width must be a number above 0: wide"},
        Malformed{"WidthBelowZero", brush("<brushProperty name='width' value='-2'/>"),
                  "3: brush width must be a number above 0: -2"},
        Malformed{"ColourName", brush("<brushProperty name='color' value='red'/>"),
                  "3: brush color must be #RRGGBB: red"},
        Malformed{"TooTransparent", brush("<brushProperty name='transparency' value='256'/>"),
                  "3: brush transparency must be a number from 0 to 255: 256"},
        Malformed{"UnknownTool", "<ink><trace>\n<annotation type='tool'>quill</annotation>0 0</trace></ink>",
                  "2: unknown tool: quill"}),
    [](const testing::TestParamInfo<Malformed>& param) { return param.param.name; });

TEST(InkmlReader, RefusesNestingThatWouldEatTheStack) {
  std::string text = "<ink>";
  for (int i = 0; i < 200000; ++i) text += "<traceGroup>";
  text += "<trace>0 0</trace>";
  for (int i = 0; i < 200000; ++i) text += "</traceGroup>";
  EXPECT_NE(refusalOf(text + "</ink>").find("nested too deep"), std::string::npos);
}

}  // namespace
}  // namespace QeltDesktop
