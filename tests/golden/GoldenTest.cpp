#include <gtest/gtest.h>
#if defined __x86_64__
#include <cpuid.h>
#endif

#include <algorithm>
#include <cfenv>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <map>
#include <string>
#include <tuple>
#include <vector>

#include "golden/Golden.h"
#include "prediction/Pencil2PredictionDrawableGL.h"
#include "preview/Pencil2PreviewDrawableGL.h"
#include "support/DrawableBoard.h"
#include "support/Stamps.h"
#include "support/Versions.h"

// Each released version, frozen: the stamps of a few telling strokes, and their picture.
namespace QeltTests {
namespace {

using PreviewBoard = DrawableBoard<Qelt::Pencil2PreviewDrawableGL>;
using PredictionBoard = DrawableBoard<Qelt::Pencil2PredictionDrawableGL>;

std::string areaLine(const Qelt::RectF& rect) {
  return traceLine("area", {rect.left, rect.top, rect.right, rect.bottom});
}

// Who draws, as renderers.txt names it. A software renderer rounds as its processor does, so that belongs to
// it.
std::string rendererOf(const QeltDesktop::RenderQueue& queue) {
  std::string name = queue.rendererName();
#if defined __x86_64__
  unsigned int most = 0, vendor[3] = {}, features = 0, unused = 0;
  __cpuid(0, most, vendor[0], vendor[2], vendor[1]);
  __cpuid(1, most, unused, features, unused);
  name += ", " + std::string(reinterpret_cast<const char*>(vendor), sizeof vendor);
  if ((features & bit_FMA) != 0) name += " with FMA";
#endif
  return name;
}

// Ink on paper: what a board's layer holds.
GreyPicture pictureOf(Board& board) {
  board.queue.finish();
  GreyPicture picture{board.options.width, board.options.height, {}, board.pixels(), rendererOf(board.queue)};
  for (std::size_t i = 3; i < picture.channels.size(); i += 4)
    picture.pixels.push_back(static_cast<std::uint8_t>(255 - picture.channels[i]));
  return picture;
}

// --- Strokes ---

// Draws a stroke event by event and writes down stamps and areas, and at the end what the prediction is told.
void traceStroke(Trace& trace, const BoardOptions& options, float zoom, const std::vector<Sample>& samples) {
  DrawingBoard board(options);
  board.canvas.setMatrix(viewOf(zoom));
  const auto write = [&] {
    for (const Stamp& s : board.takeStamps()) {
      std::vector<float> numbers{s.x, s.y, s.halfWidth, s.halfHeight, s.alpha};
      numbers.insert(numbers.end(), {s.narrowing, static_cast<float>(s.tile), s.directionX, s.directionY});
      if (board.stride() == 11) numbers.insert(numbers.end(), {s.innerRadius, s.alphaByWidth});
      trace.push_back(traceLine("stamp", numbers));
    }
    trace.push_back(areaLine(board.rect));
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
  trace.push_back(traceLine(
      "state", {d.mStartX, d.mStartY, d.mLastWidth, d.mLastStampX, d.mLastStampY, d.mLastX, d.mLastY,
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

Trace strokeTrace(int version) {
  Trace trace;
  trace.emplace_back("curve, size 2, stylus");
  BoardOptions options{.version = version, .size = 2.0f, .color = 0x60203040u};
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
  traceStroke(trace, options, 1.0f, fingerMoves(expectedOf(version).shortMove));
  return trace;
}

class Golden : public testing::TestWithParam<int> {};

// A wave under growing pressure, shading with the pen laid down, and a straight hairline, thinner than a
// pixel.
TEST_P(Golden, PictureIsThatOfTheRelease) {
  DrawingBoard board(
      {.version = GetParam(), .size = 7.0f, .color = 0xA0203040u, .width = 160, .height = 120, .tile = 64});
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
  board.deleteDrawable();  // what was handed over is drawn first
  expectGoldenPicture(pictureOf(board), "picture-v" + std::to_string(GetParam()) + ".pgm");
}

INSTANTIATE_TEST_SUITE_P(Versions, Golden, testing::ValuesIn(allVersions()), versionName);

// --- Outlines, preview, prediction ---

// Each stamp's first vertex, and the opposite corner; then the area.
template <typename Board>
void traceCall(Trace& trace, Board& board) {
  const auto stride = static_cast<std::size_t>(board.stride());
  for (const std::vector<float>& floats : board.takeBuffers()) {
    trace.emplace_back("batch");
    for (std::size_t stamp = 0; stamp + 6 * stride <= floats.size(); stamp += 6 * stride) {
      const float* const first = &floats[stamp];
      std::vector<float> numbers(first, first + stride);
      numbers.insert(numbers.end(), first + 5 * stride, first + 5 * stride + 2);
      trace.push_back(traceLine("stamp", numbers));
    }
  }
  trace.push_back(areaLine(board.rect));
}

// Tilt from one cap over the other down again, the orientation across the wrap, and moves of 0.7 and 1.3
// among the longer ones.
const std::vector<Sample> kShortHand = {
    {10.13f, 10.29f, 0.20f, 0.79f, 2.90f},  {11.93f, 10.61f, 0.20f, 1.20f, -3.00f},
    {12.61f, 10.77f, 0.55f, 1.20f, -2.80f}, {13.89f, 10.93f, 0.55f, 0.77f, 2.60f},
    {16.97f, 13.03f, 1.00f, 0.40f, 2.20f},  {14.11f, 15.93f, 0.75f, 0.20f, 1.50f},
    {12.03f, 16.47f, 0.35f, 0.60f, 0.90f},
};

// A wave over most of a small page, the pen leaning more and more.
std::vector<Sample> wave() {
  std::vector<Sample> samples;
  for (int i = 0; i <= 24; ++i) {
    const auto t = static_cast<float>(i);
    samples.push_back(
        {14.13f + 5.3f * t, 40.39f + 18.0f * std::sin(0.5f * t), 0.3f + 0.025f * t, 0.04f * t, 0.7f});
  }
  return samples;
}

BoardOptions page(int version = kUsualVersion) {
  return {.version = version, .size = 7.0f, .color = 0xFF203040u, .width = 160, .height = 80, .tile = 64};
}

Trace outlineTrace(int version) {
  Trace trace;
  for (const bool curve : {true, false}) {
    OutlineBoard board({.version = version, .size = curve ? 2.0f : 0.8f, .curve = curve});
    board.drawable->SetOutlineSize(1.5f);
    board.outline(kShortHand);
    traceCall(trace, board);
  }
  return trace;
}

class OutlineGolden : public testing::TestWithParam<int> {};

TEST_P(OutlineGolden, PictureIsThatOfTheRelease) {
  OutlineBoard board(page(GetParam()));
  board.drawable->SetOutlineSize(4.0f);
  board.drawable->SetOutlineColor(static_cast<int>(0xFF2060C0u));
  board.outline(wave());
  expectGoldenPicture(pictureOf(board), "outline-picture-v" + std::to_string(GetParam()) + ".pgm");
}

INSTANTIATE_TEST_SUITE_P(Versions, OutlineGolden, testing::ValuesIn(outlineVersions()), versionName);

Trace previewTrace() {
  Trace trace;
  for (const bool curve : {true, false}) {
    PreviewBoard board({.size = curve ? 5.0f : 0.8f, .color = 0x60203040u, .curve = curve});
    board.redraw(board.recorded(kShortHand));
    traceCall(trace, board);
    board.down(kShortHand[0]);
    board.move({kShortHand[1], kShortHand[3], kShortHand[4]});
    board.up(kShortHand[5]);
    traceCall(trace, board);
  }
  return trace;
}

TEST(PreviewGolden, PictureIsThatOfTheRelease) {
  PreviewBoard board(page());
  board.redraw(board.recorded(wave()));
  expectGoldenPicture(pictureOf(board), "preview-picture.pgm");
}

void leaveStrokeOfGolden(Qelt::Pencil2Data& shared) {
  leaveStroke(shared, {12.13f, 20.39f}, {20.37f, 40.61f}, {24.71f, 44.29f});
  std::tie(shared.mLastWidth, shared.mLastOrientation, shared.mTiltBlend) = std::tuple(9.0f, 0.7f, 0.2f);
}

const std::vector<Sample> kAhead = {{40.13f, 52.77f}, {71.59f, 44.31f}, {105.23f, 20.87f}, {139.61f, 33.93f}};

Trace predictionTrace() {
  Trace trace;
  PredictionBoard board;
  leaveStrokeOfGolden(board.shared);
  board.move(kAhead);
  traceCall(trace, board);
  return trace;
}

TEST(PredictionGolden, PictureIsThatOfTheRelease) {
  PredictionBoard board(page());
  board.drawable->SetOpacity(0.8f);
  leaveStrokeOfGolden(board.shared);
  board.move(kAhead);
  expectGoldenPicture(pictureOf(board), "prediction-picture.pgm");
}

// The grain is fixed to where a stroke begins: here below the first row of tiles, and to the right of the
// first column, under a view that is zoomed and moved, or also turned and stretched, so that the grain's x
// and y differ. One picture under the other, of each kind of grain; of versions that came after the file, one
// in a file of its own.
class GrainGolden : public testing::TestWithParam<bool> {};
INSTANTIATE_TEST_SUITE_P(Views, GrainGolden, testing::Bool(),
                         [](const auto& test) { return test.param ? "Turned" : "Upright"; });

TEST_P(GrainGolden, PictureBelowTheFirstTilesIsThatOfTheRelease) {
  const std::string file = GetParam() ? "grain-picture-turned" : "grain-picture";
  Qelt::Matrix3<float> view = viewOf(1.5f, 32.0f, 22.0f);
  if (GetParam())
    view =
        viewOf(1.5f, -10.0f, 14.0f).preConcat(Qelt::Matrix3<float>().setRotate(10.0f)).preScale(1.2f, 0.8f);
  std::vector<Sample> shading;
  for (int i = 0; i <= 11; ++i) {
    const auto t = static_cast<float>(i);
    shading.push_back({46.37f + 2.9f * t, i % 2 == 0 ? 51.13f : 72.59f, 0.5f, 0.9f, -0.6f});
  }
  const auto draw = [&](GreyPicture& all, auto&& board, const auto& stroke) {
    board.canvas.setMatrix(view);
    stroke(board);
    const GreyPicture picture = pictureOf(board);
    const std::ptrdiff_t above = 80 * picture.width;
    all.pixels.insert(all.pixels.end(), picture.pixels.begin() + above, picture.pixels.end());
    all.channels.insert(all.channels.end(), picture.channels.begin() + 4 * above, picture.channels.end());
    all.width = picture.width;
    all.height += picture.height - 80;
    all.renderer = picture.renderer;
  };
  const BoardOptions options{.size = 7.0f, .color = 0x50203040u, .width = 160, .height = 144, .tile = 64};
  const auto draws = [&](auto& board) {
    board.stroke(shading);
    // A lone stamp so dense that its alpha is cut off at 1.
    board.settings.color = 0xFF203040u;
    board.settings.size = expectedOf(board.options.version).denseSize;
    board.stroke({{35.71f, 68.39f, 1.0f}, {35.71f, 68.39f, 1.0f}});
  };
  GreyPicture all;
  for (const int version : versionsOfRenderDrawables()) {
    BoardOptions ofVersion = options;
    ofVersion.version = version;
    GreyPicture ownFile;
    draw(version > kUsualVersion ? ownFile : all, DrawingBoard(ofVersion), draws);
    if (version > kUsualVersion) expectGoldenPicture(ownFile, file + "-v" + std::to_string(version) + ".pgm");
  }
  draw(all, PreviewBoard(options), draws);
  draw(all, PredictionBoard(options), [&](auto& board) {
    leaveStrokeOfGolden(board.shared);
    const Qelt::PointF first{shading[0].x, shading[0].y};
    leaveStroke(board.shared, first, first, first);
    board.move(shading);
  });
  expectGoldenPicture(all, file + ".pgm");
}

// --- All stamps, and on a thread whose host flushes denormals ---

void flushDenormals() {
#if defined __x86_64__
  __builtin_ia32_ldmxcsr(__builtin_ia32_stmxcsr() | 0x8040u);  // to zero, as results and as operands
#elif defined __aarch64__
  std::uint64_t control = 0;
  asm volatile("mrs %0, fpcr" : "=r"(control));
  asm volatile("msr fpcr, %0" : : "r"(control | 1u << 24));
#else
  GTEST_SKIP() << "not known how on this processor";
#endif
}

// The parameter: whether denormals are flushed.
class GoldenStamps : public testing::TestWithParam<bool> {
 protected:
  GoldenStamps() {
    fegetenv(&mFloats);
    if (GetParam()) flushDenormals();
  }
  ~GoldenStamps() override { fesetenv(&mFloats); }

 private:
  std::fenv_t mFloats;
};

TEST_P(GoldenStamps, AreThoseOfTheReleaseToTheLastBit) {
  std::map<std::string, Trace> traces;
  for (const int version : allVersions()) traces["stamps-v" + std::to_string(version)] = strokeTrace(version);
  for (const int version : outlineVersions())
    traces["outline-stamps-v" + std::to_string(version)] = outlineTrace(version);
  traces["preview-stamps"] = previewTrace();
  traces["prediction-stamps"] = predictionTrace();
  for (const auto& [file, trace] : traces) expectGoldenTrace(trace, file + ".txt");
}

INSTANTIATE_TEST_SUITE_P(Denormals, GoldenStamps, testing::Bool(),
                         [](const auto& test) { return test.param ? "Flushed" : "Kept"; });

}  // namespace
}  // namespace QeltTests
