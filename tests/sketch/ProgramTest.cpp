// The program from the outside, as scripts see it.

#include <gtest/gtest.h>
#include <spng.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <csignal>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <memory>
#include <nlohmann/json.hpp>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "pen/RenderingVersions.h"

namespace {

namespace fs = std::filesystem;
using Json = nlohmann::json;

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
};

Rgba decoded(const fs::path& path) {
  const std::string png = contentsOf(path);
  const std::unique_ptr<spng_ctx, void (*)(spng_ctx*)> decoder(spng_ctx_new(0), &spng_ctx_free);
  spng_set_png_buffer(decoder.get(), png.data(), png.size());
  spng_ihdr header{};
  Rgba picture;
  if (spng_get_ihdr(decoder.get(), &header) != 0) {
    ADD_FAILURE() << path << " is no PNG picture";
    return picture;
  }
  picture.width = header.width;
  picture.height = header.height;
  picture.bytes.resize(std::size_t{header.width} * header.height * 4);
  EXPECT_EQ(spng_decode_image(decoder.get(), picture.bytes.data(), picture.bytes.size(), SPNG_FMT_RGBA8, 0),
            0);
  return picture;
}

// Each field of `wanted` stands in the line.
void expectHas(const Json& line, const Json& wanted) {
  for (const auto& [key, value] : wanted.items()) EXPECT_EQ(line[key], value) << key;
}

class Program : public testing::Test {
 protected:
  Program() {
    std::string folder = testing::TempDir() + "qelt-sketch-XXXXXX";
    if (mkdtemp(folder.data()) == nullptr) std::abort();
    mFolder = folder;
  }
  ~Program() override { fs::remove_all(mFolder); }

  fs::path path(const std::string& name) const { return mFolder / name; }

  std::string write(const std::string& name, const std::string& text) const {
    std::ofstream(path(name), std::ios::binary) << text;
    return path(name).string();
  }

  // A slanted line of 11 points from (20.1, 20.1) to (70.1, 45.1), and a dot at (90.1, 30.1).
  std::string writeInk() const {
    std::string line;
    for (int i = 0; i <= 10; ++i) {
      line += (i > 0 ? ", " : "") + std::to_string(20.1 + 5.0 * i) + " " + std::to_string(20.1 + 2.5 * i);
    }
    return write(
        "ink.inkml",
        "<ink><brush><brushProperty name='width' value='5'/><brushProperty name='color' value='#203040'/>"
        "</brush><trace>" +
            line + "</trace><trace>90.1 30.1</trace></ink>");
  }

  // A GL driver may have something to say on standard error too.
  Ran run(const std::string& arguments) const { return sh("$sketch " + arguments); }

  // What a shell does in the test's folder; $sketch is the program.
  Ran sh(const std::string& commands) const {
    // The GL driver leaves a few caches behind as it is unloaded; the threaded tests look for leaks.
    const std::string prepare = "export ASAN_OPTIONS=detect_leaks=0; sketch='" QELT_EMULATOR
                                " " QELT_SKETCH_PATH "'; cd '" +
                                mFolder.string() + "'; exec >stdout 2>stderr; ";
    const std::string script = write("script", prepare + commands);
    const int status = std::system(("sh '" + script + "'").c_str());
    return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, contentsOf(path("stdout")),
            contentsOf(path("stderr"))};
  }

  // The lines that `trace` writes for the ink in a file, or for `writeInk`. Without GL no driver speaks.
  std::vector<Json> trace(const std::string& arguments, const std::string& ink = "") const {
    const Ran ran = run("trace '" + (ink.empty() ? writeInk() : ink) + "' -o - " + arguments);
    EXPECT_EQ(ran.status, 0) << arguments;
    EXPECT_EQ(ran.err, "");
    std::vector<Json> lines;
    std::istringstream stream(ran.out);
    for (std::string line; std::getline(stream, line);) lines.push_back(Json::parse(line));
    return lines;
  }

  // The picture of the ink in a file, or of `writeInk`.
  Rgba draw(const std::string& options, const std::string& ink = "") const {
    const std::string out = path("drawn.png").string();
    const Ran ran = run("draw '" + (ink.empty() ? writeInk() : ink) + "' -o '" + out + "' " + options);
    EXPECT_EQ(ran.status, 0) << ran.err;
    EXPECT_EQ(ran.out, "");
    EXPECT_FALSE(holdsUnfinished());
    return decoded(out);
  }

  bool holds(const std::string& name) const { return fs::exists(path(name)); }
  bool holdsUnfinished() const {
    for (const auto& entry : fs::directory_iterator(mFolder)) {
      if (entry.path().string().find(".part") != std::string::npos) return true;
    }
    return false;
  }

 private:
  fs::path mFolder;
};

