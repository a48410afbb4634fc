#include "ink/InkmlReader.h"

#include <gmock/gmock.h>
#include <malloc.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cmath>
#include <cstddef>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "ink/Ink.h"
#include "ink/SourceText.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

Page read(const std::string& text) {
  return readInkml(SourceText("page.inkml", text));
}

// A page of one trace, in the channels given.
std::vector<Sample> samplesOf(const std::string& channels, const std::string& trace) {
  const Page page =
      read("<ink><traceFormat>" + channels + "</traceFormat><trace>" + trace + "</trace></ink>");
  const Samples samples = page.strokes.at(0).samples;
  return {samples.begin(), samples.end()};
}

const std::string kXY = R"(<channel name="X"/><channel name="Y"/>)";

std::vector<double> valuesOf(const Sample& s) {
  return {s.x, s.y, s.pressure, s.tilt, s.orientation, s.time};
}

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
  ASSERT_EQ(page.strokes.size(), 1u);
  const Samples samples = page.strokes[0].samples;
  ASSERT_EQ(samples.size(), 2u);
  EXPECT_EQ(valuesOf(samples[1]), (std::vector<double>{3.5, -40, 1, 0, 0, 1000.0 / 240.0}));
  // Just above the middle of 1 and the next float, but so little that a double lands on the middle, which
  // would round to even: down.
  EXPECT_EQ(samplesOf(kXY, "1.00000005960464477539062500000000001 0")[0].x, std::nextafter(1.0f, 2.0f));
}

TEST(InkmlReader, TakesChannelsInAnyOrderAndLeavesOthersOut) {
  const auto samples = samplesOf(
      R"(<channel name="T" units="s"/><channel name="F" max="1023"/><channel name="B" type="boolean"/>
         <channel name="Y"/><channel name="W" type="integer"/><channel name="X"/>)",
      "0.5 1023 T 20 #1f 10, 0.75 341 F 21 -#A 11");
  ASSERT_EQ(samples.size(), 2u);
  EXPECT_EQ(valuesOf(samples[0]), (std::vector<double>{10, 20, 1, 0, 0, 500}));
  EXPECT_EQ(valuesOf(samples[1]), (std::vector<double>{11, 21, 341.0f / 1023.0f, 0, 0, 750}));
}

TEST(InkmlReader, ReadsPointsHoweverTheyAreWritten) {
  const struct {
    std::string channels, trace;
    std::vector<float> places;  // x, y, x, ...
  } cases[] = {
      // The recommendation's own example of differences, with its intermittent switches at the end.
      {kXY +
           R"(<intermittentChannels><channel name="S1" type="boolean"/><channel name="S2" type="boolean"/>
              </intermittentChannels>)",
       "1125 18432,'23'43,\"7\"-8,3-5,7 -3,6 2,6 8,3 6 T,2 4*T,3 6,3-6 F F",
       {1125,  18432, 1148,  18475, 1178,  18510, 1211,  18540, 1251,  18567, 1297,
        18596, 1349,  18633, 1404,  18676, 1461,  18723, 1521,  18776, 1584,  18823}},
      // A prefix is its channel's until the next one.
      {kXY, "10 0, '2 *, * '1, !100 \"1, * *", {10, 0, 12, 0, 14, 1, 100, 3, 100, 6}},
      {kXY, "1 <!-- , 5 -->2,<![CDATA[ 3 4 ]]>, &apos;1&#39;2", {1, 2, 3, 4, 4, 6}}};
  for (const auto& [channels, trace, places] : cases) {
    std::vector<float> read;
    for (const Sample& sample : samplesOf(channels, trace)) read.insert(read.end(), {sample.x, sample.y});
    EXPECT_EQ(read, places) << trace;
  }
}

TEST(InkmlReader, KeepsTheLastReadingWhereOneIsNotReported) {
  const auto samples = samplesOf(kXY + R"(<channel name="F"/>)", "1 1 ?, 2 2 0.5, 3 3 ?");
  EXPECT_EQ(samples.at(0).pressure, 1.0f);
  EXPECT_EQ(samples.at(2).pressure, 0.5f);
}

TEST(InkmlReader, TurnsAnglesIntoTiltAndOrientation) {
  constexpr float kPi = 3.14159265f;
  const std::string spherical = R"(<channel name="OE"/><channel name="OA" units="deg"/>)";
  const std::string axes = R"(<channel name="OTx"/><channel name="OTy"/>)";
  const struct {
    std::string channels, angles;
    float tilt, orientation;
  } cases[] = {{spherical, "60 90", kPi / 6, kPi / 2},
               {spherical, "90 270", 0.0f, -kPi / 2},
               // Half a turn is plus pi, whichever way it was written.
               {spherical, "0 -180", kPi / 2, kPi},
               {R"(<channel name="OE" units="rad"/>)", "1", kPi / 2 - 1.0f, 0.0f},
               {R"(<channel name="OA" units="rad"/>)", "1", 0.0f, 1.0f},
               {axes, "45 0", kPi / 4, kPi / 2},  // towards +x: a quarter clockwise from up
               {axes, "0 -30", kPi / 6, 0.0f},    // towards -y: up
               {axes, "45 -45", std::atan(std::sqrt(2.0f)), kPi / 4},
               // Where elevation is recorded the axes do not count.
               {axes + R"(<channel name="OE"/>)", "45 0 90", 0.0f, 0.0f}};
  for (const auto& [channels, angles, tilt, orientation] : cases) {
    const Sample sample = samplesOf(kXY + channels, "0 0 " + angles)[0];
    EXPECT_NEAR(sample.tilt, tilt, 1e-6f) << channels << angles;
    EXPECT_NEAR(sample.orientation, orientation, 1e-6f) << channels << angles;
    EXPECT_EQ(orientation == kPi, sample.orientation == kPi);
  }
}

