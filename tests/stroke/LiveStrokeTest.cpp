#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <limits>
#include <new>
#include <string>
#include <vector>

#include "base/Error.h"
#include "engine/MotionEvent.h"
#include "gl/ITask.h"
#include "stroke/DrawingBoard.h"
#include "support/Allocations.h"
#include "support/LogCapture.h"
#include "support/Stamps.h"
#include "support/Versions.h"

namespace QeltTests {
namespace {

using Qelt::Error;
using Qelt::MotionEvent;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInfinity = std::numeric_limits<float>::infinity();

BoardOptions paper(int version, bool curve = true) {
  BoardOptions options;
  options.version = version;
  options.curve = curve;
  return options;
}

// A stroke with a corner, a short move and changing pressure.
const std::vector<Sample> kStroke = {{10.0f, 10.0f, 0.3f},        {14.0f, 11.0f, 0.5f, 0.3f, 0.2f},
                                     {22.0f, 11.5f, 0.9f, 0.77f}, {23.0f, 11.5f, 0.9f},
                                     {24.0f, 19.0f, 0.4f},        {17.0f, 23.0f, 0.6f}};

std::vector<std::vector<float>> floatsOf(const std::vector<QeltDesktop::Batch>& batches) {
  std::vector<std::vector<float>> floats;
  for (const auto& batch : batches) floats.push_back(batch.buffers.front());
  return floats;
}

class LiveStroke : public testing::TestWithParam<int> {};

// Every action in every state: up, down, moving.
TEST_P(LiveStroke, FollowsTheTableOfStates) {
  DrawingBoard board(paper(GetParam()));
  const Sample start{10.0f, 10.0f}, further{30.0f, 10.0f};
  const auto draws = [&board] { return !board.takeStamps().empty(); };

  // Up: only a down counts.
  EXPECT_FALSE(board.move({further}));
  EXPECT_FALSE(board.up(further));
  EXPECT_FALSE(board.send(Qelt::kActionCancel, {further}));
  EXPECT_FALSE(board.send(7, {further}));
  EXPECT_FALSE(draws());
  EXPECT_EQ(board.rect.right, 0.0f);

  // Down: a cancel changes nothing, a second down starts anew, an up ends.
  EXPECT_TRUE(board.down(start));
  EXPECT_FALSE(board.send(Qelt::kActionCancel, {further}));
  EXPECT_TRUE(board.down({50.0f, 10.0f}));
  EXPECT_TRUE(board.up({50.0f, 10.0f}));
  EXPECT_THAT(board.takeStamps(), ElementsAre(StampNear(50.0f, 10.0f, 0.0f)));

  // Moving: a cancel changes nothing, a down starts anew without ending the old stroke.
  EXPECT_TRUE(board.down(start));
  EXPECT_TRUE(board.move({further}));
  EXPECT_TRUE(draws());
  EXPECT_FALSE(board.send(Qelt::kActionCancel, {further}));
  EXPECT_FALSE(draws());
  EXPECT_TRUE(board.move({{50.0f, 10.0f}}));
  EXPECT_TRUE(draws());
  EXPECT_TRUE(board.down({90.0f, 10.0f}));
  EXPECT_FALSE(draws());
  EXPECT_TRUE(board.up({90.0f, 10.0f}));
  EXPECT_THAT(board.takeStamps(), ElementsAre(StampNear(90.0f, 10.0f, 0.0f)));

  // Up again: what follows is ignored.
  EXPECT_FALSE(board.up({90.0f, 10.0f}));
  EXPECT_FALSE(board.move({further}));
  EXPECT_FALSE(draws());
}

TEST_P(LiveStroke, PostsInOrderWhateverTheActionDid) {
  for (const bool curve : {true, false}) {
    SCOPED_TRACE(curve ? "curve" : "straight");
    DrawingBoard board(paper(GetParam(), curve));
    // Ignored: the rectangle and the (empty) batch are handed over all the same.
    board.move({{20.0f, 10.0f}});
    EXPECT_THAT(board.takePosts(), ElementsAre("SetRect", "Batch", "Render", "DeleteBatch"));
    EXPECT_THAT(floatsOf(board.takeBatches()), ElementsAre(IsEmpty()));
    board.send(Qelt::kActionCancel, {{20.0f, 10.0f}});
    EXPECT_THAT(board.takePosts(), ElementsAre("SetRect", "Batch", "Render", "DeleteBatch"));

    board.down({10.0f, 10.0f});
    if (curve) {
      EXPECT_THAT(board.takePosts(),
                  ElementsAre("SetStartPoint", "SetPenData", "SetRect", "Batch", "Render", "DeleteBatch"));
    } else {
      EXPECT_THAT(board.takePosts(), ElementsAre("SetPenData", "SetRect", "Batch", "Render", "DeleteBatch"));
    }
    board.move({{30.0f, 10.0f}, {50.0f, 10.0f}});
    EXPECT_THAT(board.takePosts(), ElementsAre("SetRect", "Batch", "Render", "DeleteBatch"));
    board.up({60.0f, 10.0f});
    EXPECT_THAT(board.takePosts(), ElementsAre("SetRect", "Batch", "Render", "DeleteBatch"));
  }
}

TEST_P(LiveStroke, AddsUpASlowDrag) {
  DrawingBoard board(paper(GetParam(), false));
  board.down({10.0f, 10.0f});
  // Size 10: moves below 2 are dropped, and the last point stays.
  EXPECT_TRUE(board.move({{11.0f, 10.0f}, {11.5f, 10.0f}, {11.9f, 10.0f}}));
  EXPECT_THAT(board.takeStamps(), IsEmpty());
  EXPECT_TRUE(board.move({{12.5f, 10.0f}}));
  const std::vector<Stamp> stamps = board.takeStamps();
  ASSERT_FALSE(stamps.empty());
  EXPECT_THAT(stamps.front(), StampNear(GetParam() == 8 ? 10.4f : 10.0f, 10.0f, 1e-3f));
}

// Nothing but short moves: the stroke ends as a tap where it began, with the tool's pressure and size.
TEST_P(LiveStroke, EndsAsATapWhenEveryMoveWasDropped) {
  DrawingBoard board(paper(GetParam()));
  board.down({10.0f, 10.0f, 0.9f});
  board.move({{11.0f, 10.0f, 0.9f}});
  EXPECT_TRUE(board.up({11.5f, 10.0f, 0.5f}));
  const std::vector<Stamp> stamps = board.takeStamps();
  ASSERT_THAT(stamps, ElementsAre(StampNear(10.0f, 10.0f, 0.0f)));
  EXPECT_EQ(stamps[0].tile, 0);
  // 0.25, times 255 / 80 from version 2 on; in version 8 times 15 / 10 and over 6 as well.
  const float alpha = GetParam() == 1 ? 0.25f : GetParam() == 8 ? 0.19921875f : 0.796875f;
  EXPECT_FLOAT_EQ(stamps[0].alpha, alpha);
  // The joint, the up point, 5 around them: the stamp's own reach (5.5 at most) goes past that upwards.
  EXPECT_EQ(board.rect.right, 16.5f);
}

TEST_P(LiveStroke, GoesOnStraightWhenSmoothingIsSwitchedOffMidStroke) {
  DrawingBoard board(paper(GetParam()));
  board.down({100.0f, 50.0f});
  board.move({{108.4f, 50.0f}});
  board.takeStamps();
  board.shared.mCurveEnabled = false;
  // From the last point, not from the mid point 104.2; version 8 carries 0.2, then 0.1.
  board.move({{112.5f, 50.0f}});
  std::vector<Stamp> stamps = board.takeStamps();
  ASSERT_FALSE(stamps.empty());
  EXPECT_THAT(stamps.front(), StampNear(GetParam() == 8 ? 108.6f : 108.4f, 50.0f, 1e-3f));
  board.up({116.8f, 50.0f});
  stamps = board.takeStamps();
  ASSERT_FALSE(stamps.empty());
  EXPECT_THAT(stamps.front(), StampNear(GetParam() == 8 ? 112.6f : 112.5f, 50.0f, 1e-3f));
}

TEST_P(LiveStroke, WritesItsCorrectionsBackIntoTheEvent) {
  const int version = GetParam();
  const float cap = version == 5 ? 1.0f : 0.79f;
  const float substitute = version == 8 ? 0.6f : 0.5f;
  DrawingBoard board(paper(version));
  board.down({0.0f, 0.0f});
  const std::vector<Sample> tilted = {
      {10.0f, 0.0f, 0.9f, 1.2f}, {20.0f, 0.0f, 0.9f, 0.6f}, {30.0f, 0.0f, 0.9f, 1.3f}};

  MotionEvent stylus = motionEvent(Qelt::kActionMove, tilted, Qelt::kToolStylus, Qelt::kSourceStylus);
  board.send(stylus);
  EXPECT_EQ(stylus.GetHistoricalTilt(0), cap);
  EXPECT_EQ(stylus.GetHistoricalTilt(1), 0.6f);
  EXPECT_EQ(stylus.GetTilt(0), cap);
  EXPECT_EQ(stylus.GetPressure(0), 0.9f);

  // A stylus on a touch screen reports no pressure: in every sample.
  MotionEvent touch = motionEvent(Qelt::kActionMove, tilted, Qelt::kToolStylus, Qelt::kSourceTouchScreen);
  board.send(touch);
  EXPECT_EQ(touch.GetHistoricalPressure(0), substitute);
  EXPECT_EQ(touch.GetHistoricalPressure(1), substitute);
  EXPECT_EQ(touch.GetPressure(0), substitute);
  MotionEvent up =
      motionEvent(Qelt::kActionUp, {{40.0f, 0.0f, 0.9f, 1.2f}}, Qelt::kToolStylus, Qelt::kSourceTouchScreen);
  board.send(up);
  EXPECT_EQ(up.GetPressure(0), substitute);
  EXPECT_EQ(up.GetTilt(0), cap);
  MotionEvent down =
      motionEvent(Qelt::kActionDown, {{40.0f, 0.0f, 0.9f}}, Qelt::kToolStylus, Qelt::kSourceTouchScreen);
  board.send(down);
  EXPECT_EQ(down.GetPressure(0), substitute);

  // A finger's pressure is substituted for drawing alone.
  MotionEvent finger = motionEvent(Qelt::kActionMove, tilted, Qelt::kToolFinger, Qelt::kSourceTouchScreen);
  board.send(finger);
  EXPECT_EQ(finger.GetHistoricalPressure(0), 0.9f);
  EXPECT_EQ(finger.GetPressure(0), 0.9f);
}

TEST_P(LiveStroke, RefusesNullArgumentsAndStaysSilentWithoutACanvas) {
  DrawingBoard board(paper(GetParam()));
  MotionEvent event = motionEvent(Qelt::kActionDown, {{1.0f, 1.0f}}, Qelt::kToolStylus, Qelt::kSourceStylus);
  Qelt::RectF rect;
  Error::SetError(0);
  EXPECT_FALSE(board.drawable().Draw(nullptr, &rect));
  EXPECT_EQ(Error::GetError(), 7u);
  Error::SetError(0);
  EXPECT_FALSE(board.drawable().Draw(&event, nullptr));
  EXPECT_EQ(Error::GetError(), 7u);

  Error::SetError(0);
  board.drawable().SetCanvas(nullptr);
  EXPECT_FALSE(board.drawable().Draw(&event, &rect));
  EXPECT_EQ(Error::GetError(), 0u);
  EXPECT_THAT(board.takePosts(), IsEmpty());
}

// --- Bad input ---

TEST_P(LiveStroke, DropsPointsThatAreNotFiniteAsIfTheyHadNotBeen) {
  std::vector<Stamp> clean;
  {
    DrawingBoard board(paper(GetParam()));
    board.down(kStroke[0]);
    board.move({kStroke[1], kStroke[2]});
    board.move({kStroke[4]});
    board.up(kStroke[5]);
    clean = board.takeStamps();
  }
  DrawingBoard board(paper(GetParam()));
  EXPECT_FALSE(board.down({kNaN, 10.0f}));
  EXPECT_FALSE(board.move({kStroke[1]}));  // nothing has begun
  board.takeStamps();
  board.down(kStroke[0]);
  board.move({{kNaN, 3.0f}, kStroke[1], {3.0f, kInfinity}, kStroke[2]});
  board.move({kStroke[4], {-kInfinity, kNaN}});
  board.up(kStroke[5]);
  const std::vector<Stamp> stamps = board.takeStamps();
  ASSERT_EQ(stamps.size(), clean.size());
  for (std::size_t i = 0; i < stamps.size(); ++i) {
    EXPECT_EQ(testing::PrintToString(stamps[i]), testing::PrintToString(clean[i])) << i;
  }

  // An end that is not finite leaves the closing segment out.
  board.down(kStroke[0]);
  board.move({kStroke[2]});
  board.takeStamps();
  EXPECT_TRUE(board.up({kNaN, kNaN}));
  EXPECT_THAT(board.takeStamps(), IsEmpty());
  EXPECT_TRUE(board.rect.left <= board.rect.right);
}

TEST_P(LiveStroke, ReplacesPressureAndAnglesThatAreNoNumbers) {
  DrawingBoard board(paper(GetParam()));
  const float substitute = GetParam() == 8 ? 0.6f : 0.5f;
  board.stroke({{10.0f, 10.0f, kNaN, kNaN, kNaN},
                {30.0f, 10.0f, kNaN, kInfinity, -kInfinity},
                {50.0f, 10.0f, kNaN, -kInfinity, kInfinity}});
  const std::vector<Stamp> odd = board.takeStamps();
  board.stroke({{10.0f, 10.0f, substitute}, {30.0f, 10.0f, substitute}, {50.0f, 10.0f, substitute}});
  const std::vector<Stamp> plain = board.takeStamps();
  ASSERT_EQ(odd.size(), plain.size());
  for (std::size_t i = 0; i < odd.size(); ++i)
    EXPECT_EQ(testing::PrintToString(odd[i]), testing::PrintToString(plain[i]));
}

TEST_P(LiveStroke, PlacesNothingAtASizeThatIsNone) {
  for (const float size : {0.0f, -3.0f, kNaN, kInfinity, -kInfinity}) {
    SCOPED_TRACE(size);
    for (const bool curve : {true, false}) {
      BoardOptions options = paper(GetParam(), curve);
      options.size = size;
      DrawingBoard board(options);
      board.stroke(kStroke);
      board.down(kStroke[0]);
      board.up(kStroke[0]);
      board.redraw(board.recorded(kStroke));
      board.redraw(*board.stored(kStroke));
      EXPECT_THAT(board.takeStamps(), IsEmpty());
    }
  }
}

TEST_P(LiveStroke, PlacesFiniteStampsOnceTheSizeIsSensible) {
  DrawingBoard board(paper(GetParam()));
  board.settings.size = kNaN;
  board.down(kStroke[0]);
  board.settings.size = 6.0f;
  board.move({kStroke.begin() + 1, kStroke.end()});
  const std::vector<Stamp> placed = board.takeStamps();
  ASSERT_THAT(placed, Not(IsEmpty()));
  for (const Stamp& stamp : placed) EXPECT_TRUE(std::isfinite(stamp.halfWidth) && std::isfinite(stamp.alpha));
}

TEST_P(LiveStroke, EndsOnHugeCoordinates) {
  const LogCapture log;
  DrawingBoard board(paper(GetParam()));
  board.queue.onAccepted = nullptr;
  for (const float far : {1e6f, std::numeric_limits<float>::max()}) {
    board.down({0.0f, 0.0f});
    board.move({{far, far}});
    board.move({{-far, far}});
    board.up({0.0f, -far});
    for (const auto& floats : floatsOf(board.takeBatches())) EXPECT_LE(floats.size(), 262144u * 66u) << far;
  }
  // And draws as ever afterwards.
  board.stroke(kStroke);
  const std::vector<Stamp> stamps = board.takeStamps();
  DrawingBoard fresh(paper(GetParam()));
  fresh.stroke(kStroke);
  EXPECT_EQ(stamps.size(), fresh.takeStamps().size());
}

// --- A queue that refuses, memory that runs out ---

// Draws the stroke with the accepting rule given, then takes the rule away and draws a second stroke.
template <typename Accept>
std::vector<std::vector<float>> secondStrokeAfter(int version, Accept accept) {
  DrawingBoard board(paper(version));
  board.queue.accept = accept;
  board.stroke(kStroke, 2);
  board.takeBatches();
  board.queue.accept = nullptr;
  board.stroke(kStroke, 2);
  return floatsOf(board.takeBatches());
}

TEST_P(LiveStroke, SurvivesEachPostRefusedAloneAndLeaksNothing) {
  const auto undisturbed = secondStrokeAfter(GetParam(), [](const Qelt::ITask&) { return true; });
  const long before = liveAllocations();
  {
    // Down, three moves and up post 22 tasks.
    for (int refused = 0; refused < 24; ++refused) {
      int number = 0;
      EXPECT_EQ(secondStrokeAfter(GetParam(), [&](const Qelt::ITask&) { return number++ != refused; }),
                undisturbed)
          << "post " << refused;
    }
    // From some post on all of them.
    for (int last = 0; last < 24; ++last) {
      int number = 0;
      EXPECT_EQ(secondStrokeAfter(GetParam(), [&](const Qelt::ITask&) { return number++ < last; }),
                undisturbed)
          << "from post " << last;
    }
    // Every task of one kind.
    for (const char* kind : {"SetStartPoint", "SetPenData", "SetRect", "Batch", "Render", "DeleteBatch"}) {
      EXPECT_EQ(
          secondStrokeAfter(GetParam(), [&](const Qelt::ITask& task) { return taskName(task) != kind; }),
          undisturbed)
          << kind;
    }
  }
  EXPECT_EQ(liveAllocations(), before);
}

TEST_P(LiveStroke, FreesEverythingWhenItDiesWhileTheQueueRefuses) {
  { DrawingBoard warmUp(paper(GetParam())); }
  const long before = liveAllocations();
  for (const char* kind : {"Batch", "Render", "DeleteBatch"}) {
    DrawingBoard board(paper(GetParam()));
    board.queue.accept = [kind](const Qelt::ITask& task) { return taskName(task) != kind; };
    board.stroke(kStroke);
    board.queue.accept = [](const Qelt::ITask&) { return false; };
    board.deleteDrawable();
  }
  EXPECT_EQ(liveAllocations(), before);
}

// Every allocation of the stroke fails once. What a call throws, if anything, is std::bad_alloc; nothing is
// lost, and the next stroke is drawn as ever.
TEST_P(LiveStroke, SurvivesEachAllocationFailingAlone) {
  if (!countsAllocations()) GTEST_SKIP() << "allocations are the sanitizer's";
  std::vector<std::vector<float>> undisturbed;
  {
    DrawingBoard board(paper(GetParam()));
    board.stroke(kStroke, 2);
    undisturbed = floatsOf(board.takeBatches());
  }
  const long before = liveAllocations();
  bool failed = true;
  long number = 0;
  for (; failed && number < 500; ++number) {
    DrawingBoard board(paper(GetParam()));
    board.queue.onAccepted = nullptr;  // the test's own allocations stay out of it
    std::vector<MotionEvent> events;
    events.push_back(motionEvent(Qelt::kActionDown, {kStroke[0]}, Qelt::kToolStylus, Qelt::kSourceStylus));
    events.push_back(motionEvent(Qelt::kActionMove, {kStroke.begin() + 1, kStroke.end()}, Qelt::kToolStylus,
                                 Qelt::kSourceStylus));
    events.push_back(motionEvent(Qelt::kActionUp, {kStroke.back()}, Qelt::kToolStylus, Qelt::kSourceStylus));
    {
      const FailingAllocation failing(number);
      for (MotionEvent& event : events) {
        try {
          board.send(event);
        } catch (const std::bad_alloc&) {
          // Only a batch that cannot grow throws.
        }
      }
      failed = failing.hasFailed();
    }
    board.takeBatches();
    board.stroke(kStroke, 2);
    ASSERT_EQ(floatsOf(board.takeBatches()), undisturbed) << "allocation " << number;
  }
  EXPECT_FALSE(failed);
  EXPECT_GT(number, 10);
  EXPECT_EQ(liveAllocations(), before);
}

INSTANTIATE_TEST_SUITE_P(Versions, LiveStroke, testing::ValuesIn(allVersions()),
                         [](const auto& version) { return "Version" + std::to_string(version.param); });

// --- What version 8 alone has ---

// At zoom 4 a device pixel is a quarter of a stroke unit: the margin of half a pixel is 0.125.
TEST(ViewScaleTest, MarginsOfVersion8AreDevicePixels) {
  DrawingBoard board(paper(8));
  board.canvas.setMatrix(viewOf(4.0f));
  board.down({10.0f, 10.0f});
  board.up({10.0f, 10.0f});
  EXPECT_FLOAT_EQ(board.takeStamps().at(0).halfWidth, 5.125f);
  // The next event sees the view change at once.
  board.canvas.setMatrix(viewOf(0.5f));
  board.down({10.0f, 10.0f});
  board.up({10.0f, 10.0f});
  EXPECT_FLOAT_EQ(board.takeStamps().at(0).halfWidth, 6.0f);
}

TEST(ViewScaleTest, AViewThatCannotBeInvertedCountsAsUnscaled) {
  DrawingBoard board(paper(8));
  for (const float zoom : {0.0f, kNaN, kInfinity}) {
    board.canvas.setMatrix(viewOf(zoom));
    board.down({10.0f, 10.0f});
    board.up({10.0f, 10.0f});
    EXPECT_FLOAT_EQ(board.takeStamps().at(0).halfWidth, 5.5f) << zoom;
  }
}

}  // namespace
}  // namespace QeltTests
