#include "commands/PageInput.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <fstream>
#include <iterator>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include "commands/CommandLine.h"
#include "output/Picture.h"
#include "output/PngWriter.h"
#include "play/Options.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

constexpr std::string_view kPage = "<ink>\n<trace>1 2,3 4</trace></ink>";

std::string bigEndian(std::uint32_t number) {
  std::string bytes;
  for (int shift = 24; shift >= 0; shift -= 8) bytes += static_cast<char>(number >> shift & 0xFF);
  return bytes;
}

std::string chunk(const std::string& type, const std::string& data) {
  std::uint32_t crc = 0xFFFFFFFF;
  for (const char c : type + data) {
    crc ^= static_cast<unsigned char>(c);
    for (int bit = 0; bit < 8; ++bit) crc = crc >> 1 ^ ((crc & 1) != 0 ? 0xEDB88320u : 0u);
  }
  return bigEndian(static_cast<std::uint32_t>(data.size())) + type + data + bigEndian(~crc);
}

// Uncompressed, unless the flag says otherwise.
std::string ink(std::string_view text, char flag = 0, char method = 0) {
  return chunk("iTXt", std::string("InkML\0", 6) + flag + method + std::string(2, '\0') + std::string(text));
}

// A sound picture with other chunks before its pixels and behind them.
std::string png(const std::string& before, const std::string& behind = {}) {
  std::string bytes = encodePng(plainPicture(3, 2, 0x102030));
  const std::size_t pixels = bytes.find("IDAT") - 4, end = bytes.find("IEND") - 4;
  return bytes.substr(0, pixels) + before + bytes.substr(pixels, end - pixels) + behind + bytes.substr(end);
}

class PageInputTest : public testing::Test {
 protected:
  ~PageInputTest() override { std::remove(mPath.c_str()); }

  PageInput read(const std::string& bytes) const {
    std::ofstream(mPath, std::ios::binary) << bytes;
    return readPageInput(mPath);
  }
  // What follows the file's name in the refusal.
  std::string refusalOf(const std::string& bytes) const {
    try {
      read(bytes);
    } catch (const Refusal& refusal) {
      const std::string text = refusal.what();
      EXPECT_TRUE(text.starts_with(mPath + ":")) << text;
      return text.substr(mPath.size() + 1);
    }
    return "not refused";
  }

 private:
  std::string mPath = testing::TempDir() + "qelt-input-" + std::to_string(getpid()) + ".inkml";
};

TEST_F(PageInputTest, ReadsThePageThatAPictureCarries) {
  const std::string packed = encodePng(
      plainPicture(1, 1, 0), {.keyword = kInkKeyword, .text = std::string(kPage) + std::string(9999, ' ')});
  EXPECT_LT(packed.size(), 500u);
  for (const std::string& bytes :
       {packed, png(ink(kPage)), png("", ink(kPage)),
        png(chunk("iTXt", std::string("Title\0\7", 7)) + ink(kPage)), std::string(kPage)}) {
    const PageInput input = read(bytes);
    EXPECT_EQ(input.page.strokes.at(0).samples.at(1).y, 4.0f);
    EXPECT_EQ(input.drawnWith, std::nullopt);
  }
  const std::string instruction = "<?qelt-sketch --zoom=2?>";
  const std::string drawn = instruction + std::string(kPage) + "<?other a?>" + instruction;
  EXPECT_EQ(read(png(ink(drawn))).drawnWith, "--zoom=2");
  EXPECT_EQ(read(drawn).drawnWith, std::nullopt);
}

TEST_F(PageInputTest, RefusesPicturesWithoutSoundInk) {
  const std::string sound = png(ink(kPage));
  const auto changed = [&](std::size_t at, const std::string& bytes) {
    std::string other = sound;
    return other.replace(at, bytes.size(), bytes);
  };
  const std::size_t ours = sound.find("iTXt"), pixels = sound.find("IDAT");
  // A small chunk of much text.
  const std::string packed =
      encodePng(plainPicture(1, 1, 0), {.keyword = kInkKeyword, .text = std::string(kMostInkBytes + 1, ' ')});
  const std::size_t start = packed.find("iTXt") - 4;
  const std::string bomb = packed.substr(start, packed.find("IDAT") - 4 - start);
  const std::pair<std::string, std::string> cases[] = {
      {png(""), " the picture carries no ink"},
      {png(ink(kPage) + ink(kPage)), " the picture carries ink twice"},
      {png(ink(kPage), ink(kPage)), " the picture carries ink twice"},
      {png(chunk("tEXt", std::string("InkML\0", 6) + std::string(kPage))),
       " the picture's ink is not in an iTXt chunk"},
      {png(ink("<ink>\xFF</ink>")), " the picture's ink is not UTF-8"},
      {png(ink(kPage, 7)), " the picture's ink is damaged"},
      {png(ink("no packed text", 1)), " the picture's ink is damaged"},
      {png(ink(kPage, 1, 1)), " the picture's ink is damaged"},
      {png(ink("<svg/>")), "1: not InkML, the root element is: svg"},
      {png(ink("<ink>\n<trace>1 x</trace></ink>")), "2: not a number: x"},
      {png(ink(std::string(kPage) + "\n<?qelt-sketch a?><?qelt-sketch b?>")),
       "3: a second instruction: qelt-sketch"},
      {changed(ours + 20, "!"), " not a sound PNG picture: invalid chunk checksum"},
      {changed(ours - 4, "\x7F\xFF\xFF\xFF"), " not a sound PNG picture: end of stream"},
      {changed(ours - 4, "\xFF\xFF\xFF\xFF"),
       " not a sound PNG picture: chunk exceeds maximum standard length"},
      {changed(pixels + 6, "!!"), " not a sound PNG picture: "},
      {sound.substr(0, 8), " not a sound PNG picture: end of stream"},
      {sound.substr(0, ours + 20), " not a sound PNG picture: end of stream"},
      {sound.substr(0, pixels + 8), " not a sound PNG picture: end of stream"},
      {sound.substr(0, 16) + std::string("\x7F\xFF\xFF\xFF", 4) + sound.substr(20),
       " not a sound PNG picture: "},
      {sound.substr(0, 8) + chunk("IHDR", std::string("\0\0\x7F\xFF\0\0\x7F\xFF\x08\x06\0\0\0", 13)) +
           sound.substr(33),
       " the picture is too large"},
      {png(bomb), " the picture's ink is too large"},
      {png(bomb + bomb + bomb), " not a sound PNG picture: reached chunk/cache limits"}};
  for (std::size_t i = 0; i < std::size(cases); ++i) {
    const auto& [bytes, wanted] = cases[i];
    EXPECT_EQ(refusalOf(bytes).substr(0, wanted.size()), wanted) << i;
  }
}