TEST(InkmlReader, FindsTheFormatOfATraceThroughItsContext) {
  const Page page = read(R"(<i:ink xmlns:i="http://www.w3.org/2003/InkML"><i:definitions>
      <i:inkSource xml:id="tablet"><i:traceFormat><i:channel name="Y"/><i:channel name="X"/></i:traceFormat></i:inkSource>
      <i:traceFormat xml:id="pressed"><i:channel name="F"/><i:channel name="X"/><i:channel name="Y"/></i:traceFormat>
      <i:context xml:id="a" inkSourceRef="#tablet"/><i:context xml:id="b" traceFormatRef="#pressed"/>
      <i:context xml:id="c" contextRef="#a"/><i:trace>9 9</i:trace></i:definitions>
    <i:trace contextRef="#a">1 2</i:trace>
    <i:traceGroup contextRef="#b"><i:trace>0.5 1 2</i:trace><i:trace contextRef="#c">1 2</i:trace></i:traceGroup>
    <i:trace>0.25 1 2</i:trace><i:context inkSourceRef="#tablet"/>
    <i:trace>1 2</i:trace><i:trace type="penUp">1 2</i:trace></i:ink>)");
  ASSERT_EQ(page.strokes.size(), 5u);
  const float x[] = {2, 1, 2, 1, 2};
  const float pressure[] = {1, 0.5f, 1, 0.25f, 1};
  for (std::size_t i = 0; i < page.strokes.size(); ++i) {
    EXPECT_EQ(page.strokes[i].samples.at(0).x, x[i]) << i;
    EXPECT_EQ(page.strokes[i].samples.at(0).pressure, pressure[i]) << i;
  }
}

TEST(InkmlReader, ChoosesTheBrushNearestToTheTrace) {
  const Page page = read(R"(<ink><definitions>
      <brush xml:id='own'><brushProperty name='width' value='1'/></brush>
      <brush xml:id='group'><brushProperty name='width' value='2'/></brush>
      <brush xml:id='context'><brushProperty name='width' value='3'/></brush>
      <context xml:id='c' brushRef='#context'/></definitions>
    <traceGroup brushRef='#group' contextRef='#c'>
      <trace brushRef='#own'>0 0</trace><trace>0 0</trace></traceGroup>
    <traceGroup contextRef='#c'><trace>0 0</trace></traceGroup>
    <brush xml:id='b'><brushProperty name='width' value='4'/><brushProperty name='transparency' value='64'/></brush>
    <trace>0 0</trace>
    <brush brushRef='#b'><brushProperty name='transparency' value='0'/></brush><trace>0 0</trace>
    <brush xml:id='late'><brushProperty name='color' value='#102030'/></brush><trace>0 0</trace></ink>)");
  ASSERT_EQ(page.strokes.size(), 6u);
  for (int i = 0; i < 4; ++i) EXPECT_EQ(page.strokes[i].brush.width, i + 1.0f) << i;
  EXPECT_EQ(page.strokes[4].brush.width, 4.0f);  // built on another one
  EXPECT_EQ(page.strokes[4].brush.transparency, 0);
  EXPECT_FALSE(page.strokes[5].brush.width);
  EXPECT_EQ(page.strokes[5].brush.rgb, 0x102030u);
}

TEST(InkmlReader, NamesTheToolOfATraceOrItsGroup) {
  const Page page = read(R"(<ink><traceGroup><traceGroup><annotation type="tool"> Touch </annotation>
      <trace>0 0</trace><trace><annotation type="tool">mouse</annotation>0 0</trace></traceGroup>
      <trace>0 0</trace><annotation type="note">pen</annotation></traceGroup>
      <trace><annotation type="tool">pen</annotation>0 0</trace></ink>)");
  const std::optional<int> tools[] = {1, 3, {}, 2};
  ASSERT_EQ(page.strokes.size(), 4u);
  for (std::size_t i = 0; i < 4; ++i) EXPECT_EQ(page.strokes[i].tool, tools[i]) << i;
}

// A page as programs write it that know their digitizer: the context's ink source says what a step is.
std::string digitized(const std::string& channels, const std::string& properties, const std::string& points) {
  return "<ink><definitions><context xml:id='c'><inkSource><traceFormat>\n" + channels +
         "</traceFormat>\n<channelProperties>" + properties +
         "</channelProperties></inkSource></context></definitions>\n<trace contextRef='#c'>" + points +
         "</trace></ink>";
}