TEST_F(Program, TracesEveryLiveCall) {
  const std::vector<Json> lines = trace("");
  // down, moves of 4, 4 and 2, up; then down and up of the dot.
  ASSERT_EQ(lines.size(), 1u + 5u + 2u);
  EXPECT_EQ(lines[0], Json::parse(R"({"kind":"header","renderingVersion":8,"size":5.0,"color":"#FF203040",
                                      "curve":true,"mode":"live","drawable":"stroke"})"));
  const int strokes[] = {0, 0, 0, 0, 0, 1, 1};
  const int actions[] = {0, 2, 2, 2, 1, 0, 1};
  for (std::size_t i = 1; i < lines.size(); ++i) {
    const Json& line = lines[i];
    expectHas(line, {{"kind", "call"},
                     {"op", "Draw"},
                     {"stroke", strokes[i - 1]},
                     {"action", actions[i - 1]},
                     {"result", true}});
    EXPECT_EQ(line["rect"].size(), 4u);
    ASSERT_EQ(line["buffers"].size(), 1u);
    expectHas(line["buffers"][0], {{"stride", 11}, {"cached", false}});
    EXPECT_EQ(line["buffers"][0]["data"].size() % 66, 0u);
  }
  // A down event places no stamp, a tap places one: six vertices of eleven floats.
  EXPECT_EQ(lines[1]["buffers"][0]["data"].size(), 0u);
  EXPECT_GT(lines[2]["buffers"][0]["data"].size(), 66u);
  EXPECT_EQ(lines[7]["buffers"][0]["data"].size(), 66u);
  // A tap's rectangle is about its point: size / 4 for the stamp and the closing growth of 6 at least.
  EXPECT_NEAR(lines[7]["rect"][0].get<float>(), 90.1f - 6.25f, 2.0f);
  // The batch, the order to draw it, and its deletion close every call.
  const Json& posted = lines[2]["posted"];
  ASSERT_GE(posted.size(), 3u);
  const auto fromEnd = [&](std::size_t i) { return posted[posted.size() - i].get<std::string>(); };
  EXPECT_TRUE(fromEnd(3).starts_with("Member1<")) << fromEnd(3);
  EXPECT_EQ(fromEnd(2), "PenGLRenderMsg");
  EXPECT_TRUE(fromEnd(1).starts_with("Delete<")) << fromEnd(1);
}

TEST_F(Program, TracesStoredStrokesTwiceAndTheCacheWithThem) {
  const std::vector<Json> lines = trace("--mode stroke --repeat 2 --rendering-version 3");
  ASSERT_EQ(lines.size(), 1u + 4u);
  for (std::size_t i = 1; i < lines.size(); ++i) {
    expectHas(lines[i], {{"op", "RedrawPen"}, {"action", nullptr}, {"stroke", (i - 1) % 2}});
  }
  const Json &computed = lines[1]["buffers"][0], &fromCache = lines[3]["buffers"][0];
  expectHas(computed, {{"stride", 9}, {"cached", false}});
  expectHas(fromCache, {{"cached", true}, {"data", computed["data"]}});
  EXPECT_EQ(lines[3]["rect"], lines[1]["rect"]);
}

