// The program from the outside, as scripts see it.

#include <gtest/gtest.h>
#include <spng.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <map>
#include <memory>
#include <nlohmann/json.hpp>
#include <regex>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "pen/RenderingVersions.h"
#include "support/TestFolder.h"

namespace {

namespace fs = std::filesystem;
using Json = nlohmann::json;

// For which the numbers were worked out, and which predicts; the program draws in the newest one unless told.
const std::string kInVersion8 = " --rendering-version 8 ";

std::string contentsOf(const fs::path& path) {
  std::ifstream file(path, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(file), {});
}

struct Ran {
  int status;
  std::string out, err;
};

struct Rgba {
  std::uint32_t width = 0, height = 0;
  std::vector<std::uint8_t> bytes;

  const std::uint8_t* at(std::uint32_t x, std::uint32_t y) const { return &bytes[(y * width + x) * 4]; }
  // How many pixels between columns and rows, the latter not included, have a red below `red`.
  int darker(int red, std::uint32_t left, std::uint32_t top, std::uint32_t right,
             std::uint32_t bottom) const {
    int count = 0;
    for (std::uint32_t y = top; y < bottom; ++y) {
      for (std::uint32_t x = left; x < right; ++x) count += at(x, y)[0] < red ? 1 : 0;
    }
    return count;
  }
};

Rgba decoded(const fs::path& path) {
  const std::string png = contentsOf(path);
  const std::unique_ptr<spng_ctx, void (*)(spng_ctx*)> decoder(spng_ctx_new(0), &spng_ctx_free);
  spng_set_png_buffer(decoder.get(), png.data(), png.size());
  spng_ihdr header{};
  EXPECT_EQ(spng_get_ihdr(decoder.get(), &header), 0) << path;
  Rgba picture{header.width, header.height, {}};
  picture.bytes.resize(std::size_t{header.width} * header.height * 4);
  EXPECT_EQ(spng_decode_image(decoder.get(), picture.bytes.data(), picture.bytes.size(), SPNG_FMT_RGBA8, 0),
            0);
  return picture;
}

// Each field of `wanted` stands in the line.
void expectHas(const Json& line, const Json& wanted) {
  for (const auto& [key, value] : wanted.items()) EXPECT_EQ(line[key], value) << key;
}

// Runs the program in a folder of its own, which holds ink.inkml.
class Program : public QeltTests::InFolder {
 protected:
  Program() {
    // A slanted line of 11 points from (20.1, 20.1) to (70.1, 45.1), and a dot at (90.1, 30.1).
    std::string line;
    for (int i = 0; i <= 10; ++i)
      line += (i > 0 ? ", " : "") + std::to_string(20.1 + 5.0 * i) + " " + std::to_string(20.1 + 2.5 * i);
    write("ink.inkml",
          "<ink><brush><brushProperty name='width' value='5'/><brushProperty name='color' value='#203040'/>"
          "</brush><trace>" +
              line + "</trace><trace>90.1 30.1</trace></ink>");
  }

  // What a shell does in the folder; $sketch is the program. A GL driver may have something to say on
  // standard error too.
  Ran sh(const std::string& commands) const {
    // The GL driver leaves a few caches behind as it is unloaded; the threaded tests look for leaks.
    const std::string prepare = "export ASAN_OPTIONS=detect_leaks=0; sketch='" QELT_EMULATOR
                                " " QELT_SKETCH_PATH "'; cd '" +
                                folder().string() + "'; exec >stdout 2>stderr; ";
    write("script", prepare + commands);
    const int status = std::system(("sh '" + path("script").string() + "'").c_str());
    return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, contentsOf(path("stdout")),
            contentsOf(path("stderr"))};
  }
  Ran run(const std::string& arguments) const { return sh("$sketch " + arguments); }

  // The lines of a trace. It needs no GL, so no driver speaks.
  std::vector<Json> trace(const std::string& options, const std::string& ink = "ink.inkml") const {
    const Ran ran = run("trace " + ink + " -o - " + options);
    EXPECT_EQ(ran.status, 0) << options;
    EXPECT_EQ(ran.err, "");
    std::vector<Json> lines;
    std::istringstream stream(ran.out);
    for (std::string line; std::getline(stream, line);) lines.push_back(Json::parse(line));
    return lines;
  }

  Rgba draw(const std::string& arguments) const {
    const Ran ran = run(arguments + " -o drawn.png");
    EXPECT_EQ(ran.status, 0) << ran.err;
    EXPECT_EQ(ran.out, "");
    EXPECT_FALSE(holdsUnfinished());
    return decoded(path("drawn.png"));
  }

  bool holds(const std::string& name) const { return fs::exists(path(name)); }
  bool holdsUnfinished() const {
    return std::any_of(fs::directory_iterator(folder()), fs::directory_iterator(),
                       [](const auto& entry) { return entry.path().extension() == ".part"; });
  }
};

TEST_F(Program, TracesEveryLiveCall) {
  const std::vector<Json> lines = trace(kInVersion8);
  // down, moves of 4, 4 and 2, up; then down and up of the dot.
  const int actions[] = {0, 2, 2, 2, 1, 0, 1};
  ASSERT_EQ(lines.size(), 1 + std::size(actions));
  EXPECT_EQ(lines[0], Json::parse(R"({"kind":"header","renderingVersion":8,"size":5.0,"color":"#FF203040",
                                      "curve":true,"mode":"live","drawable":"stroke"})"));
  for (std::size_t i = 1; i < lines.size(); ++i) {
    expectHas(lines[i], {{"kind", "call"}, {"op", "Draw"}, {"result", true}, {"action", actions[i - 1]}});
    EXPECT_EQ(lines[i]["stroke"], i < 6 ? 0 : 1);
    EXPECT_EQ(lines[i]["buffers"].at(0)["cached"], false);
  }
  // A down event places no stamp, a tap places one: six vertices of eleven floats.
  EXPECT_EQ(lines[1]["buffers"][0]["data"].size(), 0u);
  EXPECT_GT(lines[2]["buffers"][0]["data"].size(), 66u);
  EXPECT_EQ(lines[7]["buffers"][0]["data"].size(), 66u);
  // A tap's rectangle is about its point: size / 4 for the stamp and the closing growth of 6 at least.
  EXPECT_NEAR(lines[7]["rect"][0].get<float>(), 90.1f - 6.25f, 2.0f);
  // The batch, the order to draw it, and its deletion close every call.
  const std::string posted = lines[2]["posted"].dump();
  EXPECT_TRUE(
      std::regex_match(posted, std::regex(R"(\[.*"Member1<[^"]*","PenGLRenderMsg","Delete<[^"]*"\])")))
      << posted;
}