std::string resolution(const std::string& channel, const std::string& value, const std::string& units) {
  return "<channelProperty channel='" + channel + "' name='resolution' value='" + value + "' units='" +
         units + "'/>";
}

TEST(InkmlReader, TakesLengthsInTheirUnits) {
  const auto channels = [](const std::string& units) {
    return "<channel name='X'" + units + "/><channel name='Y'" + units + "/>";
  };
  // Everywhere 1 and 2 inches, unless there is no unit.
  const struct {
    std::string units, properties, points;
    float x, y;
  } pages[] = {
      {" units='in'", "", "1 2", 96, 192},
      {" units='cm'", "", "2.54 5.08", 96, 192},
      {" units='mm'", "", "25.4 50.8", 96, 192},
      {" units='m'", "", "0.0254 0.0508", 96, 192},
      {" units='himetric'", "", "2540 5080", 96, 192},
      {" units='pt'", "", "72 144", 96, 192},
      {" units='pc'", "", "6 12", 96, 192},
      {" units='px'", "", "96 192", 96, 192},
      {" units='dev'", "", "1 2", 1, 2},
      {"", "", "1 2", 1, 2},
      // The resolution wins over the units; each channel has its own.
      {" units='in'", resolution("X", "1000", "1/cm"), "2540 2", 96, 192},
      {"", resolution("X", "1000", "1/cm") + resolution("Y", "600", "1/in"), "2540 1200", 96, 192},
      {"", resolution("Y", "20", "1/mm") + resolution("Y", "5", "1/mm"), "1 1016", 1, 192},
      // These say nothing of a length.
      {" units='in'", resolution("X", "0", "1/cm") + resolution("Y", "7", "1/dev"), "1 2", 96, 192},
      {"", resolution("X", "7", "") + resolution("W", "much", "1/furlong") + resolution("F", "0", "1/dev"),
       "1 2", 1, 2},
      {" units='in'", resolution("X", "0", "1/furlong") + resolution("Y", "-1", "dpi"), "1 2", 96, 192},
      // Nor do those of other channels, whether the format has them or not.
      {"", resolution("T", "1", "1/us") + resolution("OE", "2", "1/grad") + resolution("OTx", "2", "turns"),
       "1 2", 1, 2},
      {"", "<channelProperty channel='X' name='accuracy' value='3' units='mm'/>", "1 2", 1, 2},
      // Differences are counted in steps too.
      {"", resolution("X", "10", "1/in") + resolution("Y", "10", "1/in"), "3 5,'7'15", 96, 192}};
  for (const auto& [units, properties, points, x, y] : pages) {
    const Page page = read(digitized(channels(units), properties, points));
    EXPECT_EQ(page.strokes.at(0).samples.back().x, x) << units << properties;
    EXPECT_EQ(page.strokes.at(0).samples.back().y, y) << units << properties;
  }
  // Axes that point the other way, so that the page comes out upright.
  const std::string turned = "<channel name='X' orientation='+ve'/><channel name='Y' orientation='-ve'";
  for (const std::string& y : {turned + "/>", turned + " units='px'/>"}) {
    EXPECT_EQ(samplesOf(y, "3 4")[0].x, 3.0f);
    EXPECT_EQ(samplesOf(y, "3 4")[0].y, -4.0f);
  }
  const Page page = read(digitized(turned + "/>", resolution("Y", "2", "1/in"), "3 4"));
  EXPECT_EQ(page.strokes.at(0).samples.at(0).y, -192.0f);
}

