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

// One straight run of stamps along x.
struct Run {
  float from, length;
  int stamps;
  float along;  // where it begins, stroke units from the stroke's beginning
  float halfFrom, halfTo, alphaFrom, alphaTo;
};

std::vector<Stamp> stampsAlong(const std::vector<Run>& runs, const ExpectedVersion& row, float y) {
  std::vector<Stamp> stamps;
  for (const Run& run : runs) {
    for (int i = 0; i < run.stamps; ++i) {
      const auto done = static_cast<float>(i) / static_cast<float>(run.stamps);
      const float along = row.spacing > 0.0f
                              ? row.firstStampAt(run.along) + row.spacing * static_cast<float>(i)
                              : run.length * done;
      Stamp stamp{};
      stamp.x = run.from + along;
      stamp.y = y;
      stamp.halfWidth = stamp.halfHeight = run.halfFrom + (run.halfTo - run.halfFrom) * done;
      stamp.alpha = run.alphaFrom + (run.alphaTo - run.alphaFrom) * done;
      stamp.narrowing = row.blend;
      stamp.tile = static_cast<int>(stamps.size()) % 3;
      stamp.directionX = -0.47942554f;  // -sin 0.5
      stamp.directionY = 0.87758256f;
      if (row.followsView) stamp.innerRadius = (stamp.halfWidth - 1.0f) / stamp.halfWidth * 0.5f;
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

class EachVersion : public testing::TestWithParam<int> {
 protected:
  const ExpectedVersion& r = expectedOf(GetParam());
};

// Kept: version 8 presents cached batches with version 7's guard, and has a return guard of its own.
static_assert(std::is_same_v<Qelt::StrokeV8::CacheGuard, Qelt::Pencil2V7CacheRedrawCallback>);
static_assert(std::is_same_v<Qelt::StrokeV8::ReturnGuard, Qelt::Pencil2V8ReturnCallback>);

// From 100.5 to 104.7, 108.8 and 111.8: lengths 4.2, 4.1 and 3.0.
TEST_P(EachVersion, PlacesAStraightStrokeAsWorkedOutByHand) {
  DrawingBoard board(paper(r.number, false));
  EXPECT_TRUE(board.down(at(100.5f, 50.25f, 0.9f)));
  EXPECT_TRUE(board.move({at(104.7f, 50.25f, 0.8f), at(108.8f, 50.25f, 0.5f)}));
  EXPECT_TRUE(board.up(at(111.8f, 50.25f, 0.6f)));

  expectStamps(
      board.takeStamps(),
      stampsAlong({{100.5f, 4.2f, r.straight[0], 0.0f, r.halfStart, r.halfTarget, 0.0f, r.alpha[3]},
                   {104.7f, 4.1f, r.straight[1], 4.2f, r.halfTarget, r.halfTarget, r.alpha[3], r.alpha[1]},
                   {108.8f, 3.0f, r.straight[2], 8.3f, r.halfTarget, r.halfTarget, r.alpha[2], r.alpha[2]}},
                  r, 50.25f));
}

// Down at 100, moves to 108.4 and 116.6, up at 120.3: segments end half way, at 104.2 and 112.5.
TEST_P(EachVersion, PlacesACurvedStrokeAsWorkedOutByHand) {
  DrawingBoard board(paper(r.number));
  EXPECT_TRUE(board.down(at(100.0f, 50.25f, 0.9f)));
  EXPECT_TRUE(board.move({at(108.4f, 50.25f, 0.8f)}));
  EXPECT_TRUE(board.move({at(116.6f, 50.25f, 0.5f)}));
  EXPECT_TRUE(board.up(at(120.3f, 50.25f, 0.6f)));

  expectStamps(
      board.takeStamps(),
      stampsAlong({{100.0f, 4.2f, r.curve[0], 0.0f, r.halfStart, r.halfTarget, 0.0f, r.alpha[3]},
                   {104.2f, 8.3f, r.curve[1], 4.2f, r.halfTarget, r.halfTarget, r.alpha[3], r.alpha[1]},
                   {112.5f, 7.8f, r.curve[2], 12.5f, r.halfTarget, r.halfTarget, r.alpha[2], r.alpha[2]}},
                  r, 50.25f));
}

// The closing segment of a replay ramps from the last segment's alpha, and a stored stroke's last point
// counts twice: 108.8 is drawn to, then the stroke closes over no distance at all.
TEST_P(EachVersion, ReplaysAStoredStrokeAsWorkedOutByHand) {
  DrawingBoard board(paper(r.number, false));
  const auto stroke =
      board.stored({at(100.5f, 50.25f, 0.9f), at(104.7f, 50.25f, 0.8f), at(108.8f, 50.25f, 0.5f)});
  EXPECT_TRUE(board.redraw(*stroke));

  expectStamps(
      board.takeStamps(),
      stampsAlong({{100.5f, 4.2f, r.straight[0], 0.0f, r.halfStart, r.halfTarget, 0.0f, r.alpha[3]},
                   {104.7f, 4.1f, r.straight[1], 4.2f, r.halfTarget, r.halfTarget, r.alpha[3], r.alpha[1]},
                   {108.8f, 0.0f, r.storedEnd, 8.3f, r.halfTarget, r.halfTarget, r.alpha[1], r.alpha[1]}},
                  r, 50.25f));
}

// Down at 100, history 100 and 108.4 in a recorded event whose current sample lies at 112.6: the closing
// segment runs from 104.2 over 108.4 to 112.6, 8.4 long, its alpha from that of pressure 0.8 to that of 0.6.
TEST_P(EachVersion, RampsTheClosingSegmentOfARecordedEvent) {
  DrawingBoard board(paper(r.number));
  const MotionEvent event = motionEvent(
      Qelt::kActionUp, {at(100.0f, 50.25f, 0.9f), at(108.4f, 50.25f, 0.8f), at(112.6f, 50.25f, 0.6f)});
  EXPECT_TRUE(board.redraw(event));
  expectStamps(
      board.takeStamps(),
      stampsAlong({{100.0f, 4.2f, r.curve[0], 0.0f, r.halfStart, r.halfTarget, 0.0f, r.alpha[3]},
                   {104.2f, 8.4f, r.recordedEnd, 4.2f, r.halfTarget, r.halfTarget, r.alpha[3], r.alpha[2]}},
                  r, 50.25f));
}

INSTANTIATE_TEST_SUITE_P(Versions, EachVersion, testing::ValuesIn(allVersions()), versionName);

TEST(LargeCountTest, IsLoggedByTheVersionsThatDoSo) {
  LogCapture log;
  for (const int version : allVersions()) {
    SCOPED_TRACE("version " + std::to_string(version));
    for (const float size : {16.0f, 8.0f}) {
      DrawingBoard board({.version = version, .size = size, .curve = false});
      board.down({100.0f, 50.0f});
      log.take();
      board.move({{20101.0f, 50.0f}});  // 20001 away: 10000 stamps at size 16, 20001 at size 8
      const std::vector<LogLine> lines = log.take();
      const bool logs = size == 8.0f && expectedOf(version).logsLargeCounts;
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
TEST(PublishedStateTest, IsWrittenByTheVersionsThatPublishAndOnlyOnCurves) {
  for (const int version : allVersions()) {
    for (const bool curve : {true, false}) {
      SCOPED_TRACE("version " + std::to_string(version) + (curve ? ", curved" : ", straight"));
      DrawingBoard board(paper(version, curve));
      const Qelt::Pencil2Data& shared = board.shared;
      board.down(at(100.0f, 50.25f, 0.9f));
      const ExpectedVersion& expected = expectedOf(version);
      const bool publishes = curve && expected.publishes;
      EXPECT_EQ(shared.mHasLastStroke, publishes);
      EXPECT_EQ(shared.mStartX, publishes ? 100.0f : 0.0f);
      board.move({at(108.4f, 50.25f, 0.8f)});
      EXPECT_EQ(shared.mLastX, publishes ? 108.4f : 0.0f);
      if (!publishes) continue;
      EXPECT_NEAR(shared.mTiltBlend, 0.25f, 1e-4f);
      // The alpha of the last stamp, one step before that of pressure 0.8.
      const int stamps = expected.curve[0];
      EXPECT_EQ(shared.mStampCount, stamps);
      EXPECT_NEAR(shared.mLastAlpha,
                  expected.alpha[3] * expected.alphaDivisor * static_cast<float>(stamps - 1) /
                      static_cast<float>(stamps),
                  1e-4f);
      board.up(at(112.0f, 50.25f, 0.6f));
      EXPECT_EQ(shared.mLastX, 108.4f);  // the end publishes nothing
      board.down({200.0f, 60.25f, 0.9f, kTilt, 0.75f});
      EXPECT_EQ(shared.mTiltBlend, 0.0f);
      EXPECT_EQ(shared.mStampCount, 0);
      EXPECT_THAT((std::vector{shared.mStartX, shared.mStartY, shared.mLastX, shared.mLastY,
                               shared.mLastWidth, shared.mLastOrientation}),
                  testing::ElementsAre(200.0f, 60.25f, 200.0f, 60.25f, 10.0f, 0.75f));
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
