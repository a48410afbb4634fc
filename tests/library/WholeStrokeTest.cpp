// Strokes drawn as a host draws them: events into the built library, batches and pixels out of it.

#include <gmock/gmock.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <string>
#include <vector>

#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "gl/ITask.h"
#include "support/LiveStroke.h"
#include "support/LogCapture.h"
#include "support/Stamps.h"
#include "support/Versions.h"

namespace QeltTests {
namespace {

using testing::AllOf;
using testing::Each;
using testing::ElementsAre;
using testing::Field;
using testing::FloatNear;
using testing::Ge;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Le;
using testing::SizeIs;

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();

std::vector<Stamp> allStamps(LiveStroke& stroke, int stride = 11) {
  std::vector<Stamp> stamps;
  for (const std::vector<float>& batch : stroke.takeBatches()) {
    const std::vector<Stamp> more = stampsOf(batch, stride);
    stamps.insert(stamps.end(), more.begin(), more.end());
  }
  return stamps;
}

int alphaAt(const std::vector<std::uint8_t>& pixels, int width, int x, int y) {
  return pixels[(static_cast<std::size_t>(y) * width + x) * 4 + 3];
}

// A wavy line through the middle of a picture.
void drawWave(LiveStroke& stroke, float x, float y, float pressure = 0.8f) {
  stroke.down({x, y, pressure});
  for (int step = 1; step <= 10; ++step) {
    const float along = 14.0f * static_cast<float>(step);
    stroke.move({{x + along - 7.0f, y + 10.0f * std::sin(along * 0.05f - 0.2f), pressure},
                 {x + along, y + 10.0f * std::sin(along * 0.05f), pressure}});
  }
  stroke.up({x + 140.0f, y + 10.0f * std::sin(7.0f), pressure});
}

// The layer after one wave that starts at (x, y), in tiles of `tile` pixels.
std::vector<std::uint8_t> pictureOfWave(float x, float y, int tile) {
  LiveStrokeOptions options;
  options.picture = true;
  options.tile = tile;
  LiveStroke stroke(options);
  drawWave(stroke, x, y);
  return stroke.pixels();
}

TEST(WholeStroke, ATapPlacesOneStampAtTheDownPoint) {
  LiveStroke stroke;
  EXPECT_TRUE(stroke.down({50.3f, 60.7f, 0.5f}));
  EXPECT_THAT(stroke.takeBatches(), ElementsAre(BatchOf(0, 11)))
      << "a down hands over a batch without stamps";
  EXPECT_TRUE(stroke.up({50.3f, 60.7f, 0.5f}));
  const std::vector<Stamp> stamps = allStamps(stroke);
  ASSERT_THAT(stamps, ElementsAre(StampNear(50.3f, 60.7f, 1e-4f)));
  // Half of 12, and half a pixel of rim.
  EXPECT_NEAR(stamps[0].halfWidth, 6.5f, 1e-4f);
  // 0.25 * 255 / 80 * 15 / 12 / 6, without a ramp.
  EXPECT_NEAR(stamps[0].alpha, 0.166016f, 1e-5f);
  // The point grown by 5 on each side, and the stamp's quarter width is inside.
  EXPECT_NEAR(stroke.rect().left, 45.3f, 1e-4f);
  EXPECT_NEAR(stroke.rect().bottom, 65.7f, 1e-4f);
}

TEST(WholeStroke, StraightStampsLieEvenlyAndFadeIn) {
  LiveStrokeOptions options;
  options.curve = false;
  LiveStroke stroke(options);
  stroke.down({10.0f, 20.0f, 0.6f});
  stroke.takeBatches();
  EXPECT_TRUE(stroke.move({{14.0f, 20.0f, 0.6f}}));
  const std::vector<Stamp> stamps = allStamps(stroke);
  // Length 4, first stamp 0.4 along, then every 0.4: trunc((4 - 0.4) / 0.4) + 1 = 10 steps, or 9 where the
  // division rounds down; the walk itself decides.
  ASSERT_THAT(stamps, SizeIs(AllOf(Ge(9u), Le(10u))));
  // 0.36 * 255 / 80 * 15 / 12 / 6 at the end; the ramp starts at 0.
  const float target = 0.36f * 255.0f / 80.0f * 15.0f / 12.0f / 6.0f;
  EXPECT_EQ(stamps[0].alpha, 0.0f);
  for (std::size_t i = 0; i < stamps.size(); ++i) {
    const float number = static_cast<float>(i);
    EXPECT_THAT(stamps[i], StampNear(10.0f + 0.4f * (number + 1.0f), 20.0f, 0.011f)) << i;
    EXPECT_NEAR(stamps[i].alpha, target * number / 10.0f, target * 0.12f) << i;
    EXPECT_EQ(stamps[i].tile, static_cast<int>(i % 3)) << i;
  }
}

TEST(WholeStroke, StampsRunOnEvenlyAcrossEvents) {
  LiveStroke stroke;
  drawWave(stroke, 20.2f, 60.1f);
  const std::vector<Stamp> stamps = allStamps(stroke);
  ASSERT_GT(stamps.size(), 300u);
  for (std::size_t i = 1; i < stamps.size(); ++i) {
    EXPECT_NEAR(std::hypot(stamps[i].x - stamps[i - 1].x, stamps[i].y - stamps[i - 1].y), 0.4f, 0.03f) << i;
    EXPECT_EQ(stamps[i].tile, static_cast<int>(i % 3)) << i;
  }
}

TEST(WholeStroke, EveryEventPostsItsBatchAndThenDeletesIt) {
  LiveStroke stroke;
  stroke.down({10, 10});
  // Grain origin and pen data, the rectangle, and the batch's three.
  EXPECT_THAT(
      stroke.takePosted(),
      ElementsAre(HasSubstr("Pencil2StrokeDrawableRTV3, void (Qelt::Pencil2StrokeDrawableRTV3::*)(float, "
                            "float)"),
                  HasSubstr("(float, int)"), HasSubstr("(Qelt::RectF)"), HasSubstr("std::vector<float"),
                  HasSubstr("PenGLRenderMsg"), HasSubstr("Delete<std::vector<float")));
  stroke.draw(Qelt::kActionCancel, {{10, 10}});
  EXPECT_THAT(stroke.takePosted(), SizeIs(4)) << "the rectangle and the batch, whatever the action";
}

TEST(WholeStroke, MovesBeforeADownAndSecondUpsDrawNothing) {
  LiveStroke stroke;
  EXPECT_FALSE(stroke.move({{10, 10}, {40, 40}}));
  EXPECT_FALSE(stroke.up({40, 40}));
  EXPECT_TRUE(stroke.down({10, 10}));
  EXPECT_FALSE(stroke.draw(Qelt::kActionCancel, {{15, 15}}));
  EXPECT_TRUE(stroke.move({{20, 10}})) << "a cancel leaves the stroke as it was";
  EXPECT_TRUE(stroke.up({30, 10}));
  EXPECT_FALSE(stroke.up({30, 10}));
}

TEST(WholeStroke, ShortMovesWaitUntilTheyAddUp) {
  LiveStrokeOptions options;
  options.size = 10.0f;  // moves below 2 are dropped
  LiveStroke stroke(options);
  stroke.down({10, 10});
  stroke.takeBatches();
  stroke.move({{11.9f, 10}});
  EXPECT_THAT(allStamps(stroke), IsEmpty());
  stroke.move({{12.1f, 10}});
  EXPECT_THAT(allStamps(stroke), Not(IsEmpty())) << "measured from the down point, not from the dropped one";
}

TEST(WholeStroke, AFingersMovesBelowTwentyAreTakenEveryOtherTime) {
  LiveStrokeOptions options;
  options.toolType = Qelt::kToolFinger;
  options.source = Qelt::kSourceTouchScreen;
  LiveStroke stroke(options);
  stroke.down({10, 10, 0.0f});
  stroke.takeBatches();
  stroke.move({{20, 10, 0.0f}});
  EXPECT_THAT(allStamps(stroke), IsEmpty());
  stroke.move({{22, 10, 0.0f}});
  const std::vector<Stamp> stamps = allStamps(stroke);
  EXPECT_THAT(stamps, Not(IsEmpty()));
  stroke.move({{32, 10, 0.0f}, {60, 10, 0.0f}});
  EXPECT_THAT(allStamps(stroke), Not(IsEmpty())) << "a long move is always taken";
}

TEST(WholeStroke, TiltIsCappedAndWrittenBack) {
  LiveStroke stroke;
  stroke.down({10, 10, 0.5f, 1.2f});
  EXPECT_EQ(stroke.event().GetTilt(0), 0.79f);
  stroke.move({{20, 10, 0.5f, 1.3f}, {30, 10, 0.5f, 0.4f}});
  EXPECT_EQ(stroke.event().GetHistoricalTilt(0), 0.79f);
  EXPECT_EQ(stroke.event().GetTilt(0), 0.4f);
}

TEST(WholeStroke, DirectionHoldsWhereTheAngleWrapsRound) {
  LiveStroke stroke;
  stroke.down({10, 10, 0.5f, 0.3f, 3.1f});
  stroke.takeBatches();
  for (int step = 1; step <= 8; ++step) {
    stroke.move({{10.0f + 8.0f * static_cast<float>(step), 10, 0.5f, 0.3f, step % 2 == 0 ? 3.1f : -3.1f}});
  }
  // A mean near pi points down: (-sin, cos) = (0, -1). Near 0 it would point up.
  EXPECT_THAT(allStamps(stroke), Each(Field(&Stamp::directionY, FloatNear(-1.0f, 0.01f))));
}

TEST(WholeStroke, WhatIsNoNumberNeverReachesAStamp) {
  for (const int version : allVersions()) {
    LiveStrokeOptions options;
    options.renderingVersion = version;
    LiveStroke stroke(options);
    const float infinite = std::numeric_limits<float>::infinity();
    EXPECT_FALSE(stroke.down({kNaN, 10, 0.5f})) << version;
    stroke.down({10, 10, kNaN, kNaN, kNaN});
    stroke.move({{60, 10, kNaN, kNaN, kNaN}, {kNaN, 20, 0.5f}, {90, infinite, 0.5f}, {110, 30, 0.5f}});
    stroke.move({{160, 10, 0.5f, infinite, -infinite}});
    stroke.up({190, 40, kNaN, kNaN, kNaN});
    int floats = 0;
    for (const std::vector<float>& batch : stroke.takeBatches()) {
      for (const float value : batch) {
        ASSERT_TRUE(std::isfinite(value)) << "version " << version;
        ++floats;
      }
    }
    EXPECT_GT(floats, 0) << "version " << version;
  }
}

TEST(WholeStroke, EndlessSegmentsAreCutShortAndSaidOnceAStroke) {
  LogCapture log;
  LiveStrokeOptions options;
  options.curve = false;
  LiveStroke stroke(options);
  stroke.down({0, 0});
  stroke.takeBatches();
  log.take();
  stroke.move({{1e30f, 0}});
  EXPECT_THAT(stroke.takeBatches(), ElementsAre(BatchOf(262144, 11)));
  stroke.move({{20, 20}});
  stroke.takeBatches();
  const std::vector<LogLine> lines = log.take();
  ASSERT_THAT(lines, SizeIs(1)) << "two segments were cut";
  EXPECT_EQ(lines[0].priority, 6);
  EXPECT_EQ(lines[0].tag, "qel_log");
  EXPECT_THAT(lines[0].text, HasSubstr("cut short"));
  // The next segment starts as if the walk had ended on its spacing: 40 units, a stamp every 0.4.
  stroke.move({{60, 20}});
  EXPECT_THAT(allStamps(stroke), SizeIs(AllOf(Ge(99u), Le(101u))));
}

TEST(WholeStroke, OddSizesPlaceNothing) {
  for (const float size : {0.0f, -3.0f, kNaN, std::numeric_limits<float>::infinity()}) {
    for (const int version : allVersions()) {
      LiveStrokeOptions options;
      options.size = size;
      options.renderingVersion = version;
      LiveStroke stroke(options);
      stroke.down({10, 10});
      stroke.move({{60, 10}, {90, 50}});
      stroke.up({100, 60});
      EXPECT_THAT(allStamps(stroke, strideOf(version)), IsEmpty())
          << "size " << size << ", version " << version;
    }
  }
}

TEST(WholeStroke, RefusedPostsLoseThePictureAndNothingElse) {
  LiveStroke stroke;
  stroke.queue().accept = [](const Qelt::ITask&) { return false; };
  stroke.down({10, 10});
  stroke.move({{60, 10}, {90, 50}});
  stroke.up({100, 60});
  EXPECT_THAT(stroke.takeBatches(), IsEmpty());
  stroke.queue().accept = nullptr;
  drawWave(stroke, 20, 30);
  EXPECT_THAT(allStamps(stroke), Not(IsEmpty()));
}

TEST(WholeStroke, NullArgumentsAreRefused) {
  LiveStroke stroke;
  Qelt::RectF rect;
  EXPECT_FALSE(stroke.drawable().Draw(nullptr, &rect));
  stroke.down({10, 10});
  EXPECT_FALSE(stroke.drawable().Draw(&stroke.event(), nullptr));
}

TEST(WholeStroke, EveryVersionDrawsTheWave) {
  for (const int version : allVersions()) {
    LiveStrokeOptions options;
    options.renderingVersion = version;
    LiveStroke stroke(options);
    drawWave(stroke, 20, 60);
    EXPECT_THAT(allStamps(stroke, strideOf(version)), SizeIs(Ge(20u))) << "version " << version;
  }
}

TEST(Picture, TheStrokeCoversItsLineAndNothingFarFromIt) {
  LiveStrokeOptions options;
  options.picture = true;
  options.thread = true;
  LiveStroke stroke(options);
  drawWave(stroke, 40.3f, 100.7f);
  const std::vector<std::uint8_t> pixels = stroke.pixels();
  int inked = 0;
  for (int x = 50; x < 170; ++x) {
    const int y = static_cast<int>(std::lround(100.7 + 10.0 * std::sin((x - 40.3) * 0.05)));
    if (alphaAt(pixels, 256, x, y) > 60) ++inked;
  }
  EXPECT_GT(inked, 90) << "of 120 columns along the line";
  for (int y = 0; y < 256; ++y) {
    if (y > 80 && y < 121) continue;
    for (int x = 0; x < 256; ++x) ASSERT_EQ(alphaAt(pixels, 256, x, y), 0) << x << ", " << y;
  }
}

TEST(Picture, MeetsAtTheBordersOfTiles) {
  const std::vector<std::uint8_t> whole = pictureOfWave(40.3f, 100.7f, 512);
  // Borders every 64 pixels cross the stroke.
  const std::vector<std::uint8_t> tiled = pictureOfWave(40.3f, 100.7f, 64);
  int largest = 0;
  for (std::size_t i = 0; i < tiled.size(); ++i) largest = std::max(largest, std::abs(tiled[i] - whole[i]));
  EXPECT_LE(largest, 2);
}

TEST(Picture, GrainMovesWithTheStartPoint) {
  const std::vector<std::uint8_t> here = pictureOfWave(40.3f, 100.7f, 512);
  const std::vector<std::uint8_t> there = pictureOfWave(53.3f, 89.7f, 512);
  // The same stroke 13 to the right and 11 up is the same picture there, unlike its own at the same pixels.
  int inked = 0, moved = 0, stayed = 0;
  for (int y = 80; y < 121; ++y) {
    for (int x = 30; x < 200; ++x) {
      const int alpha = alphaAt(here, 256, x, y);
      inked += alpha > 0;
      moved += std::abs(alpha - alphaAt(there, 256, x + 13, y - 11)) > 24;
      stayed += std::abs(alpha - alphaAt(there, 256, x, y)) > 24;
    }
  }
  EXPECT_GT(inked, 1000);
  EXPECT_LT(moved, inked / 100);
  EXPECT_GT(stayed, inked / 4);
}

TEST(Picture, SurvivesTheLossOfTheContext) {
  LiveStrokeOptions options;
  options.picture = true;
  options.thread = true;
  LiveStroke stroke(options);
  drawWave(stroke, 40.3f, 60.7f);
  const std::vector<std::uint8_t> before = stroke.pixels();
  stroke.queue().loseContext();
  stroke.queue().restoreContext();
  EXPECT_EQ(stroke.pixels(), before);
  drawWave(stroke, 40.3f, 160.7f);
  const std::vector<std::uint8_t> after = stroke.pixels();
  // The second wave, 100 further down, looks like the first: pattern textures are there again.
  int firstInk = 0, secondInk = 0;
  for (int y = 40; y < 90; ++y) {
    for (int x = 0; x < 256; ++x) {
      firstInk += alphaAt(after, 256, x, y);
      secondInk += alphaAt(after, 256, x, y + 100);
    }
  }
  EXPECT_GT(firstInk, 10000);
  EXPECT_NEAR(secondInk, firstInk, firstInk / 50);
}

TEST(Picture, APenCanDieInTheMiddleOfAStroke) {
  LiveStrokeOptions options;
  options.picture = true;
  options.thread = true;
  LiveStroke stroke(options);
  stroke.down({40, 40});
  stroke.move({{60, 60}, {90, 90}});
  stroke.deletePen();
  EXPECT_GT(alphaAt(stroke.pixels(), 256, 60, 60), 0);
}

}  // namespace
}  // namespace QeltTests