TEST(InkmlReader, TakesAnglesTimesAndForcesInTheirUnits) {
  constexpr float kPi = 3.14159265f;
  const std::string oa = "<channel name='OA'", oe = "<channel name='OE'", f = "<channel name='F'";
  const struct {
    std::string channel, properties, value;
    float pressure, tilt, orientation;
  } pages[] = {
      // Steps of a digitizer, told by a range beyond a turn or by none.
      {oa + " max='3600' units='deg'/>", resolution("OA", "10", "1/deg"), "900", 1, 0, kPi / 2},
      {oa + " units='deg'/>", resolution("OA", "10", "1/deg"), "900", 1, 0, kPi / 2},
      {oe + " max='900'/>", resolution("OE", "10", ""), "450", 1, kPi / 4, 0},
      {oe + " max='15708' units='rad'/>", resolution("OE", "10000", "1/rad"), "10000", 1, kPi / 2 - 1, 0},
      {oe + " units='rad'/>", resolution("OE", "10", "1/deg"), "450", 1, kPi / 4, 0},
      // Steps to an unknown unit are taken for steps to the channel's own.
      {oe + " max='900'/>", resolution("OE", "10", "1/grad"), "450", 1, kPi / 4, 0},
      // A range of a turn at most is in degrees, or radians, whatever the resolution.
      {oa + " max='360' units='deg'/>", resolution("OA", "1000", "1/deg"), "90", 1, 0, kPi / 2},
      {oe + " max='90' units='deg'/>", resolution("OE", "1000", "1/deg"), "45", 1, kPi / 4, 0},
      {oa + " max='6.2832' units='rad'/>", resolution("OA", "1000", "1/rad"), "1", 1, 0, 1},
      {oa + " units='dev'/>", "", "90", 1, 0, kPi / 2},
      {f + " min='100' max='300'/>", resolution("F", "10", "1/dev"), "150", 0.25f, 0, 0},
      {f + " min='-1' max='0'/>", "", "-0.5", 0.5f, 0, 0},
      {f + " max='32767' units='dev'/>", resolution("F", "0", "1/dev"), "32767", 1, 0, 0},
      {f + " min='7' units='N'/>", "", "0.5", 0.5f, 0, 0}};
  for (const auto& [channel, properties, value, pressure, tilt, orientation] : pages) {
    const Page page = read(digitized(kXY + channel, properties, "0 0 " + value));
    const Sample sample = page.strokes.at(0).samples.at(0);
    EXPECT_EQ(sample.pressure, pressure) << channel << properties;
    EXPECT_NEAR(sample.tilt, tilt, 1e-6f) << channel << properties;
    EXPECT_NEAR(sample.orientation, orientation, 1e-6f) << channel << properties;
  }
  const std::string time = "<channel name='T'";
  EXPECT_EQ(samplesOf(kXY + time + " units='dev'/>", "0 0 7")[0].time, 7.0);
  for (const std::string& stated : {resolution("T", "100", "1/s"), resolution("T", "often", "1/us")})
    EXPECT_EQ(read(digitized(kXY + time + "/>", stated, "0 0 7")).strokes[0].samples[0].time, 7.0) << stated;
}

TEST(InkmlReader, TakesBrushesInTheirUnitsAndWithoutPressure) {
  const Page page =
      read(R"(<ink><traceFormat><channel name="X"/><channel name="Y"/><channel name="F"/></traceFormat>
      <brush xml:id="a"><brushProperty name="width" value="0.0254" units="cm"/>
        <brushProperty name="height" value="1" units="cm"/><brushProperty name="ignorePressure" value="1"/></brush>
      <brush xml:id="b"><brushProperty name="width" value="3" units="dev"/>
        <brushProperty name="ignorePressure" value="false"/></brush>
      <brush xml:id="c" brushRef="#a"><brushProperty name="ignorePressure" value="0"/></brush>
      <brush xml:id="d" brushRef="#a"/>
      <brush xml:id="e"><brushProperty name="width" value="1"/><brushProperty name="outlineSize" value="3" units="pt"/></brush>
      <trace brushRef="#a">0 0 0.5</trace><trace brushRef="#b">0 0 0.5</trace><trace brushRef="#c">0 0 0.5</trace>
      <trace brushRef="#d">0 0 0.5</trace><trace brushRef="#e">0 0 0.5</trace></ink>)");
  const float widths[] = {0.96f, 3, 0.96f, 0.96f, 1}, pressures[] = {1, 0.5f, 0.5f, 1, 0.5f};
  ASSERT_EQ(page.strokes.size(), 5u);
  for (std::size_t i = 0; i < 5; ++i) {
    EXPECT_EQ(page.strokes[i].brush.width, widths[i]) << i;
    EXPECT_EQ(page.strokes[i].samples.at(0).pressure, pressures[i]) << i;
  }
  EXPECT_EQ(page.strokes[4].brush.outlineSize, 4.0f);
}

TEST(InkmlReader, CountsEachTraceByTheInkSourceOfItsContext) {
  const std::string properties =
      "<channelProperties>" + resolution("X", "10", "1/in") + "</channelProperties>";
  const Page page = read(R"(<ink><definitions>
      <inkSource xml:id="tablet"><channelProperties>)" +
                         resolution("X", "5", "1/in") + R"(</channelProperties></inkSource>
      <traceFormat xml:id="inches"><channel name="X" units="in"/><channel name="Y"/></traceFormat>
      <context xml:id="plain" inkSourceRef="#tablet"/>
      <context xml:id="own"><inkSource>)" +
                         properties + R"(</inkSource></context>
      <context xml:id="format" traceFormatRef="#inches"/>
      <context xml:id="both" contextRef="#own" traceFormatRef="#inches"/>
      <context xml:id="heir" contextRef="#both"><brush><brushProperty name="width" value="2"/></brush></context>
      <context xml:id="source"><inkSource><traceFormat xml:id="within"><channel name="Y"/><channel name="X"/></traceFormat>)" +
                         properties + R"(</inkSource></context>
      <context xml:id="borrowed" traceFormatRef="#within" inkSourceRef="#tablet"/></definitions>
    <trace contextRef="#plain">1 1</trace><trace contextRef="#own">1 1</trace><trace contextRef="#format">1 1</trace>
    <trace contextRef="#both">1 1</trace><trace contextRef="#heir">1 1</trace><trace contextRef="#source">1 1</trace>
    <trace contextRef="#borrowed">1 1</trace><traceGroup contextRef="#own"><trace>1 1</trace>
    <trace contextRef="#plain">1 1</trace></traceGroup></ink>)");
  const float x[] = {19.2f, 9.6f, 96, 9.6f, 9.6f, 9.6f, 19.2f, 9.6f, 19.2f};
  ASSERT_EQ(page.strokes.size(), std::size(x));
  for (std::size_t i = 0; i < std::size(x); ++i) {
    EXPECT_EQ(page.strokes[i].samples.at(0).x, x[i]) << i;
    EXPECT_EQ(page.strokes[i].samples.at(0).y, 1.0f) << i;
  }
  EXPECT_EQ(page.strokes[4].brush.width, 2.0f);
}

