#include <gtest/gtest.h>

#include <charconv>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "golden/Golden.h"
#include "outline/Pencil2OutlineDrawableGLV1.h"
#include "outline/Pencil2OutlineDrawableGLV2.h"
#include "outline/Pencil2OutlineDrawableGLV3.h"
#include "outline/Pencil2OutlineDrawableGLV4.h"
#include "outline/Pencil2OutlineDrawableGLV5.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "prediction/Pencil2PredictionDrawableGL.h"
#include "preview/Pencil2PreviewDrawableGL.h"
#include "stroke/DrawingBoard.h"
#include "support/DrawableBoard.h"

// Outlines of every version, the preview and the prediction, frozen as the strokes are (GoldenTest.cpp).
namespace QeltTests {
namespace {

using Qelt::MotionEvent;
using Qelt::RectF;

void append(std::string& text, float number) {
  char digits[32];
  const auto [end, error] = std::to_chars(digits, digits + sizeof digits, number);
  text += ' ';
  text.append(digits, end);
}

// Each stamp's first vertex, and the opposite corner.
void traceBatches(Trace& trace, const std::vector<QeltDesktop::Batch>& batches, std::size_t stride) {
  for (const QeltDesktop::Batch& batch : batches) {
    for (const std::vector<float>& floats : batch.buffers) {
      trace.emplace_back("batch");
      for (std::size_t stamp = 0; stamp + 6 * stride <= floats.size(); stamp += 6 * stride) {
        std::string text = "stamp";
        for (std::size_t i = 0; i < stride; ++i) append(text, floats[stamp + i]);
        append(text, floats[stamp + 5 * stride]);
        append(text, floats[stamp + 5 * stride + 1]);
        trace.push_back(text);
      }
    }
  }
}

void traceRect(Trace& trace, const RectF& rect) {
  std::string text = "area";
  for (const float edge : {rect.left, rect.top, rect.right, rect.bottom}) append(text, edge);
  trace.push_back(text);
}

// Tilt from one cap over the other down again, the orientation across the wrap, and moves of 0.7 and 1.3
// among the longer ones.
const std::vector<Sample> kHand = {
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

BoardOptions pageOptions() {
  BoardOptions options;
  options.color = 0xFF203040u;
  options.width = 160;
  options.height = 80;
  options.tile = 64;
  options.size = 7.0f;
  return options;
}

template <typename Drawable>
GreyPicture pictureOf(DrawableBoard<Drawable>& board) {
  board.queue.finish();
  const std::vector<std::uint8_t> pixels = board.layer->readPixels();
  GreyPicture picture{board.options.width, board.options.height, {}};
  for (std::size_t i = 3; i < pixels.size(); i += 4)
    picture.pixels.push_back(static_cast<std::uint8_t>(255 - pixels[i]));
  return picture;
}

template <typename Drawable>
class OutlineGolden : public testing::Test {};

using OutlineVersions = testing::Types<Qelt::Pencil2OutlineDrawableGLV1, Qelt::Pencil2OutlineDrawableGLV2,
                                       Qelt::Pencil2OutlineDrawableGLV3, Qelt::Pencil2OutlineDrawableGLV4,
                                       Qelt::Pencil2OutlineDrawableGLV5>;

template <typename Drawable>
std::string versionOf();
template <>
std::string versionOf<Qelt::Pencil2OutlineDrawableGLV1>() {
  return "1";
}
template <>
std::string versionOf<Qelt::Pencil2OutlineDrawableGLV2>() {
  return "2";
}
template <>
std::string versionOf<Qelt::Pencil2OutlineDrawableGLV3>() {
  return "3";
}
template <>
std::string versionOf<Qelt::Pencil2OutlineDrawableGLV4>() {
  return "4";
}
template <>
std::string versionOf<Qelt::Pencil2OutlineDrawableGLV5>() {
  return "5";
}

struct OutlineNames {
  template <typename Drawable>
  static std::string GetName(int) {
    return "Version" + versionOf<Drawable>();
  }
};
TYPED_TEST_SUITE(OutlineGolden, OutlineVersions, OutlineNames);

TYPED_TEST(OutlineGolden, StampsAreThoseOfTheRelease) {
  Trace trace;
  for (const bool curve : {true, false}) {
    BoardOptions options;
    options.size = curve ? 2.0f : 0.8f;
    options.curve = curve;
    DrawableBoard<TypeParam> board(options);
    board.drawable->SetOutlineSize(1.5f);
    const MotionEvent event = board.recorded(kHand);
    board.drawable->DrawOutline(&event, &board.rect);
    traceBatches(trace, board.takeBatches(), 7);
    traceRect(trace, board.rect);
  }
  expectGoldenTrace(trace, "outline-stamps-v" + versionOf<TypeParam>() + ".txt");
}

TYPED_TEST(OutlineGolden, PictureIsThatOfTheRelease) {
  DrawableBoard<TypeParam> board(pageOptions());
  board.drawable->SetOutlineSize(4.0f);
  board.drawable->SetOutlineColor(static_cast<int>(0xFF2060C0u));
  const MotionEvent event = board.recorded(wave());
  board.drawable->DrawOutline(&event, &board.rect);
  expectGoldenPicture(pictureOf(board), "outline-picture-v" + versionOf<TypeParam>() + ".pgm");
}

TEST(PreviewGolden, StampsAreThoseOfTheRelease) {
  Trace trace;
  for (const bool curve : {true, false}) {
    BoardOptions options;
    options.size = curve ? 5.0f : 0.8f;
    options.color = 0x60203040u;
    options.curve = curve;
    DrawableBoard<Qelt::Pencil2PreviewDrawableGL> board(options);
    const MotionEvent event = board.recorded(kHand);
    board.drawable->RedrawPen(&event, &board.rect);
    traceBatches(trace, board.takeBatches(), 9);
    traceRect(trace, board.rect);
    board.down(kHand[0]);
    board.move({kHand[1], kHand[3], kHand[4]});
    board.up(kHand[5]);
    traceBatches(trace, board.takeBatches(), 9);
    traceRect(trace, board.rect);
  }
  expectGoldenTrace(trace, "preview-stamps.txt");
}

TEST(PreviewGolden, PictureIsThatOfTheRelease) {
  DrawableBoard<Qelt::Pencil2PreviewDrawableGL> board(pageOptions());
  const MotionEvent event = board.recorded(wave());
  board.drawable->RedrawPen(&event, &board.rect);
  expectGoldenPicture(pictureOf(board), "preview-picture.pgm");
}

// What a live stroke might have left.
void leaveStroke(Qelt::Pencil2Data& shared) {
  shared.mStartX = 12.13f;
  shared.mStartY = 20.39f;
  shared.mLastStampX = 20.37f;
  shared.mLastStampY = 40.61f;
  shared.mLastX = 24.71f;
  shared.mLastY = 44.29f;
  shared.mLastWidth = 9.0f;
  shared.mLastAlpha = 0.6f;
  shared.mLastOrientation = 0.7f;
  shared.mStampCount = 7;
  shared.mTiltBlend = 0.2f;
  shared.mHasLastStroke = true;
}

const std::vector<Sample> kAhead = {{40.13f, 52.77f}, {71.59f, 44.31f}, {105.23f, 20.87f}, {139.61f, 33.93f}};

TEST(PredictionGolden, StampsAreThoseOfTheRelease) {
  Trace trace;
  DrawableBoard<Qelt::Pencil2PredictionDrawableGL> board;
  leaveStroke(board.shared);
  board.move(kAhead);
  traceBatches(trace, board.takeBatches(), 11);
  traceRect(trace, board.rect);
  expectGoldenTrace(trace, "prediction-stamps.txt");
}

TEST(PredictionGolden, PictureIsThatOfTheRelease) {
  DrawableBoard<Qelt::Pencil2PredictionDrawableGL> board(pageOptions());
  board.drawable->SetOpacity(0.8f);
  leaveStroke(board.shared);
  board.move(kAhead);
  expectGoldenPicture(pictureOf(board), "prediction-picture.pgm");
}

// Kept: before a stroke's first stamp the prediction goes on from wherever the stroke before it ended.
TEST(Prediction, BeforeTheFirstStampStartsFromTheStrokeBefore) {
  DrawableBoard<Qelt::Pencil2PredictionDrawableGL> board;
  leaveStroke(board.shared);
  // A new stroke far away has begun, and has not placed a stamp yet.
  board.shared.mStartX = board.shared.mLastX = 500.0f;
  board.shared.mStartY = board.shared.mLastY = 500.0f;
  board.shared.mStampCount = 0;
  board.move({{510.0f, 500.0f}});
  const std::vector<float> floats = board.takeFloats();
  ASSERT_GE(floats.size(), 66u);
  // The first stamp lies one unit from the old stroke's last one, and is 5 units wide either way.
  EXPECT_NEAR((floats[0] + floats[55]) / 2.0f, 20.37f, 1.0f);
  EXPECT_NEAR((floats[1] + floats[56]) / 2.0f, 40.61f, 1.0f);
}

}  // namespace
}  // namespace QeltTests
