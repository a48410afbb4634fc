#include <gmock/gmock.h>

#include <cstddef>
#include <string>
#include <type_traits>
#include <typeinfo>
#include <vector>

#include "engine/MotionEvent.h"
#include "pencommon/PenDrawableRT.h"
#include "render/RenderDrawables.h"
#include "stroke/StrokeGuards.h"
#include "stroke/StrokeVersions.h"
#include "support/DrawableBoard.h"
#include "support/LogCapture.h"
#include "support/Stamps.h"
#include "support/Versions.h"

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

// The first straight segment of the stroke above, from 100.5 on, then 5 more on every side. Half widths grow
// from stamp to stamp; version 8 reaches only half as far as its stamps.
TEST(ChangedAreaTest, CoversTheStampsByEachVersionsReach) {
  struct Area {
    int version;
    float left, top, right, bottom;
  };
  const Area areas[] = {
      // Last of 5 at 103.86, 13.0 wide: 6.5 around it; the first one 5 to the left of 100.5.
      {1, 90.5f, 38.75f, 115.36f, 61.75f},
      {2, 90.5f, 38.75f, 115.36f, 61.75f},
      // Last of 3 at 103.3, 12.5 wide.
      {3, 90.5f, 39.0f, 114.55f, 61.5f},
      // The same, 1 wider.
      {4, 90.0f, 38.5f, 115.05f, 62.0f},
      // Last of 3 at 103.3, 22.631579 wide: further to the left, too, than the first.
      {5, 86.98421f, 33.93421f, 119.61579f, 66.56579f},
      {6, 90.0f, 38.5f, 115.05f, 62.0f},
      {7, 90.0f, 38.5f, 115.05f, 62.0f},
      // First of 10 at 100.9, 10 wide: 2.5 to its left; last at 104.5, 13.375 wide: 3.34375.
      {8, 93.4f, 41.90625f, 112.84375f, 58.59375f},
  };
  for (const Area& area : areas) {
    SCOPED_TRACE("version " + std::to_string(area.version));
    DrawingBoard board(paper(area.version, false));
    board.down(at(100.5f, 50.25f, 0.9f));
    EXPECT_EQ(board.rect.left, 100.5f);  // the down point alone
    EXPECT_EQ(board.rect.bottom, 50.25f);
    board.move({at(104.7f, 50.25f, 0.8f)});
    EXPECT_NEAR(board.rect.left, area.left, 1e-3f);
    EXPECT_NEAR(board.rect.top, area.top, 1e-3f);
    EXPECT_NEAR(board.rect.right, area.right, 1e-3f);
    EXPECT_NEAR(board.rect.bottom, area.bottom, 1e-3f);
  }
}

// A tap at size 0.9: 1.3 wide in versions 1 to 3 and 5, 1.9 wide in 4 and 7. Of version 8 the half width 0.45
// is less than half a pixel: widened to 0.5, plus the margin, and dimmed to 0.9.
TEST(VersionsTest, WidenAThinTapEachItsOwnWayForTheirOwnRenderDrawable) {
  for (const int version : allVersions()) {
    SCOPED_TRACE("version " + std::to_string(version));
    DrawingBoard board({.version = version, .size = 0.9f});
    board.stroke({{10.0f, 10.0f}, {10.0f, 10.0f}});
    const QeltDesktop::Batch batch = board.takeBatches().back();
    const std::vector<Stamp> stamps = stampsOf(batch.buffers.front(), board.stride());
    ASSERT_EQ(stamps.size(), 1u);
    const bool addsOne = version == 4 || version == 6 || version == 7;
    EXPECT_NEAR(stamps[0].halfWidth, version == 8 ? 1.0f : addsOne ? 0.95f : 0.65f, 1e-5f);
    EXPECT_NEAR(stamps[0].alphaByWidth, version == 8 ? 0.9f : 1.0f, 1e-5f);

    const std::type_info& made = typeid(*batch.drawable);
    EXPECT_EQ(made, version == 8   ? typeid(Qelt::Pencil2StrokeDrawableRTV3)
                    : version == 7 ? typeid(Qelt::Pencil2StrokeDrawableRTV2)
                                   : typeid(Qelt::Pencil2StrokeDrawableRTV1));
  }
}