TEST(InkmlReader, TellsInkmlFromOtherNamespaces) {
  const std::string ink = "http://www.w3.org/2003/InkML";
  const auto x = [](const std::string& text) {
    std::vector<float> found;
    for (const Stroke& stroke : read(text).strokes) found.push_back(stroke.samples.at(0).x);
    return found;
  };
  const std::vector<float> both{1, 2};
  const std::vector<std::string> pages{
      "<a:ink xmlns:a='" + ink + "'><a:trace>1 0</a:trace><b:trace xmlns:b='" + ink +
          "'>2 0</b:trace></a:ink>",
      "<ink xmlns='" + ink +
          "' xmlns:a='urn:a'><a:trace>9 0</a:trace><trace>1 0</trace><trace>2 0</trace></ink>",
      // Bound to another name inside, and back outside.
      "<a:ink xmlns:a='" + ink +
          "'><a:trace>1 0</a:trace><x xmlns:a='urn:a'><a:brush/></x><a:trace>2 0</a:trace></a:ink>",
      "<ink><trace>1 0</trace><math xmlns='urn:math'><trace>9 0</trace><trace/></math>" +
          std::string("<trace>2 0</trace></ink>"),
      // No namespace, one that is bound to nothing, and one with another name.
      std::string("<ink><trace>1 0</trace><a:trace>2 0</a:trace></ink>"),
      std::string("<a:ink><a:trace>1 0</a:trace><trace>2 0</trace></a:ink>"),
      "<ink xmlns='urn:own'><trace>1 0</trace><a:trace xmlns:a='" + ink + "'>2 0</a:trace></ink>",
      "<ink xmlns='" + ink +
          "' xmlns:a='urn:a'><trace a:type='penUp' a:brushRef='#b' xmlns:type='penUp'>1<a:b>7</a:b> 0"
          "</trace><trace>2 0</trace></ink>"};
  for (const std::string& page : pages) EXPECT_EQ(x(page), both) << page;
  EXPECT_TRUE(refusalOf("<ink xmlns:a='urn:a'>\n<a:x>\n</a:x><trace>x</trace></ink>")
                  .starts_with("page.inkml:3: not a"));
}

TEST(InkmlReader, PassesOverWhatItDoesNotDraw) {
  const Page page =
      read(R"(<ink><definitions><traceFormat><channel name="X"><mapping type="identity"/></channel>
      <channel name="F" type="boolean"/><channel name="Y"/><channel name="H" units="furlong"/>
      <intermittentChannels><channel name="OE" units="furlong"/></intermittentChannels></traceFormat>
      <canvas/><mapping/><timestamp xml:id="t"/><trace xml:id="kept">7 T 7 7</trace></definitions>
    <annotationXML type="truth"><math><mi>x</mi><trace>no</trace></math></annotationXML>
    <traceView traceDataRef="#kept"><traceView from="1"/><annotation type="tool">quill</annotation></traceView>
    <news><item/>more</news>
    <traceGroup><annotationXML/><traceView/><trace id="0">1 T 2 3<annotationXML><a/>5</annotationXML>, 4 F <news>8</news>
    5 6 30</trace></traceGroup></ink>)");
  ASSERT_EQ(page.strokes.size(), 1u);
  ASSERT_EQ(page.strokes[0].samples.size(), 2u);
  const Sample last = page.strokes[0].samples[1];
  EXPECT_EQ(valuesOf(last), (std::vector<double>{4, 5, 1, 0, 0, 1000.0 / 240.0}));
}

TEST(InkmlReader, ReadsFilesOfUtf16AndRefusesWhatIsNoFile) {
  std::string bytes("\xFF\xFE", 2);
  for (const char c : std::string("<ink>\n<trace>1 2</trace></ink>")) bytes += {c, '\0'};
  const std::string path = testing::TempDir() + "qelt-utf16-" + std::to_string(getpid());
  std::ofstream(path, std::ios::binary) << bytes;
  EXPECT_EQ(readInkmlFile(path).strokes.at(0).samples.at(0).y, 2.0f);
  std::remove(path.c_str());
  EXPECT_THROW(readInkmlFile(testing::TempDir() + "not/there.inkml"), Refusal);
  EXPECT_THROW(readInkmlFile(testing::TempDir()), Refusal);
}

