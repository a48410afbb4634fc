#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <utility>
#include <vector>

#include "math/Matrix4.h"
#include "render/RenderDrawables.h"
#include "support/DrawableBoard.h"
#include "support/StampPicture.h"
#include "support/Stamps.h"

// Pictures, by way of a layer.
namespace QeltTests {
namespace {

using namespace Qelt;
using QeltDesktop::RenderQueue;

constexpr int kPictureSide = 256;

class Draw : public testing::TestWithParam<int> {};

// What a drawable that dies in the middle of the stroke handed over is drawn first. The layer holds
// premultiplied colour: wherever there is ink, it is the pen's.
TEST_P(Draw, IsFinishedInThePensColourWhenTheDrawableDies) {
  DrawingBoard board({.version = GetParam(),
                      .size = 9.0f,
                      .color = 0xFF00FF40u,  // red 0, green 255, blue 64
                      .width = kPictureSide,
                      .height = kPictureSide});
  std::vector<Sample> wave;
  for (int i = 0; i <= 24; ++i) {
    const auto t = static_cast<float>(i);
    wave.push_back({31.37f + 5.0f * t, 53.61f - 28.0f * std::cos(t * 0.4f), 0.5f, 0.03f * t, 0.8f});
  }
  board.stroke(wave);
  board.deleteDrawable();
  int inked = 0;
  const std::vector<std::uint8_t> picture = board.pixels();
  for (std::size_t i = 0; i < picture.size(); i += 4) {
    const int alpha = picture[i + 3];
    inked += alpha != 0 ? 1 : 0;
    ASSERT_EQ(picture[i], 0);
    // Some renderers round every blend up.
    ASSERT_NEAR(picture[i + 1], alpha, 16);
    ASSERT_NEAR(picture[i + 2], alpha * 64 / 255, 16);
  }
  EXPECT_GT(inked, 1500);
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

INSTANTIATE_TEST_SUITE_P(RenderVersions, Draw, testing::ValuesIn(versionsOfRenderDrawables()), versionName);

// Stamps of 100 x 100 units, each texel on pixels of its own: grain, mask, shade, and where a vertex has them
// the rim and the dimming of thin stamps. `look` is that at zoom 1; a stroke's grain is paper, not screen: it
// zooms with the view.
enum class Grain { OfPaper, OfScreen, Swapped };

template <typename RenderDrawableType>
void expectStampsAsWorkedOut(float size, const StampPicture& look, Grain grain = Grain::OfPaper) {
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  QeltDesktop::CanvasLayer layer(queue, kPictureSide, kPictureSide);
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
        drawable.CreatePenCanvas(kPictureSide, kPictureSide, &queue);
        drawable.SetPenData(9.0f, static_cast<int>(0xFF000000u));
        drawable.SetStartPoint(60.37f, 65.61f);
        drawable.SendDataToGPU(&batch);
        drawable.Update(false);
        drawable.Draw(layer.GetBitmap()->GetSubBitmap(0), view);
      });
      EXPECT_LT(expected.shareOff(layer.readPixels(), kPictureSide, kPictureSide, 0.5f), 0.02);
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