// Straight segments place the same stamps however the samples reach the pen.
TEST_F(Program, HandsOverEverySampleInEveryMode) {
  const auto ink = [this](const std::string& channels) {
    std::string text = "<ink><traceFormat><channel name='X'/><channel name='Y'/>";
    for (const char* const name : {"F", "OE", "OA"}) {
      const std::string known =
          channels.find(name) != std::string::npos ? name : "unknown" + std::string(name);
      text += "<channel name='" + known + "'/>";
    }
    return write("tilted.inkml",
                 text +
                     "</traceFormat><trace>9 9 0.6 50 80</trace><trace>20 20 0.2 40 10, 25 22 0.3 "
                     "50 20, 30 25 0.4 60 30, 35 28 0.5 70 40, 40 30 0.8 50 50, 45 33 1 30 60, 50 35 0.2 20 "
                     "-40, 52 37 0.2 "
                     "20 -40, 60 44 0.6 70 -90, 65 45 0.7 60 -90</trace></ink>");
  };
  const auto stamps = [&](const std::string& channels, const std::string& options, std::size_t calls) {
    const std::vector<Json> lines = trace("--no-curve --size 5 " + options, ink(channels));
    EXPECT_EQ(lines.size(), 1 + calls) << options;
    std::vector<float> all;
    for (std::size_t i = 1; i < lines.size(); ++i) {
      for (const float value : lines[i]["buffers"][0]["data"]) all.push_back(value);
    }
    return all;
  };
  // Down, moves and up of the dot and of ten points.
  const std::vector<float> recorded = stamps("F OE OA", "--mode event", 2);
  const std::pair<const char*, std::size_t> ways[] = {
      {"", 2 + 5},           {"--batch 1", 2 + 11},   {"--batch 3", 2 + 5},
      {"--batch 8", 2 + 4},  {"--batch 1000", 2 + 3}, {"--mode stroke", 2},
      {"--points 99", 2 + 4}};
  for (const auto& [options, calls] : ways) EXPECT_EQ(stamps("F OE OA", options, calls), recorded) << options;
  for (const char* const channels : {"F OE", "F OA", "OE OA"}) {
    EXPECT_NE(stamps(channels, "--mode event", 2), recorded) << channels;
  }
  // A mouse takes no tilt; a stylus whose source is the touch screen is one that the screen sees as a finger.
  const std::vector<float> coarse = stamps("F OE OA", "--tool mouse", 2 + 5);
  EXPECT_NE(coarse, recorded);
  EXPECT_EQ(stamps("F OE OA", "--source 4098", 2 + 5), coarse);
  EXPECT_LT(stamps("F OE OA", "--points 3", 2 + 2).size(), recorded.size());
}

TEST_F(Program, TracesWhatTheOptionsChange) {
  const std::vector<Json> recorded = trace("--mode event --color '#80FFFFFF' --no-curve --size -3");
  ASSERT_EQ(recorded.size(), 3u);
  expectHas(recorded[0], {{"curve", false}, {"mode", "event"}, {"color", "#80FFFFFF"}, {"size", -3.0f}});
  EXPECT_EQ(recorded[1]["op"], "RedrawPen");
  EXPECT_EQ(trace("--size nan")[0]["size"], "NaN");
  // Half the inverse scale reaches version 8's vertices.
  EXPECT_NE(trace("--zoom 2")[2]["buffers"], trace("")[2]["buffers"]);
}