// Fingers, mice and a stylus on a touch screen. The pressure they are given shows in a tap's alpha: 0.5
// squared is 0.25; 0.6 squared, times 15 / 10, over 6, is 0.09. Moves just below the skip distance, 20 in
// version 8 and 50 before, are taken every other time; at it at once.
TEST(TouchInputTest, HasTheVersionsOwnPressureAndThinsOutShortMoves) {
  for (const int version : allVersions()) {
    for (const int tool : {Qelt::kToolFinger, Qelt::kToolMouse, Qelt::kToolStylus}) {
      SCOPED_TRACE("version " + std::to_string(version) + ", tool " + std::to_string(tool));
      DrawingBoard board(
          {.version = version,
           .color = 0x50202020u,
           .tool = tool,
           .source = tool == Qelt::kToolMouse ? Qelt::kSourceMouse : Qelt::kSourceTouchScreen});
      board.stroke({{10.0f, 10.0f, 0.9f}, {10.0f, 10.0f, 0.9f}});
      const std::vector<Stamp> stamps = board.takeStamps();
      ASSERT_EQ(stamps.size(), 1u);
      EXPECT_FLOAT_EQ(stamps[0].alpha, version == 8 ? 0.09f : 0.25f);

      const float distance = version == 8 ? 20.0f : 50.0f;
      board.down({0.0f, 0.0f});
      board.move({{distance - 0.5f, 0.0f}});
      EXPECT_TRUE(board.takeStamps().empty());
      board.move({{distance - 0.25f, 0.0f}});
      EXPECT_FALSE(board.takeStamps().empty());

      board.down({0.0f, 0.0f});
      board.move({{distance, 0.0f}});
      EXPECT_FALSE(board.takeStamps().empty());
    }
  }
}

// Tilt falls from its cap to nothing: after three moves version 5, which remembers three, is at 0; of
// seventy, three count little: (67 * 0.79) / 70 = 0.75614, a blend of 0.0768. The orientation goes from 0 to
// 0.6: after the first move the mean of fifty is 0.012, of version 5's three 0.2.
TEST(AttitudeTest, IsCappedAndAveragedByTheVersionsOwnNumbers) {
  for (const int version : allVersions()) {
    SCOPED_TRACE("version " + std::to_string(version));
    DrawingBoard board(paper(version));
    board.down({0.0f, 0.0f, 0.5f, 1.2f, 0.0f});
    board.move({{10.0f, 0.0f, 0.5f, 0.0f, 0.6f}, {20.0f, 0.0f}, {30.0f, 0.0f}});
    const std::vector<Stamp> stamps = board.takeStamps();
    ASSERT_FALSE(stamps.empty());
    // After the first: 2 / 3 of 1.0 in version 5, a blend of (0.6666667 - 0.05) / 1.9; else (69 * 0.79) / 70.
    EXPECT_NEAR(stamps.front().narrowing, version == 5 ? 0.3245614f : 0.3589285f, 1e-3f);
    EXPECT_NEAR(stamps.back().narrowing, version == 5 ? 0.0f : 0.0767855f, 1e-3f);
    EXPECT_NEAR(stamps.front().directionX, version == 5 ? -0.1986693f : -0.0119997f, 1e-5f);
  }
}

// Straight, size 2: 0.8 is long enough to be a move and too short for a segment of versions 1 and 2. They
// measure from the old point again: 1.6, twenty stamps from 100 on, still fading in.
TEST(ShortSegmentTest, DoesNotMoveTheLastPointOfVersions1And2) {
  for (const int version : allVersions()) {
    SCOPED_TRACE("version " + std::to_string(version));
    DrawingBoard board({.version = version, .size = 2.0f, .curve = false});
    board.down({100.0f, 50.0f});
    EXPECT_TRUE(board.move({{100.8f, 50.0f}}));
    const std::vector<Stamp> first = board.takeStamps();
    EXPECT_TRUE(board.move({{101.6f, 50.0f}}));
    const std::vector<Stamp> second = board.takeStamps();
    EXPECT_TRUE(board.up({101.9f, 50.0f}));
    if (version <= 2) {
      EXPECT_TRUE(first.empty());
      ASSERT_EQ(second.size(), 20u);
      EXPECT_THAT(second[0], StampNear(100.0f, 50.0f, 1e-3f));
      EXPECT_EQ(second[0].alpha, 0.0f);
      EXPECT_TRUE(board.takeStamps().empty());  // 0.3 is too short to close with
    } else {
      // trunc(8 / 2 * 0.8) = 3 stamps; of version 8 those at 0.4 and, by rounding, 0.8.
      EXPECT_GE(first.size(), version == 8 ? 1u : 3u);
      ASSERT_FALSE(second.empty());
      EXPECT_GE(second[0].x, 100.79f);
    }
  }
}