// Straight segments place the same stamps however the samples reach the pen.
TEST_F(Program, HandsOverEverySampleInEveryMode) {
  // Ten points of X, Y and the channels named, after a dot; what has another name is not read.
  const auto stamps = [&](const std::vector<std::string>& channels, const std::string& options,
                          std::size_t calls) {
    std::string ink = "<ink><traceFormat><channel name='X'/><channel name='Y'/>";
    for (const std::string& name : channels) ink += "<channel name='" + name + "'/>";
    write("tilted.inkml",
          ink +
              "</traceFormat><trace>9 9 0.6 50 80</trace><trace>20 20 0.2 40 10, 25 22 0.3 50 20,"
              "30 25 0.4 60 30, 35 28 0.5 70 40, 40 30 0.8 50 50, 45 33 1 30 60, 50 35 0.2 20 -40,"
              "52 37 0.2 20 -40, 60 44 0.6 70 -90, 65 45 0.7 60 -90</trace></ink>");
    const std::vector<Json> lines = trace("--no-curve --size 5 " + options, "tilted.inkml");
    EXPECT_EQ(lines.size(), 1 + calls) << options;
    std::vector<float> all;
    for (std::size_t i = 1; i < lines.size(); ++i)
      for (const float value : lines[i]["buffers"][0]["data"]) all.push_back(value);
    return all;
  };
  const std::vector<std::string> every{"F", "OE", "OA"};
  const std::vector<float> recorded = stamps(every, "--mode event", 2);
  const std::pair<const char*, std::size_t> ways[] = {
      {"", 2 + 5},          {"--batch 1", 2 + 11},  {"--batch 3", 2 + 5},
      {"--batch 8", 2 + 4}, {"--points 99", 2 + 4}, {"--batch 1000", 2 + 3},
      {"--mode stroke", 2}};
  for (const auto& [options, calls] : ways) EXPECT_EQ(stamps(every, options, calls), recorded) << options;
  for (const std::vector<std::string>& fewer :
       std::vector<std::vector<std::string>>{{"F", "OE", "Z"}, {"F", "Z", "OA"}, {"Z", "OE", "OA"}})
    EXPECT_NE(stamps(fewer, "--mode event", 2), recorded) << fewer[0] << fewer[1] << fewer[2];
  // The pen takes a stylus on the touch screen and a mouse for coarse.
  const std::vector<float> coarse = stamps(every, "--tool mouse", 2 + 5);
  EXPECT_NE(coarse, recorded);
  EXPECT_EQ(stamps(every, "--source 4098", 2 + 5), coarse);
  EXPECT_LT(stamps(every, "--points 3", 2 + 2).size(), recorded.size());
}

TEST_F(Program, TracesWhatTheOptionsChange) {
  const std::vector<Json> recorded = trace("--mode event --color '#80FFFFFF' --no-curve --size -3");
  expectHas(recorded[0], {{"curve", false}, {"mode", "event"}, {"color", "#80FFFFFF"}, {"size", -3.0f}});
  EXPECT_EQ(recorded[1]["op"], "RedrawPen");
  EXPECT_EQ(trace("--size nan")[0]["size"], "NaN");
  // Half the inverse scale reaches version 8's vertices.
  EXPECT_NE(trace(kInVersion8 + "--zoom 2")[2]["buffers"], trace(kInVersion8)[2]["buffers"]);
}

TEST_F(Program, GoesByTheListOfVersions) {
  const auto expectStride = [&](const std::string& version, int stride) {
    const Json first = trace("--mode event --rendering-version " + version)[1]["buffers"][0];
    EXPECT_EQ(first["stride"], stride) << version;
    EXPECT_EQ(first["data"].size() % static_cast<std::size_t>(6 * stride), 0u) << version;
    // Where the second vertex begins stands a place of the first stamp.
    EXPECT_NEAR(first["data"][static_cast<std::size_t>(stride)].get<float>(), 20.0f, 10.0f) << version;
  };
  for (const Qelt::RenderingVersion& version : Qelt::kRenderingVersions) {
    const std::string number = std::to_string(version.number);
    expectStride(number, version.floatsPerVertex);
    const Ran predicted =
        run("trace ink.inkml -o - --drawable prediction --predict 3 --rendering-version " + number);
    EXPECT_EQ(
        predicted.err,
        version.predicts ? "" : "the pen has no prediction drawable in rendering version " + number + "\n");
  }
  // All others are drawn like the first.
  for (const char* const other : {"-3", "99"})
    expectStride(other, Qelt::kRenderingVersions[0].floatsPerVertex);
}

TEST_F(Program, InformsAboutThePlugIn) {
  const std::string plugin = contentsOf(QELT_PLUGIN_PATH);
  std::string table(8, '\0');
  for (const Qelt::RenderingVersion& version : Qelt::kRenderingVersions) {
    for (const std::int32_t number : {version.strokeVersion, version.outlineVersion})
      table.append(reinterpret_cast<const char*>(&number), sizeof number);
  }
  const std::size_t found = plugin.find(table);
  ASSERT_NE(found, std::string::npos);
  const Ran ran = run("info");
  ASSERT_EQ(ran.status, 0) << ran.err;
  for (const char* part :
       {"libQeltPencil2.so", "OpenGL ES 3", "0.477", "6.571", "  7               7                4\n"})
    EXPECT_NE(ran.out.find(part), std::string::npos) << part << " in\n" << ran.out;
  EXPECT_EQ(ran.out.find("another age"), std::string::npos) << ran.out;

  std::string older = plugin;
  older[found + 8 * 5] = 3;
  write("older.so", older);
  EXPECT_TRUE(
      run("info --plugin older.so")
          .out.ends_with(
              "rendering version 5 has stroke version 5 and outline version 5 in this program's list\n"));
}