// What the list of versions says of the batches is what the plug-in hands over.
TEST_F(Program, KnowsEveryRenderingVersionOfThePlugIn) {
  const auto expectStride = [&](int version, int stride) {
    const Json first = trace("--mode event --rendering-version " + std::to_string(version))[1]["buffers"][0];
    EXPECT_EQ(first["stride"], stride) << version;
    EXPECT_EQ(first["data"].size() % static_cast<std::size_t>(6 * stride), 0u) << version;
    // The second vertex of a stamp begins with its place, a stamp's size from the first.
    EXPECT_NEAR(first["data"][static_cast<std::size_t>(stride)].get<float>(), 20.0f, 10.0f) << version;
  };
  const std::string info = run("info").out;
  for (const Qelt::RenderingVersion& version : Qelt::kRenderingVersions) {
    expectStride(version.number, version.floatsPerVertex);
    const Ran predicted = run("trace -o - --drawable prediction --predict 3 --rendering-version " +
                              std::to_string(version.number));
    EXPECT_EQ(predicted.status, version.predicts ? 0 : 1);
    if (!version.predicts) {
      EXPECT_EQ(predicted.err, "the pen has no prediction drawable in rendering version " +
                                   std::to_string(version.number) + "\n");
    }
    std::array<char, 64> row{};
    std::snprintf(row.data(), row.size(), "\n%17d  %14d  %15d\n", version.number, version.strokeVersion,
                  version.outlineVersion);
    EXPECT_NE(info.find(row.data()), std::string::npos) << row.data() << " in\n" << info;
  }
  EXPECT_EQ(info.find("another age"), std::string::npos);
  // Others are drawn like the first.
  for (const int other : {-3, 99}) expectStride(other, Qelt::kRenderingVersions[0].floatsPerVertex);
}

TEST_F(Program, TellsWhenThePlugInIsOfAnotherAge) {
  std::string plugin = contentsOf(QELT_PLUGIN_PATH);
  const std::array<std::int32_t, 6> rows{4, 4, 5, 5, 6, 4};
  const std::size_t found = plugin.find(std::string(reinterpret_cast<const char*>(rows.data()), sizeof rows));
  ASSERT_NE(found, std::string::npos);
  plugin[found + 8] = 3;
  const Ran ran = run("info --plugin '" + write("older.so", plugin) + "'");
  EXPECT_EQ(ran.status, 0);
  EXPECT_NE(
      ran.out.find("The plug-in is of another age than this program:\nrendering version 5 has stroke version "
                   "5 and outline version 5 in this program's list\n"),
      std::string::npos)
      << ran.out;
}

TEST_F(Program, DrawsInkWhereTheInkIs) {
  const Rgba picture = draw("--page 120x60 --background '#FFEEDD'");
  ASSERT_EQ(picture.width, 120u);
  ASSERT_EQ(picture.height, 60u);
  int inside = 0, outside = 0;
  for (std::uint32_t y = 0; y < picture.height; ++y) {
    for (std::uint32_t x = 0; x < picture.width; ++x) {
      const std::uint8_t* const pixel = picture.at(x, y);
      EXPECT_EQ(pixel[3], 255);
      const bool inked = pixel[0] != 0xFF || pixel[1] != 0xEE || pixel[2] != 0xDD;
      const bool near = (x > 10 && x < 100 && y > 10 && y < 55);
      (near ? inside : outside) += inked ? 1 : 0;
    }
  }
  EXPECT_GT(inside, 100);
  EXPECT_EQ(outside, 0);

  const Rgba turned = draw("--zoom 0.5 --rotate 90 --background transparent");
  // (25 + 2 * 26) / 2 and (70 + 2 * 26) / 2, rounded up.
  EXPECT_EQ(turned.width, 39u);
  EXPECT_EQ(turned.height, 61u);
  EXPECT_EQ(turned.at(0, 0)[3], 0);
  EXPECT_EQ(draw("--mode stroke").bytes, draw("--mode stroke --repeat 2").bytes);
}

