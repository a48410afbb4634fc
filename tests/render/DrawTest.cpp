#include <dlfcn.h>
#include <gmock/gmock.h>

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <stdexcept>
#include <string>
#include <vector>

#include "gl/OpenGLRenderer.h"
#include "math/Matrix4.h"
#include "pen/DrawableFactory.h"
#include "render/RenderDrawables.h"
#include "support/DrawableBoard.h"
#include "support/FakeLayer.h"
#include "support/StampPicture.h"
#include "support/Stamps.h"

// Pictures, by way of a layer. Renderers differ in their last bits: what is compared here was drawn by one
// and the same, and even so a shifted picture is allowed a pixel here and there.
namespace QeltTests {
namespace {

using namespace Qelt;
using QeltDesktop::RenderQueue;

int viewportQueries = 0;

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

// Also of a drawable that dies in the middle of the stroke: what it handed over is drawn first.
TEST_P(Draw, IsSeamlessAcrossTilesAndFinishedWhenTheDrawableDies) {
  const auto drawn = [this](int tile) {
    BoardOptions options = paper(GetParam());
    options.tile = tile;
    DrawingBoard board(options);
    board.stroke(wave(kLeft, kTop));
    board.deleteDrawable();
    return board.pixels();
  };
  const Picture whole = drawn(kSide);
  EXPECT_GT(inked(whole), 1500);
  EXPECT_LE(differing(whole, drawn(64)), inked(whole) / 500);
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

TEST_P(Draw, GoesOnAfterTheContextIsLostAndRestored) {
  const std::vector<Sample> samples = wave(kLeft, kTop);
  DrawingBoard board(paper(GetParam()));
  board.stroke(samples);
  const Picture undisturbed = board.pixels();
  board.layer->clear();
  board.down(samples.front());
  board.move({samples.begin() + 1, samples.begin() + 12});
  board.queue.loseContext();
  board.move({samples.begin() + 12, samples.end()});  // no context: what was posted draws nothing
  board.queue.finish();
  board.queue.restoreContext();
  const int inkedBefore = inked(board.pixels());
  EXPECT_GT(inkedBefore, 100);
  EXPECT_LT(inkedBefore, inked(undisturbed));

  // What is drawn from now on looks as ever.
  board.layer->clear();
  board.stroke(samples);
  EXPECT_EQ(differing(undisturbed, board.pixels()), 0);
}

// Textures, program and buffer are made while there is no context; all of them come with it.
TEST_P(Draw, WhatWasPreparedWithoutAContextDrawsOnceThereIsOne) {
  const std::vector<Sample> samples = wave(kLeft, kTop);
  DrawingBoard board(paper(GetParam()));
  board.stroke(samples);
  const Picture undisturbed = board.pixels();
  for (const bool begins : {false, true}) {
    board.deleteDrawable();
    board.layer->clear();
    board.queue.loseContext();
    board.drawable.reset(createStrokeDrawable(GetParam(), &board.shared, &board.data));
    board.drawable->SetCanvas(&board.canvas);
    if (begins) board.stroke({samples.begin(), samples.begin() + 12});
    board.queue.finish();
    board.queue.restoreContext();
    board.stroke(samples);
    EXPECT_EQ(differing(undisturbed, board.pixels()), 0) << (begins ? "drawn with meanwhile" : "only made");
  }
}

// The start point cannot be found in the window while there is none; it waits for the first tile that is
// drawn.
TEST_P(Draw, AStrokeBegunWithoutAContextHasItsOwnGrain) {
  const std::vector<Sample> samples = wave(kLeft, kTop);
  const auto secondHalf = [&](bool loses) {
    DrawingBoard board(paper(GetParam()));
    board.queue.finish();
    if (loses) board.queue.loseContext();
    board.down(samples.front());
    board.move({samples.begin() + 1, samples.begin() + 12});
    board.queue.finish();
    if (loses) board.queue.restoreContext();
    board.layer->clear();
    board.move({samples.begin() + 12, samples.end()});
    return board.pixels();
  };
  const Picture expected = secondHalf(false);
  EXPECT_GT(inked(expected), 300);
  EXPECT_EQ(differing(secondHalf(true), expected), 0);
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

// --- The render drawable by itself ---

class RenderDrawable : public testing::Test {
 protected:
  RenderDrawable() {
    queue.run([this] { drawable.Init(); });
  }
  ~RenderDrawable() override {
    queue.run([this] { drawable.Release(); });
  }

  // A batch of one stamp of half width 20 in the middle of (x, 128).
  std::vector<float> stampAt(float x) {
    std::vector<float> batch;
    const Vector2<float> stamp[2] = {{x, 128.37f}, {0.0f, 1.0f}};
    drawable.SetInverseScale({1.0f, 1.0f});
    drawable.SetBuffer(&batch);
    drawable.AddPoint(stamp, 20.0f, 1.0f, 0.0f, 0);
    drawable.AddPoint({1.0f, 1.0f}, 5.0f);  // the host's own operation does nothing
    drawable.SetBuffer(nullptr);
    EXPECT_THAT(batch, BatchOf(1, 11));
    return batch;
  }
  // What was handed over, or the cached batch.
  void drawAll(bool useCache = false) {
    drawable.Update(useCache);
    ISPBitmap* const bitmap = layer.GetBitmap();
    for (int i = 0; i < bitmap->GetTileCount(); ++i) drawable.Draw(bitmap->GetSubBitmap(i), identity);
  }
  // The picture of one batch alone.
  Picture pictureOf(std::vector<float>& batch) {
    layer.clear();
    queue.run([&] {
      drawable.SetPenData(9.0f, static_cast<int>(0xFF000000u));
      drawable.SetStartPoint(60.37f, 128.37f);
      drawable.SendDataToGPU(&batch);
      drawAll();
      drawable.Clear();
    });
    return layer.readPixels();
  }

  RenderQueue queue{RenderQueue::Mode::Caller, RenderQueue::GL::Context};
  QeltDesktop::CanvasLayer layer{queue, kSide, kSide, 64};
  QeltDesktop::PenDataManager data{&queue};
  Pencil2StrokeDrawableRTV3 drawable{&data};
  Matrix4<float> identity;
};

TEST_F(RenderDrawable, DrawsTheBufferThatItsUpdateChose) {
  std::vector<float> live = stampAt(60.37f), cached = stampAt(190.37f);
  const Picture ofLive = pictureOf(live);
  EXPECT_GT(inked(ofLive), 500);
  EXPECT_EQ(alphaAt(ofLive, 190, 120), 0);
  // Cleared: emptied and its room kept.
  EXPECT_TRUE(live.empty());
  EXPECT_GE(live.capacity(), 66u);

  live = stampAt(60.37f);
  layer.clear();
  queue.run([&] {
    drawable.SendDataToGPU(&live);
    drawable.SetCacheBuffer(&cached);
    drawAll(true);
  });
  const Picture ofCached = layer.readPixels();
  EXPECT_GT(inked(ofCached), 500);
  EXPECT_EQ(alphaAt(ofCached, 60, 120), 0);

  layer.clear();
  queue.run([&] {
    drawable.Clear();
    drawAll();  // forgotten
  });
  EXPECT_EQ(inked(layer.readPixels()), 0);
  EXPECT_EQ(cached.size(), 66u);
}

// The window pixel of the start point: tiles are windows into one framebuffer, so it is the same in every
// tile, and the first one drawn settles it. A zoom afterwards changes nothing.
TEST_F(RenderDrawable, SettlesTheGrainOriginWithTheFirstTileDrawn) {
  std::vector<float> live = stampAt(60.37f);
  queue.run([&] {
    const int before = viewportQueries;
    drawable.SetStartPoint(60.25f, 130.5f);
    drawable.SendDataToGPU(&live);
    drawable.Update(false);
    EXPECT_EQ(drawable.grainOrigin().x, 60.25f);  // still in stroke units
    Matrix4<float> twice;
    twice[0] = twice[5] = 2.0f;
    drawable.Draw(layer.GetBitmap()->GetSubBitmap(6), twice);
    EXPECT_NEAR(drawable.grainOrigin().x, 120.5f, 1e-3f);
    EXPECT_NEAR(drawable.grainOrigin().y, 261.0f, 1e-3f);
    drawable.Draw(layer.GetBitmap()->GetSubBitmap(1), identity);
    EXPECT_NEAR(drawable.grainOrigin().x, 120.5f, 1e-3f);
    EXPECT_EQ(viewportQueries - before, 1);  // by the first tile alone
    drawable.Clear();
  });
}

// A tile that the host fails on is ended all the same.
TEST_F(RenderDrawable, EndsTheTileThatAnExceptionLeaves) {
  struct Tile : FakeTile {
    using FakeTile::FakeTile;
    const Matrix4<float>& GetProjection() const override { throw std::runtime_error("out of the host"); }
    void BeginRender(int) override { ++begun; }
    void EndRender(int) override { --begun; }
    int begun = 0;
  } tile(0);
  std::vector<float> live = stampAt(60.37f);
  queue.run([&] {
    drawable.SendDataToGPU(&live);
    drawable.Update(false);
    EXPECT_THROW(drawable.Draw(&tile, identity), std::runtime_error);
    drawable.Clear();
  });
  EXPECT_EQ(tile.begun, 0);
}

TEST_F(RenderDrawable, DrawsNothingWithoutATileOrABatchOrOnceReleased) {
  std::vector<float> live = stampAt(60.37f), empty;
  queue.run([&] {
    drawable.SendDataToGPU(&live);
    drawable.Update(false);
    drawable.Draw(nullptr, identity);
    drawable.SendDataToGPU(&empty);
    drawAll();
    drawable.Clear();
    drawAll(true);
  });
  EXPECT_EQ(inked(layer.readPixels()), 0);

  queue.run([&] {
    drawable.CreatePenCanvas(1, 1, nullptr);  // ready already
    drawable.Release();
    drawable.Release();
  });
  for (int i = 0; i < 2; ++i) {
    live = stampAt(60.37f);
    EXPECT_EQ(inked(pictureOf(live)), 0);
    queue.run([&] { drawable.Init(); });
  }
}

// Stamps of 100 x 100 units, each texel on pixels of its own: grain, mask, shade, and where a vertex has them
// the rim and the dimming of thin stamps. `look` is that at zoom 1; a stroke's grain is paper, not screen: it
// zooms with the view.
template <typename RenderDrawableType>
void expectStampsAsWorkedOut(float size, const StampPicture& look, bool grainZooms = true) {
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  QeltDesktop::CanvasLayer layer(queue, kSide, kSide);
  QeltDesktop::PenDataManager data(&queue);
  RenderDrawableType drawable(&data);
  for (const float zoom : {1.0f, 2.0f}) {
    Matrix4<float> view;
    view[0] = view[5] = zoom;
    for (int tile = 0; tile < 3; ++tile) {
      layer.clear();
      std::vector<float> batch;
      const Vector2<float> stamp[2] = {{60.0f, 65.0f}, {0.6f, 0.8f}};
      drawable.SetBuffer(&batch);
      drawable.AddPoint(stamp, size, 1.5f, 0.1f, tile);
      StampPicture expected = look;
      expected.stamp = stampsOf(batch, look.ramp ? 11 : 9).at(0);
      expected.zoomX = expected.zoomY = zoom;
      expected.startX = 60.37f * zoom;
      expected.startY = 65.61f * zoom;
      expected.grainX = expected.grainY = look.grainX * (grainZooms ? zoom : 1.0f);
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
      EXPECT_LT(expected.shareOff(layer.readPixels(), kSide, kSide, 0.5f), 0.02) << tile << " at " << zoom;
    }
  }
  queue.run([&] { drawable.Release(); });
}

TEST(StampPicturesTest, AreAsWorkedOutFragmentByFragment) {
  // The sizes of anti-aliased ones leave room for half a pixel of margin.
  expectStampsAsWorkedOut<Pencil2StrokeDrawableRTV1>(100.0f, {.stamp = {}});
  expectStampsAsWorkedOut<Pencil2PreviewDrawableRT>(100.0f, {.stamp = {}});
  expectStampsAsWorkedOut<Pencil2StrokeDrawableRTV2>(100.0f, {.stamp = {}, .grainX = 75.0f});
  expectStampsAsWorkedOut<Pencil2StrokeDrawableRTV3>(49.5f, {.stamp = {}, .grainX = 75.0f, .ramp = true});
  // Kept: a prediction's stamps are masked by squares of grain, and its grain has one size on screen.
  expectStampsAsWorkedOut<Pencil2PredictionDrawableRT>(49.5f, {.stamp = {}, .grainMask = true, .ramp = true},
                                                       false);
}

}  // namespace
}  // namespace QeltTests

// Stands before the host's own, to count.
Qelt::Vector4<int> Qelt::OpenGLRenderer::getViewport() {
  using Query = Qelt::Vector4<int> (*)();
  static const auto query =
      reinterpret_cast<Query>(dlsym(RTLD_NEXT, "_ZN4Qelt14OpenGLRenderer11getViewportEv"));
  ++QeltTests::viewportQueries;
  return query();
}