Options parsed(std::vector<const char*> words) {
  words.insert(words.begin(), "qelt-sketch");
  return std::get<Options>(parseOptions(static_cast<int>(words.size()), words.data()));
}

TEST(PictureOptions, StandBehindTheCommandLine) {
  const Options drawn = parsed({"draw",
                                "-o",
                                "a.png",
                                "--mode",
                                "event",
                                "--zoom",
                                "0.1",
                                "--rotate",
                                "-45",
                                "--page",
                                "1e9x0.3",
                                "--background",
                                "#102030",
                                "--outline",
                                "nan,#01020304",
                                "--size",
                                "-inf",
                                "--color",
                                "#0A0B0C0D",
                                "--no-curve",
                                "--batch",
                                "3",
                                "--predict",
                                "2",
                                "--opacity",
                                "0.25",
                                "--repeat",
                                "5",
                                "--points",
                                "6",
                                "--tool",
                                "mouse",
                                "--source",
                                "-7",
                                "--rendering-version",
                                "-2"});
  const std::string instruction = instructionFor(drawn);
  EXPECT_EQ(
      instruction,
      " --rendering-version=-2 --size=-inf --color=#0A0B0C0D --no-curve --mode=event --batch=3 --tool=mouse"
      " --source=-7 --repeat=5 --zoom=0.1 --rotate=-45 --page=1e+09x0.3 --background=#102030"
      " --outline=nan,#01020304 --predict=2 --opacity=0.25 --points=6");
  const Options again = withInstruction(parsed({"draw", "-o", "b.png"}), "a.png", instruction);
  EXPECT_EQ(instructionFor(again), instruction);
  EXPECT_EQ(again.output, "b.png");
  const Options other = withInstruction(
      parsed({"trace", "-o", "b", "--curve", "--zoom", "3", "--background", "white"}), "a.png", instruction);
  EXPECT_TRUE(other.command == Command::Trace && other.curve == true && other.zoom == 3.0f);
  EXPECT_TRUE(other.background.rgb == 0xFFFFFF && other.mode == Mode::Event);
  const std::string fitted = instructionFor(parsed({"draw", "-o", "a.png", "--fit", "80x90"}));
  EXPECT_NE(fitted.find(" --fit=80x90 "), std::string::npos) << fitted;
  EXPECT_EQ(fitted.find("--zoom"), std::string::npos) << fitted;
  EXPECT_EQ(instructionFor(withInstruction(parsed({"draw", "-o", "b"}), "a.png", fitted)), fitted);
  EXPECT_FALSE(withInstruction(parsed({"draw", "-o", "b", "--zoom", "2"}), "a.png", fitted).fit);
  EXPECT_FALSE(withInstruction(parsed({"sheet", "-o", "b"}), "a.png", fitted).fit);
  // Of what a sheet does not offer it takes nothing.
  const Options sheet = withInstruction(parsed({"sheet", "-o", "b.png"}), "a.png", instruction);
  EXPECT_TRUE(sheet.mode == Mode::Event && sheet.curve == false && sheet.argb == 0x0A0B0C0Du);
  EXPECT_TRUE(sheet.repeat == 1 && !sheet.points && !sheet.outline && sheet.background.rgb == 0xFFFFFF);
}

TEST(PictureOptions, AreNothingElse) {
  const auto refusal = [](const std::string& instruction, const Options& asked) -> std::string {
    try {
      withInstruction(asked, "a.png", instruction);
    } catch (const Refusal& refused) {
      return refused.what();
    }
    return "not refused";
  };
  const Options draw = parsed({"draw", "-o", "b.png"});
  for (const char* const instruction :
       {"-o c.png", "--output=c.png", "other.inkml", "--plugin=c.so", "--log", "--help", "-h", "--no-ink",
        "--drawable=outline", "draw", "--zoom=0", "--zoom", "--zoom=1 --zoom=2", "--curve --no-curve",
        "nonsense", "--points=99999999999"}) {
    const std::string text = refusal(instruction, draw);
    EXPECT_TRUE(
        text.starts_with("a.png: the picture says how it was drawn in a way that is not understood: "))
        << instruction << ": " << text;
    EXPECT_EQ(text.find('\n'), std::string::npos) << text;
  }
  EXPECT_EQ(refusal(" --zoom 2 ", draw), "not refused");
  EXPECT_EQ(refusal("", draw), "not refused");
  EXPECT_EQ(refusal("--mode=stroke", parsed({"trace", "-o", "b", "--drawable", "preview"})),
            "a.png: as the picture was drawn, --drawable preview: takes --mode live or event");
}

}  // namespace
}  // namespace QeltDesktop