TEST_F(Program, TracesOutlinesPreviewsAndPredictions) {
  const std::vector<Json> outlines = trace("--drawable outline --outline 3,#FF00FF00");
  ASSERT_EQ(outlines.size(), 3u);
  for (std::size_t i = 1; i < outlines.size(); ++i) {
    EXPECT_EQ(outlines[i]["op"], "DrawOutline");
    ASSERT_EQ(outlines[i]["buffers"].size(), 2u);
    for (const Json& buffer : outlines[i]["buffers"]) {
      EXPECT_EQ(buffer["stride"], 7);
      EXPECT_GT(buffer["data"].size(), 0u);
      EXPECT_EQ(buffer["data"].size() % 42, 0u);
    }
    // The outer quads are the enlarged ones: their first corner lies further out.
    EXPECT_LT(outlines[i]["buffers"][1]["data"][0], outlines[i]["buffers"][0]["data"][0]);
  }
  EXPECT_EQ(trace("--drawable outline --mode stroke")[1]["action"], nullptr);

  const std::vector<Json> previews = trace("--drawable preview --mode event");
  ASSERT_EQ(previews.size(), 3u);
  EXPECT_EQ(previews[1]["op"], "RedrawPen");
  EXPECT_EQ(previews[1]["buffers"][0]["data"].size() % 54, 0u);
  EXPECT_EQ(trace("--drawable preview").size(), 1u + 5u + 2u);

  // One prediction a move event, from where the live stroke is: on the line from (20, 20) to (70, 45), step
  // (5, 2.5).
  const std::vector<Json> predictions = trace("--drawable prediction --predict 3");
  ASSERT_EQ(predictions.size(), 1u + 3u);
  for (std::size_t i = 1; i < predictions.size(); ++i) {
    expectHas(predictions[i], {{"op", "Draw"}, {"action", 2}, {"result", true}});
    EXPECT_GT(predictions[i]["buffers"][0]["data"].size(), 66u);
  }
  EXPECT_NEAR(predictions[1]["rect"][2].get<float>(), 55.1f, 4.0f);  // 40 + 3 * 5
  EXPECT_NEAR(predictions[3]["rect"][2].get<float>(), 85.1f, 4.0f);  // 70 + 3 * 5
  EXPECT_NEAR(predictions[3]["rect"][3].get<float>(), 52.6f, 4.0f);  // 45 + 3 * 2.5
}

TEST_F(Program, LaysOutlinesUnderAndPredictionsOverTheStrokes) {
  const std::string ink =
      write("line.inkml",
            "<ink><brush><brushProperty name='width' value='6'/></brush>"
            "<trace>10.3 20.3,20.3 20.3,30.3 20.3,40.3 20.3,50.3 20.3,60.3 20.3</trace></ink>");
  const auto draw = [&](const std::string& options) {
    return Program::draw("--page 120x40 " + options, ink);
  };
  // Darkest red in a part of the picture.
  const auto darkest = [](const Rgba& picture, std::uint32_t left, std::uint32_t right) {
    int red = 255;
    for (std::uint32_t y = 0; y < picture.height; ++y) {
      for (std::uint32_t x = left; x < right; ++x) red = std::min<int>(red, picture.at(x, y)[0]);
    }
    return red;
  };
  const Rgba plain = draw("");
  EXPECT_EQ(darkest(plain, 70, 120), 255);
  EXPECT_LT(darkest(plain, 30, 40), 100);

  // The stroke stays dark over its outline; the outline reaches further, in its own colour.
  const Rgba outlined = draw("--outline 6,#FFFF0000");
  EXPECT_LT(darkest(outlined, 30, 40), 120);
  const std::uint8_t* const rim = outlined.at(35, 26);
  EXPECT_EQ(rim[0], 255);
  EXPECT_LT(rim[1], 100);
  EXPECT_EQ(plain.at(35, 26)[1], 255);

  // Predicted ink is there while the pen is down, and gone once it is lifted.
  EXPECT_LT(darkest(draw("--predict 3 --opacity 1 --points 6"), 70, 120), 255);
  EXPECT_EQ(darkest(draw("--predict 3 --opacity 0 --points 6"), 70, 120), 255);
  EXPECT_EQ(draw("--predict 3 --opacity 1").bytes, plain.bytes);
}

// The page's tiles meet at column 512. A prediction beside it, whose stamps hang 2 pixels over it, looks as
// it does 200 pixels to the left.
TEST_F(Program, DrawsPredictionsWholeAcrossTheBordersOfTiles) {
  const auto draw = [this](const std::string& x) {
    std::string line;
    for (const char* const y : {"10.3", "20.3", "30.3", "40.3", "50.3"}) line += x + " " + y + ",";
    const std::string ink =
        write("line.inkml", "<ink><brush><brushProperty name='width' value='20'/></brush><trace>" + line + x +
                                " 60.3</trace></ink>");
    return Program::draw("--page 640x120 --predict 3 --opacity 1 --points 6", ink);
  };
  const Rgba beside = draw("504.3"), apart = draw("304.3");
  int inked = 0, differing = 0;
  for (std::uint32_t y = 66; y < 86; ++y) {  // the live stroke ends above
    for (std::uint32_t x = 312; x < 316; ++x) {
      inked += apart.at(x, y)[0] < 255 ? 1 : 0;
      differing += std::abs(beside.at(x + 200, y)[0] - apart.at(x, y)[0]) > 8 ? 1 : 0;
    }
  }
  EXPECT_GT(inked, 20);
  EXPECT_LE(differing, 2);
}

