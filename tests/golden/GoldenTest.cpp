#include <gtest/gtest.h>

#include <charconv>
#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <string>
#include <vector>

#include "golden/Golden.h"
#include "stroke/DrawingBoard.h"
#include "support/Stamps.h"
#include "support/Versions.h"

// Each released version, frozen: the stamps of a few telling strokes, and their picture.
namespace QeltTests {
namespace {

// Shortest decimals that read back as the same float.
std::string line(const char* what, std::initializer_list<float> numbers) {
  std::string text = what;
  for (const float number : numbers) {
    char digits[32];
    const auto [end, error] = std::to_chars(digits, digits + sizeof digits, number);
    text += ' ';
    text.append(digits, end);
  }
  return text;
}

// Draws a stroke event by event and writes down stamps and areas, and at the end what the prediction is told.
void traceStroke(Trace& trace, const BoardOptions& options, float zoom, const std::vector<Sample>& samples) {
  DrawingBoard board(options);
  board.canvas.setMatrix(viewOf(zoom));
  const auto write = [&] {
    for (const Stamp& s : board.takeStamps()) {
      std::string text = line("stamp", {s.x, s.y, s.halfWidth, s.halfHeight, s.alpha, s.narrowing,
                                        static_cast<float>(s.tile), s.directionX, s.directionY});
      if (strideOf(options.version) == 11) text += line("", {s.innerRadius, s.alphaByWidth});
      trace.push_back(text);
    }
    trace.push_back(line("area", {board.rect.left, board.rect.top, board.rect.right, board.rect.bottom}));
  };
  board.down(samples.front());
  write();
  for (std::size_t i = 1; i + 1 < samples.size(); i += 2) {
    board.move({samples.begin() + static_cast<std::ptrdiff_t>(i),
                samples.begin() + static_cast<std::ptrdiff_t>(std::min(i + 2, samples.size() - 1))});
    write();
  }
  board.up(samples.back());
  write();
  const Qelt::Pencil2Data& d = board.shared;
  trace.push_back(
      line("state", {d.mStartX, d.mStartY, d.mLastWidth, d.mLastStampX, d.mLastStampY, d.mLastX, d.mLastY,
                     d.mLastAlpha, d.mLastOrientation, static_cast<float>(d.mStampCount), d.mTiltBlend}));
}

// Pressure from below to above every clamp; tilt from one cap over the other down again; the orientation
// across the wrap; moves of 0.45 and 0.9 among the longer ones, so that versions drop a segment or do not.
const std::vector<Sample> kHand = {
    {10.13f, 10.29f, 0.20f, 0.79f, 2.90f},  {11.93f, 10.61f, 0.20f, 1.20f, -3.00f},
    {12.37f, 10.70f, 0.55f, 1.20f, -2.80f}, {12.82f, 10.75f, 0.55f, 0.77f, 2.60f},
    {13.89f, 10.93f, 0.55f, 0.77f, 2.60f},  {16.97f, 13.03f, 1.00f, 0.40f, 2.20f},
    {14.11f, 15.93f, 0.75f, 0.20f, 1.50f},  {12.03f, 16.47f, 0.35f, 0.60f, 0.90f},
};

// A finger's moves around the skip distance: 0.9 of it is dropped, then taken; 1.1 of it is taken at once.
std::vector<Sample> fingerMoves(float skipDistance) {
  const float x = 20.17f, y = 30.41f;
  return {{x, y, 0.9f},
          {x + 0.9f * skipDistance, y, 0.9f},
          {x, y + 0.9f * skipDistance, 0.9f},
          {x + 1.1f * skipDistance, y + 0.9f * skipDistance, 0.9f},
          {x + 1.1f * skipDistance, y + 0.5f * skipDistance, 0.9f}};
}

Trace traceOf(int version) {
  BoardOptions options;
  options.version = version;
  options.color = 0x60203040u;
  Trace trace;
  trace.emplace_back("curve, size 2, stylus");
  options.size = 2.0f;
  traceStroke(trace, options, 1.0f, kHand);
  trace.emplace_back("straight, size 0.8, stylus, zoom 1.5");
  options.size = 0.8f;
  options.curve = false;
  traceStroke(trace, options, 1.5f, kHand);
  trace.emplace_back("curve, size 30, finger");
  options.size = 30.0f;
  options.curve = true;
  options.tool = Qelt::kToolFinger;
  options.source = Qelt::kSourceTouchScreen;
  traceStroke(trace, options, 1.0f, fingerMoves(version == 8 ? 20.0f : 50.0f));
  return trace;
}

// A wave under growing pressure, shading with the pen laid down, and a straight hairline, thinner than a
// pixel.
GreyPicture pictureOf(int version) {
  BoardOptions options;
  options.version = version;
  options.color = 0xA0203040u;
  options.width = 160;
  options.height = 120;
  options.tile = 64;
  options.size = 7.0f;
  DrawingBoard board(options);
  std::vector<Sample> wave, shading, hairline;
  for (int i = 0; i <= 20; ++i) {
    const auto t = static_cast<float>(i);
    wave.push_back(
        {12.13f + 6.5f * t, 22.39f + (i % 4 < 2 ? 9.0f : -9.0f), 0.15f + 0.045f * t, 0.02f * t, 0.7f});
    shading.push_back({14.37f + 5.0f * t, 68.63f + (i % 2 == 0 ? 10.0f : -10.0f), 0.6f, 0.9f, -0.9f});
    hairline.push_back({12.63f + 6.5f * t, 104.87f - 0.4f * t, 0.8f, 0.1f, 0.0f});
  }
  board.stroke(wave);
  board.settings.size = 5.0f;
  board.stroke(shading);
  board.settings.size = 0.7f;
  board.shared.mCurveEnabled = false;
  board.stroke(hairline);

  const std::vector<std::uint8_t> pixels = board.pixels();
  GreyPicture picture{options.width, options.height, {}};
  for (std::size_t i = 3; i < pixels.size(); i += 4)
    picture.pixels.push_back(static_cast<std::uint8_t>(255 - pixels[i]));
  return picture;
}

class Golden : public testing::TestWithParam<int> {};

TEST_P(Golden, StampsAreThoseOfTheRelease) {
  expectGoldenTrace(traceOf(GetParam()), "stamps-v" + std::to_string(GetParam()) + ".txt");
}

// The files were recorded on x86-64; on 64-bit ARM the same test holds the other processor to them.
TEST_P(Golden, StampsAreTheSameOnEveryProcessorToTheLastBit) {
  expectExactGoldenTrace(traceOf(GetParam()), "stamps-v" + std::to_string(GetParam()) + ".txt");
}

TEST_P(Golden, PictureIsThatOfTheRelease) {
  expectGoldenPicture(pictureOf(GetParam()), "picture-v" + std::to_string(GetParam()) + ".pgm");
}

INSTANTIATE_TEST_SUITE_P(Versions, Golden, testing::ValuesIn(allVersions()),
                         [](const auto& version) { return "Version" + std::to_string(version.param); });

}  // namespace
}  // namespace QeltTests