TEST_F(Program, DrawsInkWhereTheInkIs) {
  const Rgba picture = draw("draw ink.inkml --page 120x60 --background '#FFEEDD'");
  ASSERT_EQ(picture.width * 1000 + picture.height, 120'060u);
  EXPECT_GT(picture.darker(255, 11, 11, 100, 55), 100);
  EXPECT_EQ(picture.darker(255, 11, 11, 100, 55), picture.darker(255, 0, 0, 120, 60));
  EXPECT_EQ(std::vector<int>(picture.at(0, 0), picture.at(0, 0) + 4),
            (std::vector<int>{0xFF, 0xEE, 0xDD, 0xFF}));

  const Rgba turned = draw("draw ink.inkml --zoom 0.5 --rotate 90 --background transparent");
  // (25 + 2 * 26) / 2 and (70 + 2 * 26) / 2, rounded up.
  EXPECT_EQ(turned.width * 1000 + turned.height, 39'061u);
  EXPECT_EQ(turned.at(0, 0)[3], 0);
  // Clockwise: the dot, (70 + 26) / 2 from the left and (10 + 26) / 2 from the top, goes to the bottom.
  EXPECT_GT(turned.at(39 - 18, 48)[3], 0);
  EXPECT_EQ(turned.at(18, 61 - 48)[3], 0);
  // (120 + 60) / sqrt(2) each way, rounded up.
  const Rgba slanted = draw("draw ink.inkml --page 120x60 --rotate -45");
  EXPECT_EQ(slanted.width * 1000 + slanted.height, 128'128u);
  // Half of 90.1 - 60 and of 30.1 - 30, turned: 30.1 / sqrt(2) to the right of the centre and as far above
  // it.
  EXPECT_GT(slanted.darker(255, 83, 40, 87, 45), 0);
  EXPECT_EQ(draw("draw ink.inkml --mode stroke").bytes,
            draw("draw ink.inkml --mode stroke --repeat 2").bytes);
}

TEST_F(Program, DrawsAPageAsLargeAsItFits) {
  const auto sizeOf = [this](const std::string& options) {
    const Rgba picture = draw("draw " + options);
    return std::to_string(picture.width) + 'x' + std::to_string(picture.height);
  };
  EXPECT_EQ(draw("draw ink.inkml --page 120x60 --fit 240x900").bytes,
            draw("draw ink.inkml --page 120x60 --zoom 2").bytes);
  EXPECT_EQ(sizeOf("ink.inkml --page 120x60 --fit 900x15"), "30x15");
  EXPECT_EQ(sizeOf("ink.inkml --page 120x60 --rotate 90 --fit 240x60"), "30x60");
  // The page of 70 x 25 with margins of 26 all around; a third of a pixel is a row.
  EXPECT_EQ(sizeOf("ink.inkml --fit 183x183"), "183x116");
  EXPECT_EQ(trace("--page 120x60 --fit 240x900"), trace("--page 120x60 --zoom 2"));
  // In a picture it stands in place of the zoom, and the other way round.
  EXPECT_EQ(sizeOf("ink.inkml --page 120x60 --fit 30x30"), "30x15");
  sh("cp drawn.png fitted.png");
  EXPECT_EQ(sizeOf("fitted.png"), "30x15");
  EXPECT_EQ(sizeOf("fitted.png --zoom 2"), "240x120");
  EXPECT_EQ(sizeOf("fitted.png --fit 60x60"), "60x30");
  EXPECT_EQ(sh("$sketch draw ink.inkml --zoom 2 -o zoomed.png").status, 0);
  EXPECT_EQ(sizeOf("zoomed.png --fit 61x9999"), "61x39");
  // A cell as for the picture, in two columns under labels.
  const Rgba sheet = draw("sheet ink.inkml --size 5 --fit 61x999");
  EXPECT_EQ(sheet.width, 2u * (61 + 16) + 16);
}

// As data sets have them: no format, and lengths in shares of a page, here the strokes of an F.
TEST_F(Program, DrawsInkBelowOneUnitAsLargeAsItIsAskedFor) {
  write("small.inkml",
        "<ink><trace>0.1 0.1, 0.1 0.3, 0.1 0.5, 0.1 0.7, 0.1 0.9</trace>"
        "<trace>0.1 0.1, 0.3 0.1, 0.5 0.1</trace><trace>0.1 0.4, 0.25 0.4, 0.4 0.4</trace></ink>");
  for (const std::string command : {"draw small.inkml --fit 300x200", "draw carried.png"}) {
    const Rgba picture = draw(command);
    sh("cp drawn.png carried.png");
    // 0.8 high within margins of 17 for the size of the pen's own, and 0.4 wide: 83 + 2 * 17.
    ASSERT_EQ(picture.height, 200u);
    EXPECT_NEAR(picture.width, 117, 1);
    const auto ink = [&](std::uint32_t left, std::uint32_t top, std::uint32_t right, std::uint32_t bottom) {
      return picture.darker(255, left, top, right, bottom) > 0;
    };
    EXPECT_TRUE(ink(15, 100, 20, 183) && ink(90, 15, 101, 20) && ink(70, 75, 81, 83));
    EXPECT_FALSE(ink(22, 84, 117, 200) || ink(22, 20, 117, 74));
    EXPECT_FALSE(ink(0, 0, 117, 14) || ink(0, 0, 14, 200) || ink(0, 186, 117, 200));
  }
  // Ten times as wide as it is high, with the page that was asked for.
  EXPECT_EQ(draw("draw small.inkml --page 2x0.2 --fit 300x200").height, 30u);
  // Without a size asked for they are stroke units, as everywhere.
  EXPECT_EQ(draw("draw small.inkml").width, 35u);
}

// An inch each way, in steps of a digitizer, with a brush of a millimetre.
TEST_F(Program, DrawsInkInItsNaturalSize) {
  write("digitized.inkml",
        R"(<w:ink xmlns:w="http://www.w3.org/2003/InkML"><w:definitions><w:context xml:id="c"><w:inkSource>
        <w:traceFormat><w:channel name="X" units="cm"/><w:channel name="Y" units="cm"/><w:channel name="F" max="1023"/>
        </w:traceFormat><w:channelProperties><w:channelProperty channel="X" name="resolution" value="1000" units="1/cm"/>
        <w:channelProperty channel="Y" name="resolution" value="1000" units="1/cm"/></w:channelProperties></w:inkSource>
        </w:context><w:brush xml:id="b"><w:brushProperty name="width" value="1" units="mm"/>
        <w:brushProperty name="ignorePressure" value="true"/></w:brush></w:definitions>
        <w:trace contextRef="#c" brushRef="#b">5000 5000 9, 6270 6270 9, 7540 7540 9</w:trace></w:ink>)");
  EXPECT_NEAR(trace("", "digitized.inkml")[0]["size"].get<float>(), 96 / 25.4, 1e-6);
  // 96 and margins of 16 + 2 * 3.78 on both sides.
  const Rgba picture = draw("draw digitized.inkml");
  EXPECT_EQ(picture.width * 1000 + picture.height, 144'144u);
  EXPECT_GT(picture.darker(100, 60, 60, 84, 84), 20);
}

TEST_F(Program, TracesOutlinesPreviewsAndPredictions) {
  const std::vector<Json> outlines = trace("--drawable outline --outline 3,#FF00FF00");
  ASSERT_EQ(outlines.size(), 3u);
  expectHas(outlines[1], {{"op", "DrawOutline"}});
  const Json& quads = outlines[1]["buffers"];
  ASSERT_EQ(quads.size(), 2u);
  EXPECT_EQ(quads[1]["stride"], Qelt::kOutlineFloatsPerVertex);
  // The outer quads are the enlarged ones: their first corner lies further out.
  EXPECT_LT(quads[1]["data"][0], quads[0]["data"][0]);
  EXPECT_EQ(trace("--drawable outline --mode stroke")[1]["action"], nullptr);

  const std::vector<Json> previews = trace("--drawable preview --mode event");
  ASSERT_EQ(previews.size(), 3u);
  expectHas(previews[1], {{"op", "RedrawPen"}});
  EXPECT_EQ(previews[1]["buffers"][0]["stride"], Qelt::kPreviewFloatsPerVertex);
  EXPECT_EQ(trace("--drawable preview").size(), 1u + 5u + 2u);

  // One prediction a move event, from where the live stroke is, in steps of (5, 2.5).
  const std::vector<Json> predictions = trace(kInVersion8 + "--drawable prediction --predict 3");
  ASSERT_EQ(predictions.size(), 1u + 3u);
  expectHas(predictions[2], {{"op", "Draw"}, {"action", 2}, {"result", true}});
  EXPECT_GT(predictions[2]["buffers"][0]["data"].size(), 66u);
  EXPECT_NEAR(predictions[1]["rect"][2].get<float>(), 55.1f, 4.0f);  // 40 + 3 * 5
  EXPECT_NEAR(predictions[3]["rect"][2].get<float>(), 85.1f, 4.0f);  // 70 + 3 * 5
  EXPECT_NEAR(predictions[3]["rect"][3].get<float>(), 52.6f, 4.0f);  // 45 + 3 * 2.5
}

TEST_F(Program, LaysOutlinesUnderAndPredictionsOverTheStrokes) {
  write("line.inkml",
        "<ink><brush><brushProperty name='width' value='6'/></brush>"
        "<trace>10.3 20.3,20.3 20.3,30.3 20.3,40.3 20.3,50.3 20.3,60.3 20.3</trace></ink>");
  const auto drawLine = [&](const std::string& options) {
    return draw("draw line.inkml --page 120x40" + kInVersion8 + options);
  };
  const Rgba plain = drawLine("");
  EXPECT_EQ(plain.darker(255, 70, 0, 120, 40), 0);
  EXPECT_GT(plain.darker(100, 30, 0, 40, 40), 0);

  // The stroke stays dark over its outline; the outline reaches further, in its own colour.
  const Rgba outlined = drawLine("--outline 6,#FFFF0000");
  EXPECT_GT(outlined.darker(120, 30, 0, 40, 40), 0);
  const std::uint8_t* const rim = outlined.at(35, 26);
  EXPECT_EQ(rim[0], 255);
  EXPECT_LT(rim[1], 100);
  EXPECT_EQ(plain.at(35, 26)[1], 255);

  // Predicted ink is there while the pen is down, and gone once it is lifted.
  EXPECT_GT(drawLine("--predict 3 --opacity 1 --points 6").darker(255, 70, 0, 120, 40), 0);
  EXPECT_EQ(drawLine("--predict 3 --opacity 0 --points 6").darker(255, 70, 0, 120, 40), 0);
  EXPECT_EQ(drawLine("--predict 3 --opacity 1").bytes, plain.bytes);
}

// The page's tiles meet at column 512. A prediction beside it, whose stamps hang 2 pixels over it, looks as
// it does 200 pixels to the left.
TEST_F(Program, DrawsPredictionsWholeAcrossTheBordersOfTiles) {
  const auto drawAt = [this](const std::string& x) {
    std::string line;
    for (const char* const y : {"10.3,", "20.3,", "30.3,", "40.3,", "50.3,", "60.3"}) line += x + " " + y;
    write("line.inkml",
          "<ink><brush><brushProperty name='width' value='20'/></brush><trace>" + line + "</trace></ink>");
    return draw("draw line.inkml --page 640x120 --predict 3 --opacity 1 --points 6" + kInVersion8);
  };
  const Rgba beside = drawAt("504.3"), apart = drawAt("304.3");
  int differing = 0;
  for (std::uint32_t y = 66; y < 86; ++y) {  // the live stroke ends above
    for (std::uint32_t x = 312; x < 316; ++x)
      differing += std::abs(beside.at(x + 200, y)[0] - apart.at(x, y)[0]) > 8 ? 1 : 0;
  }
  EXPECT_GT(apart.darker(255, 312, 66, 316, 86), 20);
  EXPECT_LE(differing, 2);
}

// Seconds of each stage and MiB of memory, by what a run with --timings tells last on standard error.
TEST_F(Program, TellsWhereTimeWentAndTakesNoMoreMemoryForMoreWork) {
  const auto told = [&](const std::string& arguments) {
    const Ran ran = run("draw -o drawn.png --timings " + arguments);
    EXPECT_EQ(ran.status, 0) << ran.err;
    std::map<std::string, double> figures;
    std::string order;
    const std::regex form("(\\w+) +(\\d+\\.\\d+) (s|MiB)\n");
    for (std::sregex_iterator line(ran.err.begin(), ran.err.end(), form), none; line != none; ++line) {
      order += (*line)[1].str() + ' ';
      figures[(*line)[1]] = std::stod((*line)[2]);
    }
    EXPECT_EQ(order, "read geometry GL compose encode whole memory ");
    const double stages =
        figures["read"] + figures["geometry"] + figures["GL"] + figures["compose"] + figures["encode"];
    EXPECT_LE(stages, figures["whole"] + 0.005);
    EXPECT_GT(stages, figures["whole"] / 2);
    return figures["memory"];
  };
  EXPECT_EQ(run("draw ink.inkml -o drawn.png").err.find("whole"), std::string::npos);
  const double small = told("ink.inkml --page 120x60");
  // Sanitizers keep what is freed, and an emulator what it translates.
  if (QELT_SANITIZED || !std::string(QELT_EMULATOR).empty()) return;
  // MiB: a layer, and what bands, rows and threads take besides. The driver's own share is in all of them.
  constexpr double kLayer = 2048.0 * 2048 * 4 / (1 << 20), kBesides = 8;
  const std::string large = "ink.inkml --page 2048x2048 ";
  EXPECT_GT(told(large), small + kLayer);
  EXPECT_LT(told(large + "--predict 3"), small + kLayer + kBesides);
  // One layer, however many there are.
  for (const std::string layered :
       {"--outline 2,#FF00FF00 --repeat 2", "--outline 9,#80FF0000 --predict 3 --points 4"})
    EXPECT_LT(told(large + layered), told("ink.inkml --page 120x60 " + layered) + kLayer + kBesides)
        << layered;

  // 24 MB of vertices a pass.
  std::string strokes;
  for (int i = 0; i < 90; i += 3) {
    const auto point = [](int x, int y) { return std::to_string(x) + ' ' + std::to_string(y); };
    strokes += "<trace>" + point(0, i) + ',' + point(600, i + 1) + ',' + point(0, i + 2) + "</trace>";
  }
  write("strokes.inkml", "<ink>" + strokes + "</ink>");
  for (const std::string mode : {"live", "stroke"}) {
    const double once = told("strokes.inkml --size 3 --mode " + mode);
    EXPECT_LT(once, small + 3 * kBesides) << mode;
    EXPECT_LT(told("strokes.inkml --size 3 --repeat 4 --mode " + mode), once + kBesides + 4) << mode;
  }
}

// Strokes of one shape under one another; each may have settings of its own.
std::string threeStrokes(const std::string& first, const std::string& second, const std::string& third) {
  std::string page = "<ink>";
  for (const std::string& settings : {first, second, third}) {
    page += "<brush><brushProperty name='width' value='5'/>" + settings + "</brush><trace>";
    for (const char* const point : {"20 0.7", "40 15.1", "60 0.2", "80 18.4", "100 2.9"})
      page += (page.back() == '>' ? "" : ",") + std::string(point);
    page += "</trace>";
  }
  return page + "</ink>";
}

std::string setting(const std::string& name, const std::string& value) {
  return "<brushProperty name='" + name + "' value='" + value + "'/>";
}

TEST_F(Program, DrawsEachStrokeWithItsOwnSettingsUnlessAskedOtherwise) {
  const std::string size = setting("outlineSize", "3"), color = setting("outlineColor", "#FF00FF00");
  write("plain.inkml", threeStrokes("", "", ""));
  write("own.inkml", threeStrokes(setting("renderingVersion", "3"), setting("curve", "false"), size + color));
  write("kinds.inkml", threeStrokes(setting("renderingVersion", "3"), setting("curve", "false"), ""));
  // The calls of one stroke.
  const auto calls = [&](const std::string& ink, const std::string& options, int stroke) {
    std::string found;
    for (const Json& line : trace(options, ink))
      if (line["kind"] == "call" && line["stroke"] == stroke) found += line.dump();
    return found;
  };
  for (const std::string mode : {"--mode live", "--mode event", "--mode stroke --repeat 2"}) {
    const std::string ownWay[] = {" --rendering-version 3", " --no-curve", ""};
    for (int stroke = 0; stroke < 3; ++stroke)
      EXPECT_EQ(calls("own.inkml", mode, stroke), calls("plain.inkml", mode + ownWay[stroke], stroke))
          << mode;
    const std::string asked = mode + " --rendering-version 5";
    for (int stroke = 0; stroke < 3; ++stroke)
      EXPECT_EQ(calls("own.inkml", asked + " --curve", stroke), calls("plain.inkml", asked, stroke)) << mode;
    const std::string outlines = mode + " --drawable outline", green = " --outline 3,#FF00FF00";
    EXPECT_EQ(calls("own.inkml", outlines, 2), calls("kinds.inkml", outlines + green, 2));
    EXPECT_EQ(calls("own.inkml", outlines, 0), calls("plain.inkml", outlines + " --rendering-version 3", 0));
  }
  expectHas(trace("", "own.inkml")[0], {{"renderingVersion", 3}, {"curve", true}});

  write("outlined.inkml", threeStrokes(size + color, size + color, size + color));
  EXPECT_EQ(draw("draw outlined.inkml").bytes, draw("draw plain.inkml --outline 3,#FF00FF00").bytes);
  write("last.inkml", threeStrokes("", "", size + color));
  const Rgba last = draw("draw last.inkml"), none = draw("draw plain.inkml");
  EXPECT_NE(last.bytes, draw("draw outlined.inkml").bytes);
  EXPECT_NE(last.bytes, none.bytes);
}

TEST_F(Program, DrawsAPictureAgainFromNothingElse) {
  write("own.inkml", threeStrokes(setting("renderingVersion", "3"), setting("curve", "false"),
                                  setting("outlineSize", "4") + "<annotation/>"));
  sh("iconv -f UTF-8 -t UTF-16 own.inkml >own16.inkml");
  for (const std::string options :
       {"ink.inkml", "own.inkml --zoom 1.7 --rotate 33 --background transparent", "own16.inkml --mode stroke",
        "ink.inkml --page 90x60.5 --predict 3 --points 1 --no-curve --tool finger --size 9",
        "ink.inkml --mode event --outline 2,#8000FF00 --rendering-version 2 --color '#30405060'"}) {
    const Rgba drawn = draw("draw " + options);
    EXPECT_EQ(
        sh("cp drawn.png a.png; cp a.png named.inkml; $sketch draw named.inkml -o b.png && cmp a.png b.png; "
           "$sketch trace " +
           options + " -o a.jsonl; $sketch trace a.png -o b.jsonl && cmp a.jsonl b.jsonl")
            .out,
        "")
        << options;
    EXPECT_EQ(draw("draw " + options + " --no-ink").bytes, drawn.bytes) << options;
    EXPECT_EQ(contentsOf(path("drawn.png")).find("iTXt"), std::string::npos) << options;
  }
  draw("draw ink.inkml --predict 3 --background '#102030'");
  EXPECT_EQ(sh("$sketch trace drawn.png -o a.jsonl --drawable prediction && wc -l <a.jsonl").out, "4\n");
  EXPECT_EQ(sh("$sketch sheet drawn.png -o a.png; $sketch sheet ink.inkml -o b.png; cmp a.png b.png").out,
            "");
  EXPECT_EQ(run("draw drawn.png -o drawn.png").status, 1);
}

TEST_F(Program, DrawsThePreviewAndTheSheet) {
  const Rgba preview = draw("preview --size 6 --color '#FF0000FF'");
  // The stroke runs across most of the panel, several pixels wide.
  EXPECT_GT(preview.darker(128, 0, 0, preview.width, preview.height), 480);

  // Cells in two columns, each the page of 70 x 25 and its margins of 24 on every side, under a label.
  const Rgba sheet = draw("sheet ink.inkml --size 4");
  EXPECT_EQ(sheet.width, 2u * (118 + 16) + 16);
  EXPECT_EQ(sheet.height, (Qelt::kRenderingVersions.size() + 1) / 2 * (73 + 14 + 16) + 16);
  for (std::uint32_t cell = 0; cell < Qelt::kRenderingVersions.size(); ++cell) {
    const std::uint32_t left = 16 + cell % 2 * 134, top = 16 + cell / 2 * 103;
    EXPECT_GT(sheet.darker(200, left, top, left + 118, top + 14), 100) << cell;           // label
    EXPECT_GT(sheet.darker(200, left, top + 22, left + 118, top + 22 + 73), 20) << cell;  // ink
  }
}

TEST_F(Program, SaysWhatCannotBeDoneInOneLineAndLeavesAnOlderFileAlone) {
  write("older.png", "older");
  write("unsound.png", "\x89PNG\r\n\x1A\n");
  write("bad.inkml", "<ink>\n<trace>1 2, 3 four</trace>\n</ink>");
  write("vast.inkml", "<ink><trace>-3e38 0, 3e38 0</trace></ink>");
  const std::string vast =
      "vast.inkml: the page is too large to draw at any zoom: its points lie too far apart\n";
  const std::pair<std::string, std::string> cases[] = {
      {"draw bad.inkml -o no.png", "bad.inkml:2: not a number: four\n"},
      {"trace bad.inkml -o no.png", "bad.inkml:2: not a number: four\n"},
      {"sheet bad.inkml -o no.png", "bad.inkml:2: not a number: four\n"},
      {"draw ink.inkml --zoom 1e6 -o older.png", "ink.inkml: the picture is too large to draw: "},
      {"draw ink.inkml --page 2e4x2e4 --zoom 1 -o older.png", "--page: the picture is too large to draw: "},
      {"draw ink.inkml --zoom 1e4 -o older.png", "67108864 in all; --fit WxH draws it smaller\n"},
      {"draw ink.inkml --fit 40000x9000 -o older.png", "--fit: the picture is too large to draw: "},
      {"sheet ink.inkml --fit 9000x9000 -o older.png", "--fit: the sheet is too large to draw: "},
      {"draw vast.inkml -o older.png", vast},
      {"draw vast.inkml --fit 100x100 -o older.png", vast},
      {"sheet vast.inkml -o older.png", vast},
      {"draw ink.inkml --page 40000x1 -o older.png",
       "--page: the picture is too large to draw: 40000 x 1 pixels, at most 32767 a side and 67108864 in "
       "all\n"},
      {"draw unsound.png -o no.png", "unsound.png: not a sound PNG picture: end of stream\n"},
      {"draw none.inkml -o no.png", "none.inkml: cannot be read: "},
      {"draw ink.inkml -o no/folder/a.png", "no/folder/a.png: cannot be written: "},
      {"draw ink.inkml -o .", "Is a directory\n"},
      {"trace ink.inkml -o ink.inkml", "it is the page to read\n"},
      {"draw ink.inkml -o /dev/full", "No space left on device\n"},
      {"trace ink.inkml -o /dev/full", "No space left on device\n"},
      {"--help >/dev/full", "standard output cannot be written: No space left on device\n"},
      {"info >/dev/full", "standard output cannot be written: No space left on device\n"},
      {"info --plugin ink.inkml", "cannot load the pen plug-in: "},
      {"trace ink.inkml -o no.png --plugin '" QELT_THROWING_PLUGIN "'",
       "qelt-sketch: stopped by an exception of unknown type\n"},
      {"trace \"$(printf 'a\\033[31m\\n\\302\\233\\377\\303\\274b')\" -o no.png",
       "a\\x1B[31m\\n\\xC2\\x9B\\xFF\u00fcb: cannot be read: No such file or directory\n"}};
  for (const auto& [arguments, why] : cases) {
    const Ran ran = run(arguments);
    EXPECT_EQ(ran.status, 1) << arguments;
    const std::size_t said = ran.err.find(why);
    ASSERT_NE(said, std::string::npos) << arguments << "\n" << ran.err;
    EXPECT_EQ(ran.err.find('\n', said), ran.err.size() - 1) << arguments << "\n" << ran.err;
    EXPECT_EQ(ran.out, "");
  }
  EXPECT_EQ(run("trace ink.inkml -o -").status, 0);
  EXPECT_EQ(contentsOf(path("older.png")), "older");
  EXPECT_TRUE(fs::exists("/dev/full"));
  EXPECT_FALSE(holds("no.png") || holdsUnfinished());
}

// As on a terminal, which `script` is to the program.
TEST_F(Program, TellsOnATerminalHowFarItIsBesideWhatItFinds) {
  const auto shown = [this](const std::string& arguments) {
    const Ran ran = sh("script -qec \"$sketch " + arguments + "\" /dev/null");
    EXPECT_NE(ran.out.find(" a second, "), std::string::npos) << ran.out;
    return ran.out;
  };
  // A second's work each, so that the progress is seen.
  write("short.inkml", "<ink><trace>1 1, 5 5</trace></ink>");
  sh("mkdir before after; $sketch draw ink.inkml --page 2000x2000 -o before/0.png; "
     "$sketch draw ink.inkml --page 2000x2000 --color '#FF0000FF' -o after/0.png; "
     "for i in 1 2 3 4 5 6 7 8 9; do for to in before after; do ln $to/0.png $to/$i.png; done; done; "
     "ln before/0.png before/a.png; ln before/0.png before/b.png; echo none >after/b.png");
  std::istringstream lines(shown("compare before after"));
  int told = 0;
  for (std::string line; std::getline(lines, line); ++told) {
    const std::size_t begin = line.substr(0, line.size() - 1).rfind('\r');  // lines end in "\r\n"
    EXPECT_TRUE(begin == std::string::npos || line.compare(begin, 4, "\r\033[K") == 0) << line;
  }
  EXPECT_EQ(told, 13);
  EXPECT_EQ(shown("trace short.inkml --mode stroke --repeat 40000 -o /dev/null").find("e+"),
            std::string::npos);
}

// What is to be written over is kept, refused or followed, whole.
TEST_F(Program, RespectsWhatStandsWhereItWrites) {
  const struct {
    std::string prepare, output, wanted;  // shell; wanted: what stays true
    int status;
    std::string says;
  } cases[] = {
      {"echo old >a; chmod 600 a", "a", "test $(stat -c %a a) = 600", 0, ""},
      {"umask 027", "b", "test $(stat -c %a b) = 640", 0, ""},
      {"echo old >c; chmod 400 c", "c", "test $(stat -c %a-%s c) = 400-4", 1, "Permission denied"},
      {"echo old >d; ln d d2", "d", "cmp d d2 && test $(cat d) = old", 1, "(a hard link)"},
      {"ln -s e2 e", "e", "test -L e && test -s e2", 0, ""},
      {"mkdir f; ln -s ../g2 f/g; ln -s f/g g", "g", "test -L g && test -L f/g && test -s g2", 0, ""},
      {"ln -s h h", "h", "test -L h", 1, "symbolic links"},
      {":", "$(printf '%0255d' 1)", "rm $(printf '%0255d' 1)", 0, ""},
      {"echo old >i; exec 3>>i", "/dev/fd/3", "test \"$(head -n 1 i)\" = old && test $(wc -l <i) -gt 2", 0,
       ""},
      {"echo old; exec 4>&1", "/dev/stdout", "test \"$(head -n 1 stdout)\" = old", 0, ""},
      {"mkfifo j; cat j >j2 & :", "j", "wait; test -s j2", 0, ""},
      {"ulimit -f 1", "k", "! test -e k", 1, "File too large"},
      {"exec 2>l; exec >&-", "-", "grep -q 'cannot be written' l", 1, ""},
      {"mkdir m; chmod 1777 m; echo old >m2; ln -s ../m2 m/m; chown -h 1234 m/m 2>/dev/null || exec false",
       "m/m", "test $(cat m2) = old", 1, geteuid() == 0 ? "another user put a link there" : ""}};
  for (const auto& [prepare, output, wanted, status, says] : cases) {
    const Ran ran = sh(prepare + "; $sketch trace ink.inkml --repeat 20 -o " + output + "; status=$?; " +
                       wanted + " || exit 99; exit $status");
    EXPECT_EQ(ran.status, status) << output << "\n" << ran.err;
    EXPECT_NE(ran.err.find(says), std::string::npos) << output << "\n" << ran.err;
    EXPECT_FALSE(holdsUnfinished()) << output;
  }
}

// A run that is ended while its file is unfinished.
TEST_F(Program, LeavesNoUnfinishedFileToTheNextRun) {
  const auto end = [&](const std::string& before, const std::string& signal, int repeat) {
    return sh("(" + before + "; exec $sketch trace ink.inkml -o big --repeat " + std::to_string(repeat) +
              ") & pid=$!; until ls -l /proc/$pid/fd | grep -q '\\.part$' || ! kill -0 $pid; do :; done; "
              "readlink /proc/$pid/fd/2; kill -" +
              signal + " $pid; wait $pid");
  };
  constexpr int kEndless = 10'000'000;
  for (const int signal : {SIGHUP, SIGTERM, SIGXCPU}) {
    EXPECT_EQ(end(":", std::to_string(signal), kEndless).status, 128 + signal);
    EXPECT_FALSE(holds("big") || holdsUnfinished()) << signal;
  }
  EXPECT_EQ(end(":", "KILL", kEndless).status, 128 + SIGKILL);
  EXPECT_TRUE(holdsUnfinished());
  // It is ignored where it was, and what is opened for writing is not taken for standard error.
  const Ran ignored = end("trap '' HUP; exec 2>&-", "HUP", 4000);
  EXPECT_EQ(ignored.status, 0) << ignored.err;
  EXPECT_EQ(ignored.out, "/dev/null\n");
  EXPECT_TRUE(holds("big"));
  EXPECT_FALSE(holdsUnfinished());
}

TEST_F(Program, FindsPlugInsInItsFolderAndItsLibrariesFromWhereItStands) {
  const Ran ran = sh("cp '" QELT_PLUGIN_PATH "' local.so; $sketch info --plugin local.so");
  EXPECT_NE(ran.out.find("./local.so"), std::string::npos) << ran.err;
  EXPECT_NE(contentsOf(QELT_SKETCH_PATH).find("$ORIGIN/../../host/desktop"), std::string::npos);
  EXPECT_NE(contentsOf(QELT_PLUGIN_PATH).find("$ORIGIN/../host/desktop"), std::string::npos);
}

TEST_F(Program, ReadsStandardInput) {
  write("bad.inkml", "<ink>\n<trace>1 2, 3 four</trace>\n</ink>");
  write("-", "no ink");
  draw("draw ink.inkml --predict 3");
  const struct {
    std::string commands, out, err;
    int status;
  } cases[] = {
      {"$sketch draw - -o a.png <ink.inkml; $sketch draw ink.inkml -o b.png; cmp a.png b.png", "", "", 0},
      {"cat drawn.png | $sketch draw - -o a.png && cmp a.png drawn.png", "", "", 0},
      {"cat ink.inkml | $sketch trace - -o a; $sketch trace ink.inkml -o b; cmp a b", "", "", 0},
      {"$sketch sheet - -o a.png <ink.inkml; $sketch sheet ink.inkml -o b.png; cmp a.png b.png", "", "", 0},
      {"$sketch trace - -o no <bad.inkml", "", "standard input:2: not a number: four\n", 1},
      {"$sketch trace - -o no <&-", "", "standard input: cannot be read: Bad file descriptor\n", 1},
      {"$sketch trace - -o no <.", "", "standard input: cannot be read: Is a directory\n", 1},
      {"$sketch trace ./- -o no", "", "./-:1: not XML: syntax error\n", 1},
      {"$sketch trace - -o bad.inkml <bad.inkml", "", "standard input:2: not a number: four\n", 1},
      {"$sketch trace - -o ink.inkml <ink.inkml", "",
       "ink.inkml: cannot be written: it is the page to read\n", 1},
      // What the command line leaves out may stand in the picture.
      {"$sketch trace - -o - --drawable prediction <drawn.png | wc -l", "4\n", "", 0},
      {"$sketch trace - -o no --drawable prediction <ink.inkml", "",
       "--drawable prediction: needs --mode live and --predict K\nRun with --help for more information.\n",
       2}};
  for (const auto& [commands, out, err, status] : cases) {
    const Ran ran = sh(commands);
    EXPECT_EQ(ran.status, status) << commands;
    EXPECT_EQ(ran.out, out) << commands;
    // A driver may speak where something is drawn.
    EXPECT_TRUE(ran.err == err || (err.empty() && status == 0)) << commands << "\n" << ran.err;
  }
  EXPECT_FALSE(holds("no") || holdsUnfinished());
}

// The long names of all options, with the command in front of those that belong to one.
std::vector<std::string> optionsIn(const std::string& help, const std::string& command) {
  std::vector<std::string> names;
  const std::regex option(R"(^ +(?:-\w,)?--([a-z-]+))");
  std::istringstream lines(help);
  std::smatch found;
  for (std::string line; std::getline(lines, line);)
    if (std::regex_search(line, found, option)) names.push_back(command + "--" + found[1].str());
  return names;
}

TEST_F(Program, DocumentsItselfFromItsOptions) {
  EXPECT_TRUE(std::regex_match(run("--version").out, std::regex(R"(qelt-sketch \d+\.\d+\.\d+\n)")));
  std::vector<std::string> options = optionsIn(run("--help").out, "");
  EXPECT_EQ(options.size(), 4u);
  for (const std::string command : {"draw", "trace", "preview", "sheet", "info", "compare"}) {
    const std::vector<std::string> more = optionsIn(run(command + " --help").out, command);
    EXPECT_GE(more.size(), 2u) << command;
    options.insert(options.end(), more.begin(), more.end());
  }
  const std::string manual = run("--man").out;
  const std::string bash = run("--completion bash").out, zsh = run("--completion zsh").out;
  for (const std::string& option : options) {
    const std::size_t dashes = option.find("--");
    const std::string command = option.substr(0, dashes), name = option.substr(dashes);
    const std::string escaped = std::regex_replace(name, std::regex("-"), "\\-");
    EXPECT_NE(manual.find("\\fB" + escaped + "\\fR", command.empty() ? 0 : manual.find(".SS " + command)),
              std::string::npos)
        << option;
    const std::string listed = (command.empty() ? "''" : command) + ") options='";
    const std::size_t line = bash.find("\n      " + listed);
    ASSERT_NE(line, std::string::npos) << option;
    const std::string here = bash.substr(line + 1, bash.find('\n', line + 1) - line) + " ";
    EXPECT_TRUE(std::regex_search(here, std::regex("[ ']" + name + "[ ']"))) << option;
    EXPECT_NE(zsh.find(name, command.empty() ? 0 : zsh.find(" " + command + ") _arguments")),
              std::string::npos)
        << option;
  }
  write("manual", manual);
  write("completion", zsh);
  // Where the checkers are installed, they have nothing to say.
  const Ran checked =
      sh("! command -v groff >/dev/null || groff -man -Tutf8 -ww -z manual; "
         "! command -v zsh >/dev/null || zsh -n completion");
  EXPECT_EQ(checked.out + checked.err, "");
  for (const char* const part :
       {"EXIT STATUS", "cannot be read: REASON", "default 4", "[\\fIINPUT\\fR]", " \\fIBEFORE\\fR"})
    EXPECT_NE(manual.find(part), std::string::npos) << part;
}

TEST_F(Program, IsCompletedByBash) {
  write("completion", run("--completion bash").out);
  const std::pair<std::string, std::string> cases[] = {{"tr", "trace"},
                                                       {"--ver", "--version"},
                                                       {"--completion ''", "bash zsh"},
                                                       {"draw --mo", "--mode"},
                                                       {"draw --mode ''", "live event stroke"},
                                                       {"draw ink.inkml --mode = l", "live"},
                                                       {"trace --mode =", "live event stroke"},
                                                       {"trace --background t", "transparent"},
                                                       {"draw ink", "ink.inkml"},
                                                       {"draw -o ink", "ink.inkml"},
                                                       {"draw --zoom ''", ""},
                                                       {"info ink", ""},
                                                       {"preview --fit", ""},
                                                       {"sheet --fi", "--fit"}};
  for (const auto& [words, wanted] : cases) {
    write("complete", ". ./completion; COMP_WORDS=(qelt-sketch " + words +
                          "); COMP_CWORD=$((${#COMP_WORDS[@]} - 1)); _qelt_sketch; echo \"${COMPREPLY[*]}\"");
    const Ran ran = sh("bash complete");
    EXPECT_EQ(ran.out, wanted + "\n") << words << "\n" << ran.err;
  }
}

TEST_F(Program, TellsWrongUsageFromHelp) {
  const auto expectWrong = [&](const std::string& before, const std::string& list) {
    std::istringstream each(list);
    for (std::string arguments; std::getline(each, arguments, ';');) {
      const Ran ran = run(before + arguments);
      EXPECT_EQ(ran.status, 2) << arguments;
      EXPECT_TRUE(ran.out.empty() && !ran.err.empty()) << arguments;
    }
  };
  expectWrong("", "; paint -o a.png; draw; draw a.inkml b.inkml -o a.png; info -o a.txt; --completion fish");
  expectWrong("trace -o - --drawable ", "line; prediction; preview --mode stroke");
  expectWrong("draw -o a.png ",
              "--sise 3; --size; --size big; --size 3 --size 4; --color red; --color '#FFFFFF'; --mode slow; "
              "--batch 0; --batch 1.5; --tool quill; --source x; --repeat 0; --zoom 0; --zoom inf; "
              "--fit 800; --fit 0x9; --fit 9x-9; --fit 9.5x9; --fit 9x9 --zoom 2; "
              "--rotate nan; --page 800; --page 0x600; --background grey; --outline 3; --predict -1; "
              "--predict 2000000000; --opacity 1.5; --points 0; --drawable stroke; "
              "--rendering-version 99999999999");
  const Ran help = run("trace --help");
  EXPECT_TRUE(help.status == 0 && help.err.empty());
  EXPECT_NE(help.out.find("live: samples a move event (default 4)"), std::string::npos) << help.out;
}

// --- Archives ---

class Archive : public Program {
 protected:
  Archive() {
    const std::string page = contentsOf(path("ink.inkml"));
    for (const char* const name : {"in/a.inkml", "in/deep/b.inkml", "in/deep/c.inkml", "other/a.inkml"}) {
      fs::create_directories(path(name).parent_path());
      write(name, page);
    }
    write("in/notes.txt", "no page");
  }
  static std::string summary(int pages, int drawn, int upToDate, int refused) {
    return std::to_string(pages) + (pages == 1 ? " page: " : " pages: ") + std::to_string(drawn) +
           " drawn, " + std::to_string(upToDate) + " up to date, " + std::to_string(refused) + " refused\n";
  }
};

// The predictions' layer that nobody sees has one pixel, like this page.
TEST_F(Program, PredictsOnAPageAsThinAsAPixel) {
  EXPECT_EQ(draw("draw ink.inkml --page 1x100 --predict 2").width, 1u);
}

TEST_F(Archive, HasAPictureForEveryPageEachAsIfDrawnAlone) {
  EXPECT_EQ(run("draw ink.inkml -o alone.png --zoom 2").status, 0);
  EXPECT_EQ(run("draw in -o out/ --zoom 2 --jobs 2").out, summary(3, 3, 0, 0));
  for (const char* const name : {"out/a.png", "out/deep/b.png", "out/deep/c.png"})
    EXPECT_EQ(contentsOf(path(name)), contentsOf(path("alone.png"))) << name;
  // Several inputs, lists, and a single page into a folder.
  EXPECT_EQ(run("draw in/a.inkml in/deep -o more/").out, summary(3, 3, 0, 0));
  EXPECT_TRUE(holds("more/a.png") && holds("more/b.png"));
  EXPECT_EQ(sh("printf 'in/deep\\n\\nother/a.inkml\\n' | $sketch draw - -o listed/").out,
            summary(3, 3, 0, 0));
  EXPECT_TRUE(holds("listed/a.png") && holds("listed/c.png"));
  EXPECT_EQ(run("draw ink.inkml -o one/").out, summary(1, 1, 0, 0));
  EXPECT_EQ(run("draw -o sample/").out, summary(1, 1, 0, 0));
  EXPECT_TRUE(holds("sample/sample.png"));
  // Its pictures are pages as well, each drawn as it was.
  EXPECT_EQ(run("draw out/a.png -o again/").out, summary(1, 1, 0, 0));
  EXPECT_EQ(contentsOf(path("again/a.png")), contentsOf(path("alone.png")));
}

TEST_F(Archive, TellsBadPagesAndDrawsTheOthers) {
  write("in/deep/b.inkml", "<ink>\n<trace>1 x</trace></ink>");
  write("in/empty.inkml", "");
  const Ran ran = run("draw in other/a.inkml nowhere.inkml ink.inkml -o out/ --jobs 1");
  EXPECT_EQ(ran.status, 1);
  EXPECT_EQ(ran.out, summary(7, 3, 0, 4));
  for (const char* const line : {"in/deep/b.inkml:2: not a number: x\n", "in/empty.inkml:1: not XML: ",
                                 "other/a.inkml: its picture would be that of in/a.inkml: out/a.png\n",
                                 "nowhere.inkml: cannot be read: No such file or directory\n"})
    EXPECT_NE(ran.err.find(line), std::string::npos) << line << ran.err;
  EXPECT_FALSE(holds("out/deep/b.png"));
  // What would be waited for, and a folder that cannot be made.
  EXPECT_EQ(
      sh("mkdir -p odd/stuck; mkfifo odd/pipe.inkml; cp ink.inkml odd; cp ink.inkml odd/stuck/no.inkml; "
         "mkdir half; touch half/stuck; $sketch draw odd -o half")
          .out,
      summary(2, 1, 0, 1));
  // A plug-in that ends the process takes its page alone; one that is none ends the run at once.
  EXPECT_EQ(run("draw in -o none/ --plugin ink.inkml").status, 1);
  EXPECT_FALSE(holds("none/a.png"));
  EXPECT_EQ(run("draw in -o ink.inkml/").err, "ink.inkml/: no folder for pictures: File exists\n");
}

TEST_F(Archive, DrawsOnlyWhatIsNotUpToDate) {
  EXPECT_EQ(run("draw in -o out/").out, summary(3, 3, 0, 0));
  EXPECT_EQ(run("draw in -o out/").out, summary(3, 0, 3, 0));
  fs::last_write_time(path("in/a.inkml"), fs::file_time_type::clock::now());
  EXPECT_EQ(run("draw in -o out/").out, summary(3, 1, 2, 0));
  // Changed while it was drawn.
  EXPECT_EQ(sh("$sketch draw ink.inkml -o late/ --zoom 40 & until ls late/.qelt-* || ls late/ink.png; do :; "
               "done; sleep 0.02; "
               "touch ink.inkml; "
               "wait; $sketch draw ink.inkml -o late/ >second")
                .err.find("refused"),
            std::string::npos);
  EXPECT_EQ(contentsOf(path("second")), summary(1, 1, 0, 0));
  // Older than the program.
  fs::last_write_time(path("out/deep/c.png"),
                      fs::file_time_type::clock::now() - std::chrono::hours(24 * 365 * 20));
  EXPECT_EQ(run("draw in -o out/").out, summary(3, 1, 2, 0));
  EXPECT_EQ(run("draw in -o out/ --again").out, summary(3, 3, 0, 0));
}

// Killed at any moment, and run again.
TEST_F(Archive, IsWholeAfterItWasKilled) {
  const std::string page = contentsOf(path("ink.inkml"));
  for (int i = 0; i < 30; ++i) write("in/page" + std::to_string(i) + ".inkml", page);
  EXPECT_EQ(run("draw ink.inkml -o alone.png --zoom 12").status, 0);
  const Ran killed =
      sh("setsid $sketch draw in -o out/ --zoom 12 --jobs 2 & until [ -e out/page0.png ]; do sleep 0.01; "
         "done; kill -9 -$!; wait $!");
  EXPECT_EQ(killed.status, 128 + SIGKILL) << killed.out << killed.err;
  const Ran resumed = run("draw in -o out/ --zoom 12");
  EXPECT_EQ(resumed.status, 0) << resumed.err;
  EXPECT_EQ(resumed.out.find(" 0 up to date"), std::string::npos) << resumed.out;
  std::size_t pictures = 0;
  for (const auto& entry : fs::recursive_directory_iterator(path("out"))) {
    if (entry.is_directory()) continue;
    ++pictures;
    EXPECT_EQ(contentsOf(entry.path()), contentsOf(path("alone.png"))) << entry.path();
  }
  EXPECT_EQ(pictures, 33u);
}

// As docs/archives.md says: by two tasks of an array, and by workers of which one is killed half way.
TEST_F(Archive, IsSharedOutByOthers) {
  const std::string page = contentsOf(path("ink.inkml"));
  fs::create_directory(path("pages"));
  for (int i = 10; i < 40; ++i) write("pages/page" + std::to_string(i) + ".inkml", page);
  EXPECT_EQ(run("draw pages -o alone/ --zoom 12").status, 0);
  const std::string alike =
      "30 pictures: 30 alike, 0 within the tolerance, 0 different, 0 in one folder only, 0 not compared\n";
  sh("ls pages/* >pages.txt; for task in 0 1; do awk -v tasks=2 -v task=$task 'NR % tasks == task' pages.txt "
     "| "
     "$sketch draw - -o array/ --zoom 12; done");
  EXPECT_EQ(run("compare alone array").out, alike);
  if (std::system("command -v parallel >/dev/null") != 0) GTEST_SKIP() << "GNU parallel is not installed";
  write("worker", R"($sketch draw "$@" -o shared/ --jobs 1 --zoom 12 >&2 &
if mkdir killed; then until [ -e shared/$(basename "$1" .inkml).png ]; do sleep 0.01; done; kill -9 $!; fi
wait $!)");
  // It says how many jobs failed.
  EXPECT_EQ(
      sh("export sketch HOME=.; for run in 1 2; do parallel --will-cite -a pages.txt -n 10 -j 2 --joblog "
         "drawn.log --resume-failed sh worker {}; echo $?; done")
          .out,
      "1\n0\n");
  EXPECT_EQ(run("compare alone shared").out, alike);
}

}  // namespace