TEST_F(Program, DrawsThePreviewAndTheSheet) {
  const std::string out = path("out.png").string();
  ASSERT_EQ(run("preview --size 6 --color '#FF0000FF' -o '" + out + "'").status, 0);
  const Rgba preview = decoded(out);
  std::size_t blue = 0;
  for (std::size_t i = 0; i < preview.bytes.size(); i += 4) blue += preview.bytes[i] < 128 ? 1 : 0;
  EXPECT_GT(blue, preview.width);  // the stroke runs across most of the panel, several pixels wide

  const std::string ink = writeInk();
  ASSERT_EQ(run("sheet '" + ink + "' --size 4 -o '" + out + "'").status, 0);
  const Rgba sheet = decoded(out);
  // Cells in two columns, each the page of 70 x 25 and its margins of 24 on every side, under a label.
  constexpr std::uint32_t kRows = (Qelt::kRenderingVersions.size() + 1) / 2;
  EXPECT_EQ(sheet.width, 2u * (118 + 16) + 16);
  EXPECT_EQ(sheet.height, kRows * (73 + 14 + 16) + 16);
  const auto inkedIn = [&](std::size_t cell) {
    std::size_t inked = 0;
    const auto left = static_cast<std::uint32_t>(16 + cell % 2 * 134),
               top = static_cast<std::uint32_t>(16 + 14 + 8 + cell / 2 * 103);
    for (std::uint32_t y = top; y < top + 73; ++y) {
      for (std::uint32_t x = left; x < left + 118; ++x) inked += sheet.at(x, y)[0] < 200 ? 1 : 0;
    }
    return inked;
  };
  for (std::size_t cell = 0; cell < Qelt::kRenderingVersions.size(); ++cell)
    EXPECT_GT(inkedIn(cell), 20u) << cell;
}

TEST_F(Program, LeavesNothingBehindWhenThePageIsMalformed) {
  const std::string bad = write("bad.inkml", "<ink>\n<trace>1 2, 3 four</trace>\n</ink>");
  for (const std::string command : {"draw", "trace", "sheet"}) {
    const Ran ran = run(command + " '" + bad + "' -o '" + path("out").string() + "'");
    EXPECT_EQ(ran.status, 1) << command;
    EXPECT_EQ(ran.err, bad + ":2: not a number: four\n");
    EXPECT_EQ(ran.out, "");
    EXPECT_FALSE(holds("out") || holdsUnfinished());
  }
}