std::string times(int count, const std::string& text) {
  std::string all;
  for (int i = 0; i < count; ++i) all += text;
  return all;
}

std::string trace(const std::string& text) {
  return "<ink>\n<trace>" + text + "</trace></ink>";
}

std::string format(const std::string& channels, const std::string& points = "0 0 0") {
  return "<ink><traceFormat>\n" + channels + "</traceFormat><trace>" + points + "</trace></ink>";
}

std::string formatAnd(const std::string& channel) {
  return format(kXY + "\n" + channel);
}

std::string brush(const std::string& property) {
  return "<ink>\n\n<brush>" + property + "</brush><trace>0 0</trace></ink>";
}

TEST(InkmlReader, RefusesWhatIsMalformedWithFileLineAndValue) {
  const struct {
    std::string text;
    std::string refusal;  // after "page.inkml:", to its beginning
  } pages[] = {
      {"", "1: not XML"},
      {"<ink>\n<trace>1 2</trac></ink>", "2: not XML"},
      {std::string("<ink>\n\0</ink>", 13), "2: not XML"},
      {"<ink><trace>0 0</trace></ink>\n<ink/>", "2: not XML"},
      {"\n<svg/>", "2: not InkML, the root element is: svg"},
      {"<ink>\n</ink>", "1: no trace in the page"},
      {trace(" \n "), "2: trace without points"},
      {trace("1 2,\r\n3 x7, 5 6"), "3: not a number: x7"},
      {trace("1 -"), "2: not a number: -"},
      {trace("1 NaN"), "2: not a number: NaN"},
      {trace("1 -inf"), "2: not a number: -inf"},
      {trace("1 2,\n3 1e39"), "3: number out of range: 1e39"},
      {trace("1 3e38,\n'1'3e38"), "3: number out of range: '3e38"},
      {trace("1 2,\n3\n, 4 5"), "3: point does not have the 2 values of its format: 3"},
      {trace("1 2,\n3 4 5"), "3: point does not have the 2 values of its format: 3 4 5"},
      {trace("1 2,,3 4"), "2: point does not have the 2 values of its format: \"\""},
      {trace("1 2,"), "2: nothing follows the last comma"},
      {trace("'1'2"), "2: a difference needs a value before it: '1'2"},
      {trace("* 2"), "2: nothing before it to repeat: *"},
      {trace("\n? 10, 20 20"), "3: point without a place: ? 10"},
      {trace("1 T"), "2: not a number: T"},
      {trace("1 2,\n3 4&#0;, 5 6"), "3: not XML: reference to invalid character number: &#0;"},
      {trace("1 &#10;2, <!--\n-->3 &nbsp;, 5 6"), "3: not a number: &nbsp;"},
      {trace("1 #1234567890abc"), "2: more than 12 hexadecimal digits: #1234567890abc"},
      {trace("1 2<brush/>"), "2: element that a trace cannot hold: brush"},
      {format(R"(<channel name="X"/>)"), "1: traceFormat without channel: Y"},
      {format(R"(<channel name="Y"/>)"), "1: traceFormat without channel: X"},
      {formatAnd("<channel/>"), "3: channel without a name"},
      {formatAnd(R"(<channel name="X"/>)"), "3: channel named twice: X"},
      {formatAnd(R"(<channel name="F" max="0"/>)"), "3: max of channel F must be a number above 0: 0"},
      {formatAnd(R"(<channel name="F" max="inf"/>)"), "3: max of channel F must be a number above 0: inf"},
      {formatAnd(R"(<channel name="F" min="low"/>)"), "3: min of channel F must be a number: low"},
      {formatAnd(R"(<channel name="F" min="5" max="5"/>)"),
       "3: max of channel F must be a number above its min: 5"},
      {formatAnd(R"(<channel name="OE" units="grad"/>)"), "3: unknown unit of channel OE: grad"},
      {formatAnd(R"(<channel name="OE" max="high"/>)"), "3: max of channel OE must be a number: high"},
      {format(R"(<channel name="X" units="in"/><channel name="Y" units="furlong"/>)"),
       "2: unknown unit of channel Y: furlong"},
      {format("<channel name='X' units='m'/><channel name='Y'/>", "1e38 0"), "2: number out of range: 1e38"},
      {digitized(kXY, "\n" + resolution("X", "10", "1/furlong"), "0 0"),
       "4: unknown unit of the resolution of channel X: 1/furlong"},
      {digitized(kXY, resolution("X", "10", "dpi"), "0 0"),
       "3: unknown unit of the resolution of channel X: dpi"},
      {digitized(kXY, resolution("Y", "fine", "1/cm"), "0 0"),
       "3: no number as the resolution of channel Y: fine"},
      {format(R"(<channel name="X" type="boolean"/><channel name="Y"/>)", "T 0"),
       "2: channel X cannot be: boolean"},
      {"<ink>" + times(200'000, "<traceGroup>") + times(200'000, "</traceGroup>") + "</ink>",
       "1: elements nested too deep, more than 200: traceGroup"},
      {"<ink>\n<trace brushRef='#none'>0 0</trace></ink>", "2: unknown brushRef: #none"},
      {"<ink>\n<trace contextRef='#none'>0 0</trace></ink>", "2: unknown contextRef: #none"},
      {"<ink><brush xml:id='b'/>\n<trace contextRef='#b'>0 0</trace></ink>", "2: unknown contextRef: #b"},
      {"<ink><brush xml:id='a'/><brush xml:id='b'/>\n<brush xml:id='b'/>\n<brush xml:id='a'/>\n"
       "<traceFormat/></ink>",
       "2: id given twice: b"},
      {"<ink><brush xml:id='a'/>\n<traceFormat/>\n<brush xml:id='a'/></ink>", "2: traceFormat"},
      {"<ink><brush xml:id='a'/>\n<brush xml:id='a'/>\n</ink", "3: not XML"},
      {brush("<brushProperty name='width' value='-2'/>"), "3: brush width must be a number above 0: -2"},
      {brush("<brushProperty name='color' value='red'/>"), "3: brush color must be #RRGGBB: red"},
      {brush("<brushProperty name='transparency' value='256'/>"),
       "3: brush transparency must be a number from 0 to 255: 256"},
      {brush("<brushProperty name='renderingVersion' value='100'/>"),
       "3: brush renderingVersion must be a whole number from 1 to 99: 100"},
      {brush("<brushProperty name='width' value='2' units='furlong'/>"),
       "3: unknown unit of brush width: furlong"},
      {brush("<brushProperty name='width' value='1e38' units='m'/>"), "3: brush width is out of range: 1e38"},
      {brush("<brushProperty name='ignorePressure' value='maybe'/>"),
       "3: brush ignorePressure must be true or false: maybe"},
      {brush("<brushProperty name='curve' value='maybe'/>"), "3: brush curve must be true or false: maybe"},
      {brush("<brushProperty name='outlineSize' value='0'/>"),
       "3: brush outlineSize must be a number above 0: 0"},
      {brush("<brushProperty name='outlineColor' value='#102030'/>"),
       "3: brush outlineColor must be #AARRGGBB: #102030"},
      {"<ink><trace>\n<annotation type='tool'>quill</annotation>0 0</trace></ink>", "2: unknown tool: quill"},
      {"<ink><definitions><traceGroup><annotation type='tool'>x</annotation></traceGroup></definitions>\n"
       "<traceGroup><traceGroup><annotation type='tool'>y</annotation></traceGroup>\n"
       "<annotation type='tool'>Quill</annotation><trace>0 0</trace></traceGroup></ink>",
       "3: unknown tool: quill"}};
  for (const auto& [text, wanted] : pages) {
    const std::string refusal = refusalOf(text);
    EXPECT_TRUE(refusal.starts_with("page.inkml:" + wanted)) << refusal << "\nof " << text.substr(0, 500);
    EXPECT_EQ(refusal.find('\n'), std::string::npos) << refusal;
  }
}

