#include <gmock/gmock.h>

#include <cstddef>
#include <string>
#include <type_traits>
#include <vector>

#include "engine/MotionEvent.h"
#include "stroke/StrokeVersions.h"
#include "support/DrawableBoard.h"
#include "support/LogCapture.h"

// What each version makes of one short stroke, worked out on paper.
//
// The pen: size 10, colour alpha 80 (so that alpha / 80 is 1), held at tilt 0.77 and orientation 0.5 all the
// time. Pressures 0.8, 0.5 and, at the end, 0.6.
namespace QeltTests {
namespace {

using Qelt::MotionEvent;

constexpr float kTilt = 0.77f;
constexpr float kOrientation = 0.5f;

struct Row {
  int version;
  // Half the drawn width: at the start, and the target of every segment.
  //   Tilt blend 0.02 / 0.08 = 0.25, width 10 * (1 + 1.5 * 0.25) = 13.75; in version 5 the blend is
  //   0.72 / 1.9 = 0.3789474 and the width 10 + 50 * 0.3789474 = 28.947368.
  //   Versions 4, 6 and 7 add 1 to the width; version 8 half a pixel to the half width.
  float halfStart, halfTarget, blend;
  // Alphas handed over at the end of the first and the second segment, and on the closing one: squares 0.64,
  // 0.25 and 0.36, clamped in version 1; in version 8 times 15 / 10, over 6.
  float alpha[3];
  // Stamps of the three segments, of lengths 4.2, 4.1 and 3.0 (straight) and 4.2, 8.3 and 7.8 (curve).
  //   Versions 1 and 2: trunc(40 / 10) = 4 and a quarter of the length: 5.05, 5.025, 4.75 and 5.05, 6.075,
  //   5.95. Versions 3 to 7: 0.8 times the length: 3.36, 3.28, 2.4 and 3.36, 6.64, 6.24.
  //   Version 8, every 0.4: from 0.4 to 4.0, from 0.2 to 3.8, from 0.1 to 2.9; and from 0.4 to 4.0, from 0.2
  //   to 8.2, from 0.3 to 7.5.
  int straight[3], curve[3];
};

constexpr Row kRows[] = {
    {1, 5.0f, 6.875f, 0.25f, {0.36f, 0.25f, 0.36f}, {5, 5, 4}, {5, 6, 5}},
    {2, 5.0f, 6.875f, 0.25f, {0.64f, 0.25f, 0.36f}, {5, 5, 4}, {5, 6, 5}},
    {3, 5.0f, 6.875f, 0.25f, {0.64f, 0.25f, 0.36f}, {3, 3, 2}, {3, 6, 6}},
    {4, 5.5f, 7.375f, 0.25f, {0.64f, 0.25f, 0.36f}, {3, 3, 2}, {3, 6, 6}},
    {5, 5.0f, 14.473684f, 0.3789474f, {0.64f, 0.25f, 0.36f}, {3, 3, 2}, {3, 6, 6}},
    {6, 5.5f, 7.375f, 0.25f, {0.64f, 0.25f, 0.36f}, {3, 3, 2}, {3, 6, 6}},
    {7, 5.5f, 7.375f, 0.25f, {0.64f, 0.25f, 0.36f}, {3, 3, 2}, {3, 6, 6}},
    {8, 5.5f, 7.375f, 0.25f, {0.16f, 0.0625f, 0.09f}, {10, 10, 8}, {10, 21, 19}},
};

// One straight run of stamps along x.
struct Run {
  float from, length;
  int stamps;
  float carried;  // version 8: where the first stamp lies
  float halfFrom, halfTo, alphaFrom, alphaTo;
};

std::vector<Stamp> stampsAlong(const std::vector<Run>& runs, const Row& row, float y) {
  std::vector<Stamp> stamps;
  for (const Run& run : runs) {
    for (int i = 0; i < run.stamps; ++i) {
      const auto done = static_cast<float>(i) / static_cast<float>(run.stamps);
      const float along = row.version == 8 ? run.carried + 0.4f * static_cast<float>(i) : run.length * done;
      Stamp stamp{};
      stamp.x = run.from + along;
      stamp.y = y;
      stamp.halfWidth = stamp.halfHeight = run.halfFrom + (run.halfTo - run.halfFrom) * done;
      stamp.alpha = run.alphaFrom + (run.alphaTo - run.alphaFrom) * done;
      stamp.narrowing = row.blend;
      stamp.tile = static_cast<int>(stamps.size()) % 3;
      stamp.directionX = -0.47942554f;  // -sin 0.5
      stamp.directionY = 0.87758256f;
      if (row.version == 8) stamp.innerRadius = (stamp.halfWidth - 1.0f) / stamp.halfWidth * 0.5f;
      stamps.push_back(stamp);
    }
  }
  return stamps;
}

void expectStamps(const std::vector<Stamp>& stamps, const std::vector<Stamp>& expected) {
  ASSERT_EQ(stamps.size(), expected.size());
  for (std::size_t i = 0; i < stamps.size(); ++i) {
    SCOPED_TRACE("stamp " + std::to_string(i));
    const Stamp &stamp = stamps[i], &wanted = expected[i];
    EXPECT_THAT(stamp, StampNear(wanted.x, wanted.y, 1e-3f));
    EXPECT_NEAR(stamp.halfWidth, wanted.halfWidth, 1e-3f);
    EXPECT_NEAR(stamp.halfHeight, wanted.halfHeight, 1e-3f);
    EXPECT_NEAR(stamp.alpha, wanted.alpha, 1e-4f);
    EXPECT_NEAR(stamp.narrowing, wanted.narrowing, 1e-4f);
    EXPECT_EQ(stamp.tile, wanted.tile);
    EXPECT_NEAR(stamp.directionX, wanted.directionX, 1e-5f);
    EXPECT_NEAR(stamp.directionY, wanted.directionY, 1e-5f);
    EXPECT_NEAR(stamp.innerRadius, wanted.innerRadius, 1e-4f);
    EXPECT_EQ(stamp.alphaByWidth, 1.0f);
  }
}

Sample at(float x, float y, float pressure) {
  return {x, y, pressure, kTilt, kOrientation};
}

BoardOptions paper(int version, bool curve = true) {
  return {.version = version, .color = 0x50202020u, .curve = curve};
}

class EachVersion : public testing::TestWithParam<Row> {
 protected:
  const Row& row() const { return GetParam(); }
};

// Kept: version 8 presents cached batches with version 7's guard, and has a return guard of its own.
static_assert(std::is_same_v<Qelt::StrokeV8::CacheGuard, Qelt::Pencil2V7CacheRedrawCallback>);
static_assert(std::is_same_v<Qelt::StrokeV8::ReturnGuard, Qelt::Pencil2V8ReturnCallback>);

// From 100.5 to 104.7, 108.8 and 111.8: lengths 4.2, 4.1 and 3.0.
TEST_P(EachVersion, PlacesAStraightStrokeAsWorkedOutByHand) {
  DrawingBoard board(paper(row().version, false));
  EXPECT_TRUE(board.down(at(100.5f, 50.25f, 0.9f)));
  EXPECT_TRUE(board.move({at(104.7f, 50.25f, 0.8f), at(108.8f, 50.25f, 0.5f)}));
  EXPECT_TRUE(board.up(at(111.8f, 50.25f, 0.6f)));

  const Row& r = row();
  expectStamps(
      board.takeStamps(),
      stampsAlong({{100.5f, 4.2f, r.straight[0], 0.4f, r.halfStart, r.halfTarget, 0.0f, r.alpha[0]},
                   {104.7f, 4.1f, r.straight[1], 0.2f, r.halfTarget, r.halfTarget, r.alpha[0], r.alpha[1]},
                   {108.8f, 3.0f, r.straight[2], 0.1f, r.halfTarget, r.halfTarget, r.alpha[2], r.alpha[2]}},
                  r, 50.25f));
}

// Down at 100, moves to 108.4 and 116.6, up at 120.3: segments end half way, at 104.2 and 112.5.
TEST_P(EachVersion, PlacesACurvedStrokeAsWorkedOutByHand) {
  DrawingBoard board(paper(row().version));
  EXPECT_TRUE(board.down(at(100.0f, 50.25f, 0.9f)));
  EXPECT_TRUE(board.move({at(108.4f, 50.25f, 0.8f)}));
  EXPECT_TRUE(board.move({at(116.6f, 50.25f, 0.5f)}));
  EXPECT_TRUE(board.up(at(120.3f, 50.25f, 0.6f)));

  const Row& r = row();
  expectStamps(
      board.takeStamps(),
      stampsAlong({{100.0f, 4.2f, r.curve[0], 0.4f, r.halfStart, r.halfTarget, 0.0f, r.alpha[0]},
                   {104.2f, 8.3f, r.curve[1], 0.2f, r.halfTarget, r.halfTarget, r.alpha[0], r.alpha[1]},
                   {112.5f, 7.8f, r.curve[2], 0.3f, r.halfTarget, r.halfTarget, r.alpha[2], r.alpha[2]}},
                  r, 50.25f));
}

// The closing segment of a replay ramps from the last segment's alpha, and a stored stroke's last point
// counts twice: 108.8 is drawn to, then the stroke closes over no distance at all.
TEST_P(EachVersion, ReplaysAStoredStrokeAsWorkedOutByHand) {
  DrawingBoard board(paper(row().version, false));
  const auto stroke =
      board.stored({at(100.5f, 50.25f, 0.9f), at(104.7f, 50.25f, 0.8f), at(108.8f, 50.25f, 0.5f)});
  EXPECT_TRUE(board.redraw(*stroke));

  const Row& r = row();
  // Versions 1 and 2 drop the closing segment; versions 3 to 7 place the one stamp of a path without length;
  // of version 8 the next stamp would lie 0.1 further.
  const int closing = r.version >= 3 && r.version <= 7 ? 1 : 0;
  expectStamps(
      board.takeStamps(),
      stampsAlong({{100.5f, 4.2f, r.straight[0], 0.4f, r.halfStart, r.halfTarget, 0.0f, r.alpha[0]},
                   {104.7f, 4.1f, r.straight[1], 0.2f, r.halfTarget, r.halfTarget, r.alpha[0], r.alpha[1]},
                   {108.8f, 0.0f, closing, 0.1f, r.halfTarget, r.halfTarget, r.alpha[1], r.alpha[1]}},
                  r, 50.25f));
}

// Down at 100, history 100 and 108.4 in a recorded event whose current sample lies at 112.6: the closing
// segment runs from 104.2 over 108.4 to 112.6, 8.4 long, its alpha from that of pressure 0.8 to that of 0.6.
TEST_P(EachVersion, RampsTheClosingSegmentOfARecordedEvent) {
  DrawingBoard board(paper(row().version));
  const MotionEvent event = motionEvent(
      Qelt::kActionUp, {at(100.0f, 50.25f, 0.9f), at(108.4f, 50.25f, 0.8f), at(112.6f, 50.25f, 0.6f)});
  EXPECT_TRUE(board.redraw(event));
  const Row& r = row();
  // Versions 1 and 2: trunc(4 + 2.1); versions 3 to 7: trunc(6.72); version 8: from 0.2 to 8.2.
  const int closing = r.version <= 2 ? 6 : r.version <= 7 ? 6 : 21;
  expectStamps(
      board.takeStamps(),
      stampsAlong({{100.0f, 4.2f, r.curve[0], 0.4f, r.halfStart, r.halfTarget, 0.0f, r.alpha[0]},
                   {104.2f, 8.4f, closing, 0.2f, r.halfTarget, r.halfTarget, r.alpha[0], r.alpha[2]}},
                  r, 50.25f));
}

INSTANTIATE_TEST_SUITE_P(Versions, EachVersion, testing::ValuesIn(kRows),
                         [](const auto& row) { return "Version" + std::to_string(row.param.version); });

// The pressure that fingers, mice and a stylus on a touch screen are given shows in a tap's alpha: 0.5
// squared is 0.25; 0.6 squared, times 15 / 10, over 6, is 0.09. A move below 50 units, or 20, is left out.
TEST(TouchInputTest, HasTheVersionsOwnPressureAndThinsOutShortMoves) {
  for (const int version : allVersions()) {
    for (const int tool : {Qelt::kToolFinger, Qelt::kToolMouse, Qelt::kToolStylus}) {
      SCOPED_TRACE("version " + std::to_string(version) + ", tool " + std::to_string(tool));
      DrawingBoard board(
          {.version = version,
           .color = 0x50202020u,
           .tool = tool,
           .source = tool == Qelt::kToolMouse ? Qelt::kSourceMouse : Qelt::kSourceTouchScreen});
      const float taken = version == 8 ? 20.0f : 50.0f;
      board.stroke({{10.0f, 10.0f, 0.9f}, {9.8f + taken, 10.0f, 0.9f}});
      const std::vector<Stamp> stamps = board.takeStamps();
      ASSERT_EQ(stamps.size(), 1u);
      EXPECT_FLOAT_EQ(stamps[0].alpha, version == 8 ? 0.09f : 0.25f);
      board.down({10.0f, 10.0f});
      board.move({{10.2f + taken, 10.0f}});
      EXPECT_GT(board.takeStamps().size(), 1u);
    }
  }
}

TEST(LargeCountTest, IsLoggedByVersions4And7Alone) {
  LogCapture log;
  for (const int version : allVersions()) {
    SCOPED_TRACE("version " + std::to_string(version));
    for (const float size : {16.0f, 8.0f}) {
      DrawingBoard board({.version = version, .size = size, .curve = false});
      board.down({100.0f, 50.0f});
      log.take();
      board.move({{20101.0f, 50.0f}});  // 20001 away: 10000 stamps at size 16, 20001 at size 8
      const std::vector<LogLine> lines = log.take();
      const bool logs = size == 8.0f && (version == 4 || version == 6 || version == 7);
      ASSERT_EQ(lines.size(), logs ? 1u : 0u);
      if (logs) {
        EXPECT_EQ(lines[0].priority, 6);
        EXPECT_EQ(lines[0].tag, "qel_log");
        EXPECT_EQ(lines[0].text, "repeat 20001 drawLength 20001.000000 curWidth 8.000000");
      }
      board.takeBatches();
    }
  }
}

// After the first move of the curved test above: the prediction continues from what stands here.
TEST(PublishedStateTest, IsWrittenByVersions4And6AndLaterAndOnlyOnCurves) {
  for (const int version : allVersions()) {
    for (const bool curve : {true, false}) {
      SCOPED_TRACE("version " + std::to_string(version) + (curve ? ", curved" : ", straight"));
      DrawingBoard board(paper(version, curve));
      const Qelt::Pencil2Data& shared = board.shared;
      board.down(at(100.0f, 50.25f, 0.9f));
      const bool publishes = curve && (version == 4 || version >= 6);
      EXPECT_EQ(shared.mHasLastStroke, publishes);
      EXPECT_EQ(shared.mStartX, publishes ? 100.0f : 0.0f);
      board.move({at(108.4f, 50.25f, 0.8f)});
      EXPECT_EQ(shared.mLastX, publishes ? 108.4f : 0.0f);
      if (!publishes) continue;
      EXPECT_NEAR(shared.mTiltBlend, 0.25f, 1e-4f);
      // The last of 3 at 1.4 each, of 10 at 0.4 each; its alpha before version 8's division by 6.
      EXPECT_EQ(shared.mStampCount, version == 8 ? 10 : 3);
      EXPECT_NEAR(shared.mLastAlpha, version == 8 ? 0.96f * 0.9f : 0.64f * 2.0f / 3.0f, 1e-4f);
      board.up(at(112.0f, 50.25f, 0.6f));
      EXPECT_EQ(shared.mLastX, 108.4f);  // the end publishes nothing
      board.down(at(200.0f, 50.25f, 0.9f));
      EXPECT_EQ(shared.mTiltBlend, 0.0f);
      EXPECT_EQ(shared.mStampCount, 0);
    }
  }
}

// A thin slow stroke: many a step is too short for a stamp, and leaves the last one standing.
TEST(PublishedStateTest, KnowsTheLastStampThatWasPlaced) {
  DrawingBoard board({.size = 0.5f});
  board.down({10.0f, 10.0f});
  Stamp last;
  int stepsWithout = 0;
  for (int step = 1; step <= 30; ++step) {
    board.move({{10.0f + 0.15f * static_cast<float>(step), 10.0f}});
    const std::vector<Stamp> stamps = board.takeStamps();
    if (!stamps.empty()) last = stamps.back();
    stepsWithout += stamps.empty() ? 1 : 0;
    ASSERT_NEAR(board.shared.mLastStampX, last.x, 1e-4f) << "step " << step;
    ASSERT_NEAR(board.shared.mLastAlpha, last.x == 0.0f ? -1.0f : last.alpha * 6.0f, 1e-3f);
  }
  EXPECT_GT(stepsWithout, 10);
}

}  // namespace
}  // namespace QeltTests
