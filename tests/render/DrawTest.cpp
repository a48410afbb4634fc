#include <gmock/gmock.h>

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <utility>
#include <vector>

#include "math/Matrix4.h"
#include "render/RenderDrawables.h"
#include "support/DrawableBoard.h"
#include "support/StampPicture.h"
#include "support/Stamps.h"

// Pictures, by way of a layer. Renderers differ in their last bits: what is compared here was drawn by one
// and the same, and even so a shifted picture is allowed a pixel here and there.
namespace QeltTests {
namespace {

using namespace Qelt;
using QeltDesktop::RenderQueue;

constexpr int kSide = 256;

// A picture of kSide x kSide pixels.
using Picture = std::vector<std::uint8_t>;

int alphaAt(const Picture& picture, int x, int y) {
  return picture[(static_cast<std::size_t>(y) * kSide + static_cast<std::size_t>(x)) * 4 + 3];
}

int inked(const Picture& picture) {
  int count = 0;
  for (std::size_t i = 3; i < picture.size(); i += 4) count += picture[i] != 0 ? 1 : 0;
  return count;
}

// How many pixels of `a` differ from those of `b` that lie (dx, dy) further, by more than 8 of 255.
int differing(const Picture& a, const Picture& b, int dx = 0, int dy = 0) {
  int count = 0;
  for (int y = std::max(0, -dy); y < std::min(kSide, kSide - dy); ++y) {
    for (int x = std::max(0, -dx); x < std::min(kSide, kSide - dx); ++x)
      count += std::abs(alphaAt(a, x, y) - alphaAt(b, x + dx, y + dy)) > 8 ? 1 : 0;
  }
  return count;
}

BoardOptions paper(int version) {
  BoardOptions options;
  options.version = version;
  options.size = 9.0f;
  options.width = options.height = kSide;
  return options;
}

// A wave across some 120 x 60 units, off the grid of quarter pixels.
std::vector<Sample> wave(float left, float top) {
  std::vector<Sample> samples;
  for (int i = 0; i <= 24; ++i) {
    const auto t = static_cast<float>(i);
    samples.push_back(
        {left + 5.0f * t, top + 30.0f - 28.0f * std::cos(t * 0.4f), 0.3f + 0.02f * t, 0.03f * t, 0.8f});
  }
  return samples;
}

constexpr float kLeft = 31.37f, kTop = 23.61f;

// The versions that bring something of their own to the render thread: RTV1, RTV2, RTV3.
class Draw : public testing::TestWithParam<int> {};

TEST_P(Draw, HasTheGrainFixedToTheStartPoint) {
  DrawingBoard board(paper(GetParam()));
  board.stroke(wave(kLeft, kTop));
  const Picture first = board.pixels();
  ASSERT_GT(inked(first), 1500);
  board.layer->clear();
  board.stroke(wave(kLeft + 64.0f, kTop + 96.0f));
  const Picture shifted = board.pixels();
  EXPECT_LE(differing(first, shifted, 64, 96), inked(first) / 200);
  // A shift by any other way shows other grain.
  EXPECT_GT(differing(first, shifted, 63, 96), inked(first) / 5);
}

// A straight stroke posts no start point: its grain is that of the stroke before, here a tap.
TEST_P(Draw, StraightStrokesKeepTheGrainWhereItWas) {
  DrawingBoard board(paper(GetParam()));
  const auto straightAfterTapAt = [&](float x, float y) {
    board.shared.mCurveEnabled = true;
    board.stroke({{x, y}, {x, y}});
    board.queue.finish();
    board.layer->clear();
    board.shared.mCurveEnabled = false;
    board.stroke(wave(kLeft, kTop));
    return board.pixels();
  };
  const Picture a = straightAfterTapAt(40.37f, 40.61f);
  EXPECT_GT(differing(a, straightAfterTapAt(51.37f, 47.61f)), inked(a) / 5);
  EXPECT_EQ(differing(a, straightAfterTapAt(40.37f, 40.61f)), 0);
}

// What a drawable that dies in the middle of the stroke handed over is drawn first.
TEST_P(Draw, IsFinishedWhenTheDrawableDies) {
  DrawingBoard board(paper(GetParam()));
  board.stroke(wave(kLeft, kTop));
  board.deleteDrawable();
  EXPECT_GT(inked(board.pixels()), 1500);
}

// The layer holds premultiplied colour: wherever there is ink, it is the pen's.
TEST_P(Draw, InksInThePensColour) {
  BoardOptions options = paper(GetParam());
  options.color = 0xFF00FF40u;  // red 0, green 255, blue 64
  DrawingBoard board(options);
  board.stroke(wave(kLeft, kTop));
  const Picture picture = board.pixels();
  for (std::size_t i = 0; i < picture.size(); i += 4) {
    const int alpha = picture[i + 3];
    ASSERT_EQ(picture[i], 0);
    // Some renderers round every blend up.
    ASSERT_NEAR(picture[i + 1], alpha, 16);
    ASSERT_NEAR(picture[i + 2], alpha * 64 / 255, 16);
  }
}

// Kept: the grain's size is what the diagonal of a 150-unit square spans in x and in y, which a rotation
// makes unequal. By 30 degrees: (cos - sin) * 150 / 2 and (sin + cos) * 150 / 2.
TEST(GrainSize, UnderARotationIsWhatTheDiagonalSpans) {
  Matrix4<float> turned;
  turned[0] = turned[5] = 0.8660254f;
  turned[1] = 0.5f;
  turned[4] = -0.5f;
  const Vector2<float> size = Pencil2StrokeDrawableRTV3::grainSize(turned);
  EXPECT_NEAR(size.x, 27.451906f, 1e-4f);
  EXPECT_NEAR(size.y, 102.451906f, 1e-4f);
}

INSTANTIATE_TEST_SUITE_P(RenderVersions, Draw, testing::Values(1, 7, 8),
                         [](const auto& version) { return "Version" + std::to_string(version.param); });

// Stamps of 100 x 100 units, each texel on pixels of its own: grain, mask, shade, and where a vertex has them
// the rim and the dimming of thin stamps. `look` is that at zoom 1; a stroke's grain is paper, not screen: it
// zooms with the view.
enum class Grain { OfPaper, OfScreen, Swapped };

template <typename RenderDrawableType>
void expectStampsAsWorkedOut(float size, const StampPicture& look, Grain grain = Grain::OfPaper) {
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  QeltDesktop::CanvasLayer layer(queue, kSide, kSide);
  QeltDesktop::PenDataManager data(&queue);
  RenderDrawableType drawable(&data);
  for (const auto& [zoomX, zoomY] : {std::pair{1.0f, 1.0f}, {2.0f, 1.0f}, {2.0f, 2.0f}}) {
    Matrix4<float> view;
    view[0] = zoomX;
    view[5] = zoomY;
    for (int tile = 0; tile < 3; ++tile) {
      SCOPED_TRACE(testing::Message() << "shape " << tile << " at " << zoomX << ", " << zoomY);
      layer.clear();
      std::vector<float> batch;
      const Vector2<float> stamp[2] = {{60.0f, 65.0f}, {0.6f, 0.8f}};
      drawable.SetBuffer(&batch);
      drawable.AddPoint(stamp, size, 1.5f, 0.1f, tile);
      StampPicture expected = look;
      expected.stamp = stampsOf(batch, look.ramp ? 11 : 9).at(0);
      expected.zoomX = zoomX;
      expected.zoomY = zoomY;
      expected.startX = 60.37f * zoomX;
      expected.startY = 65.61f * zoomY;
      const bool swaps = grain == Grain::Swapped;
      expected.grainX = look.grainX * (grain == Grain::OfScreen ? 1.0f : swaps ? zoomY : zoomX);
      expected.grainY = look.grainX * (grain == Grain::OfScreen ? 1.0f : swaps ? zoomX : zoomY);
      if (look.ramp) {
        for (std::size_t i = 10; i < batch.size(); i += 11) batch[i] = 0.625f;
        expected.stamp.alphaByWidth = 0.625f;
      }
      queue.run([&] {
        drawable.CreatePenCanvas(kSide, kSide, &queue);
        drawable.SetPenData(9.0f, static_cast<int>(0xFF000000u));
        drawable.SetStartPoint(60.37f, 65.61f);
        drawable.SendDataToGPU(&batch);
        drawable.Update(false);
        drawable.Draw(layer.GetBitmap()->GetSubBitmap(0), view);
      });
      EXPECT_LT(expected.shareOff(layer.readPixels(), kSide, kSide, 0.5f), 0.02);
    }
  }
  queue.run([&] { drawable.Release(); });
}

TEST(StampPicturesTest, AreAsWorkedOutFragmentByFragment) {
  // The sizes of anti-aliased ones leave room for half a pixel of margin.
  expectStampsAsWorkedOut<Pencil2StrokeDrawableRTV1>(100.0f, {.stamp = {}});
  expectStampsAsWorkedOut<Pencil2StrokeDrawableRTV2>(100.0f, {.stamp = {}, .grainX = 75.0f});
  expectStampsAsWorkedOut<Pencil2StrokeDrawableRTV3>(49.5f, {.stamp = {}, .grainX = 75.0f, .ramp = true});
  // Kept: the grain of a preview goes in x by the height of its tile on screen, in y by the width.
  expectStampsAsWorkedOut<Pencil2PreviewDrawableRT>(100.0f, {.stamp = {}}, Grain::Swapped);
  // Kept: a prediction's stamps are masked by squares of grain, and its grain has one size on screen.
  expectStampsAsWorkedOut<Pencil2PredictionDrawableRT>(49.5f, {.stamp = {}, .grainMask = true, .ramp = true},
                                                       Grain::OfScreen);
}

}  // namespace
}  // namespace QeltTests