// "x0" refers to "x1" and so on; the last one to `end`.
std::string chain(const std::string& element, const std::string& reference, int count,
                  const std::string& end) {
  std::string all;
  for (int i = 0; i < count; ++i) {
    const std::string next = i + 1 < count ? "x" + std::to_string(i + 1) : end;
    all += "<" + element + " xml:id='x" + std::to_string(i) + "' " + reference + "='#" + next + "'/>";
  }
  return all;
}

// Each took half a minute and more when every trace looked at everything again.
TEST(InkmlReader, TakesNoLongerForATraceOfALargePage) {
  constexpr int kMany = 20000;
  const auto start = std::chrono::steady_clock::now();
  const auto lastWidth = [](const std::string& ink, const std::string& traces) {
    return read("<ink>" + ink + times(kMany, traces) + "</ink>").strokes.back().brush.width;
  };
  const std::string width = "<brushProperty name='width' value='7'/>";
  const std::string end = "<brush xml:id='end'>" + width + "</brush>";
  const std::string ofBrush = "<trace brushRef='#x0'>1 2</trace>",
                    inContext = "<trace contextRef='#x0'>1 2</trace>";
  EXPECT_EQ(
      lastWidth("<context xml:id='x0'>" + times(kMany, "<annotation/>") + end + "</context>", inContext),
      7.0f);
  EXPECT_EQ(lastWidth("<brush xml:id='x0'>" + times(kMany, width) + "</brush>", ofBrush), 7.0f);
  EXPECT_EQ(lastWidth(chain("brush", "brushRef", kMany, "end") + end, ofBrush), 7.0f);
  EXPECT_EQ(
      lastWidth(chain("context", "contextRef", kMany, "c") + "<context xml:id='c'>" + end + "</context>",
                inContext),
      7.0f);
  for (const auto& [element, trace] :
       {std::pair<std::string, std::string>("brush", ofBrush), {"context", inContext}})
    EXPECT_EQ(refusalOf("<ink>" + chain(element, element + "Ref", kMany, "x0") + trace + "</ink>"),
              "page.inkml:1: " + element + "Ref leads back to itself");
  EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(15));
}