TEST_F(Program, SaysInOneLineWhatCannotBeDoneAndLeavesAnOlderFileAlone) {
  const std::string ink = writeInk();
  const std::string older = write("older.png", "older");
  const auto expectRefused = [&](const std::string& arguments, const std::string& why) {
    const Ran ran = run(arguments);
    EXPECT_EQ(ran.status, 1) << arguments;
    EXPECT_NE(ran.err.find(why), std::string::npos) << ran.err;
    EXPECT_EQ(ran.out, "");
  };
  expectRefused("draw '" + ink + "' --zoom 1e6 -o '" + older + "'",
                ink + ": the picture is too large to draw: ");
  expectRefused("draw '" + ink + "' --page 40000x1 -o '" + older + "'",
                "--page: the picture is too large to draw: 40000 x 1 pixels, at most 32767 a side and "
                "67108864 in all\n");
  EXPECT_EQ(contentsOf(older), "older");
  expectRefused("draw '" + path("none.inkml").string() + "' -o '" + path("no.png").string() + "'",
                "none.inkml: cannot be read: ");
  expectRefused("draw '" + ink + "' -o '" + path("no/folder/a.png").string() + "'",
                "no/folder/a.png: cannot be written: ");
  expectRefused("draw '" + ink + "' -o '" + path("").string() + "'", "Is a directory\n");
  expectRefused("trace '" + ink + "' -o '" + ink + "'", "it is the page to read\n");
  EXPECT_EQ(run("trace '" + ink + "' -o -").status, 0);
  for (const std::string command : {"draw", "trace"})
    expectRefused(command + " '" + ink + "' -o /dev/full", "No space left on device\n");
  EXPECT_TRUE(fs::exists("/dev/full"));
  expectRefused("info --plugin '" + ink + "'", "cannot load the pen plug-in: ");
  EXPECT_FALSE(holds("no.png") || holdsUnfinished());

  // Where it succeeds it follows a link instead of replacing it.
  fs::create_symlink("older.png", path("link.png"));
  EXPECT_EQ(run("draw '" + ink + "' -o '" + path("link.png").string() + "'").status, 0);
  EXPECT_TRUE(fs::is_symlink(path("link.png")));
  EXPECT_GT(decoded(older).width, 0u);
}

// What is to be written over is kept, refused or followed, whole.
TEST_F(Program, RespectsWhatStandsWhereItWrites) {
  writeInk();
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
  writeInk();
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

TEST_F(Program, EndsEveryFailureInOneLine) {
  const std::string ink = writeInk();
  const struct {
    std::string command, says;
  } cases[] = {{"$sketch --help >/dev/full", "standard output cannot be written: No space left on device\n"},
               {"$sketch info >/dev/full", "standard output cannot be written: No space left on device\n"},
               {"$sketch trace ink.inkml -o t --plugin '" QELT_THROWING_PLUGIN "'",
                "qelt-sketch: stopped by an exception of unknown type\n"},
               {"$sketch trace \"$(printf 'a\\033[31m\\n\\302\\233\\377\\303\\274b')\" -o t",
                "a\\x1B[31m\\n\\xC2\\x9B\\xFF\u00fcb: cannot be read: No such file or directory\n"}};
  for (const auto& [command, says] : cases) {
    const Ran ran = sh(command);
    EXPECT_EQ(ran.status, 1) << command;
    EXPECT_TRUE(ran.err.ends_with(says)) << command << "\n" << ran.err;
  }
  EXPECT_FALSE(holds("t") || holdsUnfinished());
}

TEST_F(Program, FindsPlugInsInItsFolderAndItsLibrariesFromWhereItStands) {
  const Ran ran = sh("cp '" QELT_PLUGIN_PATH "' local.so; $sketch info --plugin local.so");
  EXPECT_NE(ran.out.find("./local.so"), std::string::npos) << ran.err;
  EXPECT_NE(contentsOf(QELT_SKETCH_PATH).find("$ORIGIN/../../host/desktop"), std::string::npos);
  EXPECT_NE(contentsOf(QELT_PLUGIN_PATH).find("$ORIGIN/../host/desktop"), std::string::npos);
}

TEST_F(Program, TellsWrongUsageFromHelp) {
  EXPECT_EQ(run("draw").status, 2);
  const Ran unknown = run("sketch");
  EXPECT_EQ(unknown.status, 2);
  EXPECT_NE(unknown.err.find("'sketch'"), std::string::npos);
  const Ran help = run("trace --help");
  EXPECT_EQ(help.status, 0);
  EXPECT_EQ(help.err, "");
  EXPECT_NE(help.out.find("live: samples a move event (default 4)"), std::string::npos) << help.out;
}

TEST_F(Program, InformsAboutThePlugIn) {
  const Ran ran = run("info");
  ASSERT_EQ(ran.status, 0) << ran.err;
  for (const char* part : {"libQeltPencil2.so", "OpenGL ES 3", "0.477", "6.571"}) {
    EXPECT_NE(ran.out.find(part), std::string::npos) << part << " in\n" << ran.out;
  }
}

}  // namespace