// Size 2, curved: a move by 1.6 makes a segment of 0.8, which is dropped, but the mid point has moved to
// 100.8. The next one, to 102.4, runs from there over the old last point, 100, to the new mid point,
// (100 + 102.4) / 2 = 101.2: there and back, 0.32 + 0.72 = 1.04 long, twenty stamps from 100.8 on.
TEST(ShortSegmentTest, MovesTheMidPointOfVersions1And2AllTheSame) {
  for (const int version : {1, 2}) {
    DrawingBoard board({.version = version, .size = 2.0f});
    board.down({100.0f, 50.0f});
    board.move({{101.6f, 50.0f}});
    EXPECT_TRUE(board.takeStamps().empty());
    board.move({{102.4f, 50.0f}});
    const std::vector<Stamp> stamps = board.takeStamps();
    ASSERT_EQ(stamps.size(), 20u) << "version " << version;
    EXPECT_THAT(stamps[0], StampNear(100.8f, 50.0f, 1e-2f));
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

// The stroke of the curved test above, after its first move: the prediction continues from what stands here.
TEST(PublishedStateTest, IsWrittenByVersions4And7And8AndOnlyOnCurves) {
  for (const int version : allVersions()) {
    for (const bool curve : {true, false}) {
      SCOPED_TRACE("version " + std::to_string(version) + (curve ? ", curved" : ", straight"));
      DrawingBoard board(paper(version, curve));
      const Qelt::Pencil2Data& shared = board.shared;
      board.down(at(100.0f, 50.25f, 0.9f));
      const bool publishes = curve && (version == 4 || version >= 6);
      EXPECT_EQ(shared.mHasLastStroke, publishes);
      EXPECT_EQ(shared.mStartX, publishes ? 100.0f : 0.0f);
      EXPECT_EQ(shared.mStartY, publishes ? 50.25f : 0.0f);
      EXPECT_EQ(shared.mLastWidth, publishes ? 10.0f : 0.0f);
      EXPECT_EQ(shared.mLastAlpha, -1.0f);

      board.move({at(108.4f, 50.25f, 0.8f)});
      if (!publishes) {
        EXPECT_EQ(shared.mLastX, 0.0f);
        EXPECT_EQ(shared.mStampCount, 0);
        continue;
      }
      EXPECT_EQ(shared.mLastX, 108.4f);
      EXPECT_NEAR(shared.mLastWidth, 13.75f, 1e-3f);
      EXPECT_NEAR(shared.mLastOrientation, 0.5f, 1e-5f);
      EXPECT_NEAR(shared.mTiltBlend, 0.25f, 1e-4f);
      // The last of 3 at 1.4 each, of 10 at 0.4 each; its alpha before version 8's division by 6.
      EXPECT_EQ(shared.mStampCount, version == 8 ? 10 : 3);
      EXPECT_NEAR(shared.mLastStampX, version == 8 ? 104.0f : 102.8f, 1e-3f);
      EXPECT_NEAR(shared.mLastAlpha, version == 8 ? 0.96f * 0.9f : 0.64f * 2.0f / 3.0f, 1e-4f);

      board.up(at(112.0f, 50.25f, 0.6f));
      EXPECT_EQ(shared.mLastX, 108.4f);  // the end publishes nothing
      EXPECT_EQ(shared.mStampCount, version == 8 ? 10 : 3);

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