// The most memory that a copy of this process holds while it reads a page, in bytes.
double peakOf(const std::string& text) {
  const std::string path = testing::TempDir() + "qelt-growth-" + std::to_string(getpid());
  std::ofstream(path, std::ios::binary) << text;
  malloc_trim(0);  // what others gave back does not count
  const pid_t child = fork();
  if (child == 0) _exit(readInkmlFile(path).strokes.empty() ? 1 : 0);
  int status = 0;
  rusage usage{};
  wait4(child, &status, 0, &usage);
  EXPECT_EQ(status, 0);
  std::remove(path.c_str());
  return static_cast<double>(usage.ru_maxrss) * 1024.0;
}

// How far reading a page takes the process beyond what a small one does, as a multiple of the text.
double growthOf(const std::string& text) {
  return (peakOf(text) - peakOf("<ink><trace>1 2</trace></ink>")) / static_cast<double>(text.size());
}

TEST(InkmlReader, HoldsNoMoreThanThreeTimesItsFile) {
  if (QELT_SANITIZED || *QELT_EMULATOR != '\0')
    GTEST_SKIP() << "sanitizers and emulators have a memory of their own";
  // Larger than what the allocator keeps ready.
  const std::string ink = times(2'000'000, "123.5 456,") + "7 8";
  std::vector<std::pair<std::string, std::string>> pages{
      {"a long trace", "<ink><trace>" + ink + "</trace></ink>"},
      {"a long trace in pieces", "<ink><trace><!-- -->" + ink + "<!-- --> </trace></ink>"},
      {"traces of 20 points",
       "<ink>" + times(100'000, "<trace>" + ink.substr(0, 200) + "7 8</trace>\n") + "</ink>"},
      {"traces of 1 point", "<ink>" + times(500'000, "<trace>1 2</trace>") + "</ink>"},
      {"ink sources",
       "<ink>" +
           times(100'000, "<inkSource><channelProperties>" + resolution("X", "9", "1/in") +
                              resolution("Y", "9", "1/in") + "</channelProperties></inkSource>") +
           "<trace>1 2</trace></ink>"},
      {"tools that are not drawn",
       "<ink><definitions>" +
           times(50'000, "<traceGroup><annotation type='tool'>x</annotation></traceGroup>") +
           "</definitions><trace>1 2</trace></ink>"}};
  for (const std::string element : {"brush", "context"}) {
    const std::string reference = element + "Ref";
    pages.emplace_back("plain " + element,
                       "<ink>" + times(1'000'000, "<" + element + "/>") + "<trace>1 2</trace></ink>");
    pages.emplace_back(element + " built on one another",
                       "<ink>" + chain(element, reference, 200'000, "end") + "<" + element +
                           " xml:id='end'/><trace " + reference + "='#x0'>1 2</trace></ink>");
  }
  for (const auto& [name, text] : pages) {
    const double growth = growthOf(text);
    // Both peaks are in whole pages of memory, so the text itself may seem a little smaller.
    EXPECT_GE(growth, 0.98) << name;
    EXPECT_LT(growth, 3.1) << name;
  }
}

TEST(InkmlReader, TakesATextForWhatItIsWhateverItCallsItself) {
  for (const std::string& start : {std::string("\n <?xml version='1.0' encoding='UTF-16'?>"),
                                   std::string("<?xml version='1.0' encoding='ISO-8859-1'?><!--\xE4-->"),
                                   std::string("<?xml version='1.0' encoding='windows-1252'?><!--\x80-->"),
                                   std::string("\xEF\xBB\xBF<!DOCTYPE ink SYSTEM 'ink.dtd'>")}) {
    EXPECT_EQ(read(start + "<ink><trace>1 2,3<!-- \n --> 4</trace></ink>").strokes.at(0).samples.size(), 2u);
    EXPECT_EQ(refusalOf(start + "<ink><trace>1 2,&quot;3<!-- \n --> x</trace></ink>").substr(11),
              std::to_string(start[0] == '\n' ? 3 : 2) + ": not a number: x");
  }
}

TEST(Samples, ComeOutBitForBit) {
  const std::vector<Sample> in{{.x = 1.0f, .y = -0.0f},
                               {.time = usualTime(1)},
                               {.orientation = NAN},
                               {.tilt = -0.0f, .time = 1e300},
                               {.pressure = 0.5f}};
  // Behind another trace, whose samples hold less.
  Strokes strokes;
  strokes.add({{}, {}});
  strokes.add(in);
  const Samples samples = strokes.back().samples;
  ASSERT_EQ(samples.size(), in.size());
  for (std::size_t i = 0; i < in.size(); ++i)
    // To the last bit. NOLINTNEXTLINE(bugprone-suspicious-memory-comparison)
    EXPECT_EQ(std::memcmp(valuesOf(in[i]).data(), valuesOf(samples[i]).data(), 6 * sizeof(double)), 0) << i;
}

}  // namespace
}  // namespace QeltDesktop
