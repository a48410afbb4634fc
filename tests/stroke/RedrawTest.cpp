#include <gmock/gmock.h>

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "base/Error.h"
#include "engine/MotionEvent.h"
#include "pencommon/PenStrokeDataManager.h"
#include "support/DrawableBoard.h"
#include "support/PartialStroke.h"

namespace QeltTests {
namespace {

using Qelt::Error;
using Qelt::MotionEvent;
using Qelt::PenStrokeDataManager;
using QeltDesktop::Batch;
using QeltDesktop::StoredStroke;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Not;

const std::vector<Sample> kRecordedStroke = {{10.0f, 10.0f, 0.3f},
                                             {18.0f, 11.0f, 0.5f, 0.3f, 0.2f},
                                             {26.0f, 11.5f, 0.9f, 0.77f, 0.4f},
                                             {30.0f, 19.0f, 0.4f, 0.2f, 0.1f}};

// A stroke on a page that keeps drawings: it has an entry in the cache.
struct StrokeOnPage {
  explicit StrokeOnPage(const DrawingBoard& board, const std::vector<Sample>& samples = kRecordedStroke)
      : stroke(board.stored(samples)) {
    PenStrokeDataManager::GetInstance()->CreateStrokeData(stroke->GetRuntimeHandle());
  }
  ~StrokeOnPage() { PenStrokeDataManager::GetInstance()->DropStrokeData(stroke->GetRuntimeHandle()); }
  StrokeOnPage(const StrokeOnPage&) = delete;
  StrokeOnPage& operator=(const StrokeOnPage&) = delete;

  StoredStroke& operator*() const { return *stroke; }
  StoredStroke* operator->() const { return stroke.get(); }

  const std::unique_ptr<StoredStroke> stroke;
};

// The one batch of a redraw.
template <typename Input>
Batch redrawn(DrawingBoard& board, const Input& input) {
  board.redraw(input);
  std::vector<Batch> batches = board.takeBatches();
  EXPECT_EQ(batches.size(), 1u);
  return batches.empty() ? Batch{nullptr, false, {{}}} : batches.front();
}

std::vector<float> edges(const Qelt::RectF& rect) {
  return {rect.left, rect.top, rect.right, rect.bottom};
}

class Redraw : public testing::TestWithParam<int> {
 protected:
  const int version = GetParam();
  const ExpectedVersion& expected = expectedOf(version);
};

// A straight replay leaves the grain where it is. An entry of the cache goes back after the batch when
// curved, before it when straight, where there is one; without one only when curved. On a hit nothing is
// computed, and no rectangle is set.
TEST_P(Redraw, PostsInOrder) {
  for (const bool curve : {true, false}) {
    SCOPED_TRACE(curve ? "curve" : "straight");
    DrawingBoard board({.version = version, .curve = curve});
    EXPECT_TRUE(board.redraw(board.recorded(kRecordedStroke)));
    std::vector<std::string> posts = {"SetRedrawState", "SetPenData", "SetStartPoint", "SetRect",
                                      "Batch",          "Render",     "DeleteBatch"};
    if (!curve) posts.erase(posts.begin() + 2);
    EXPECT_EQ(board.takePosts(), posts);

    const auto withoutEntry = board.stored(kRecordedStroke);
    EXPECT_TRUE(board.redraw(*withoutEntry));
    if (curve) posts.push_back("ReleaseStrokeData");
    EXPECT_EQ(board.takePosts(), posts);
    EXPECT_TRUE(withoutEntry->IsRedrawingCacheDirty());  // nothing was kept

    StrokeOnPage stroke(board);
    EXPECT_TRUE(board.redraw(*stroke));
    if (!curve) posts.insert(posts.begin() + 3, "ReleaseStrokeData");
    EXPECT_EQ(board.takePosts(), posts);
    EXPECT_FALSE(stroke->IsRedrawingCacheDirty());

    EXPECT_TRUE(board.redraw(*stroke));
    EXPECT_THAT(board.takePosts(), ElementsAre("SetRedrawState", "SetPenData", "SetStartPoint", "Batch",
                                               "Render", "Unref", "ReleaseStrokeData"));
  }
}

// Every touch of a finger presses alike, so that live and drawn again are the same to the last pixel, the
// grain among it.
TEST_P(Redraw, LooksAsTheLiveStrokeDid) {
  DrawingBoard board({.version = version,
                      .tool = Qelt::kToolFinger,
                      .source = Qelt::kSourceTouchScreen,
                      .width = 96,
                      .height = 48});
  const std::vector<Sample> samples = {{20.3f, 12.6f}, {85.1f, 14.2f}, {22.7f, 30.9f}};
  board.stroke(samples);
  const std::vector<std::uint8_t> live = board.pixels();
  const StrokeOnPage stroke(board, samples);
  for (const char* const how : {"recorded", "stored", "cached"}) {
    board.layer->clear();
    *how == 'r' ? board.redraw(board.recorded(samples)) : board.redraw(*stroke);
    EXPECT_TRUE(board.pixels() == live) << how;
  }
  EXPECT_NE(live, std::vector<std::uint8_t>(live.size())) << "nothing was drawn";
}

// --- The cache ---

TEST_P(Redraw, FromTheCacheGivesBitForBitWhatComputingGaveUntilTheStrokeIsDirty) {
  for (const bool curve : {true, false}) {
    SCOPED_TRACE(curve ? "curve" : "straight");
    DrawingBoard board({.version = version, .curve = curve});
    StrokeOnPage stroke(board);
    for (const std::size_t points : {4u, 5u}) {
      const Batch miss = redrawn(board, *stroke);
      const std::vector<float> rect = edges(board.rect);
      EXPECT_FALSE(miss.cached);
      EXPECT_FALSE(miss.buffers.front().empty());
      for (int repeat = 0; repeat < 3; ++repeat) {
        const Batch hit = redrawn(board, *stroke);
        EXPECT_TRUE(hit.cached) << points << " points";
        EXPECT_EQ(hit.buffers, miss.buffers);
        EXPECT_EQ(edges(board.rect), rect);
      }
      stroke->addPoint({60.0f, 60.0f}, 100, 0.5f);
      stroke->SetRedrawingCacheDirtyFlag();
    }
  }
}

// A drawing that waits for the render thread stays as it is while the stroke gets another, even where the
// queue refuses to have it given back.
TEST_P(Redraw, KeepsWhatWaitsWhenItsReleaseIsRefused) {
  DrawingBoard board({.version = version});
  StrokeOnPage stroke(board);
  const std::vector<float> before = redrawn(board, *stroke).buffers.front();
  board.queue.accept = [](const Qelt::ITask& task) { return taskName(task) != "Unref"; };
  board.redraw(*stroke);
  board.queue.accept = nullptr;
  stroke->addPoint({60.0f, 60.0f}, 100, 0.5f);
  stroke->SetRedrawingCacheDirtyFlag();
  board.redraw(*stroke);
  EXPECT_EQ(board.takeBatches().at(0).buffers.front(), before);
}

// Moving the view is no zoom.
TEST_P(Redraw, ComputesAnewAfterAZoomWhereStampsFollowTheView) {
  DrawingBoard board({.version = version});
  StrokeOnPage stroke(board);
  redrawn(board, *stroke);
  board.canvas.setMatrix(viewOf(1.0f, 30.0f, 40.0f));
  EXPECT_TRUE(redrawn(board, *stroke).cached);
  for (const float zoom : {2.0f, 1.0f}) {
    board.canvas.setMatrix(viewOf(zoom));
    EXPECT_EQ(redrawn(board, *stroke).cached, !expected.followsView);
    EXPECT_TRUE(redrawn(board, *stroke).cached);
  }
}

// A copy of a stroke is drawn from the original's entry, as long as that one is clean.
TEST_P(Redraw, LooksUpTheOriginalOfACopy) {
  DrawingBoard board({.version = version});
  StrokeOnPage original(board);
  const Batch drawn = redrawn(board, *original);

  const auto copy = board.stored(kRecordedStroke);
  copy->SetOriginalRuntimeHandle(original->GetRuntimeHandle());
  copy->ClearRedrawingCacheDirtyFlag();
  const Batch hit = redrawn(board, *copy);
  EXPECT_TRUE(hit.cached);
  EXPECT_EQ(hit.buffers, drawn.buffers);
  EXPECT_EQ(copy->GetOriginalRuntimeHandle(), original->GetRuntimeHandle());

  // A miss is stored under the original's handle; it is the original that is clean then, and the copy goes by
  // its own handle from now on.
  copy->SetRedrawingCacheDirtyFlag();
  original->SetRedrawingCacheDirtyFlag();
  EXPECT_FALSE(redrawn(board, *copy).cached);
  EXPECT_FALSE(original->IsRedrawingCacheDirty());
  EXPECT_TRUE(copy->IsRedrawingCacheDirty());
  EXPECT_EQ(copy->GetOriginalRuntimeHandle(), -1);
}

// --- Strokes of few points ---

// No segment: the end places the one stamp. The rectangle begins as the point, takes in what the end covered
// (5 around, or the stamp's reach where that is more) and grows by 5.
TEST_P(Redraw, OfOnePointPlacesOneStamp) {
  for (const bool curve : {true, false}) {
    DrawingBoard board({.version = version, .curve = curve});
    board.redraw(*board.stored({{20.0f, 30.0f, 0.5f}}));
    EXPECT_THAT(board.takeStamps(), ElementsAre(StampNear(20.0f, 30.0f, 0.0f)));
    EXPECT_EQ(board.rect.left, 15.0f - expected.tapReach);
    EXPECT_EQ(board.rect.bottom, 35.0f + expected.tapReach);
    board.redraw(board.recorded({{20.0f, 30.0f, 0.5f}}));
    EXPECT_THAT(board.takeStamps(), ElementsAre(StampNear(20.0f, 30.0f, 0.0f)));
  }
}

// Of a finger the first short move is left out; that far the rectangle reaches all the same, and 5 more.
TEST_P(Redraw, TakesPointsThatAreLeftOutIntoItsRectangleWhereItIsStraight) {
  DrawingBoard board({.version = version, .curve = false, .tool = Qelt::kToolFinger});
  const float leftOut = 30.0f + 0.9f * expected.shortMove;
  board.redraw(*board.stored({{20.0f, 30.0f}, {20.0f, leftOut}, {24.0f, 30.0f}}));
  EXPECT_FLOAT_EQ(board.rect.bottom, leftOut + 5.0f);
}

// Kept: even the redraw of nothing sets how moves are thinned out: a finger's, of which the first of two
// short ones is dropped, in the middle of a stylus's stroke.
TEST_P(Redraw, OfNothingThinsTheMovesOfTheStrokeUnderWay) {
  DrawingBoard board({.version = version});
  board.down({10.0f, 10.0f});
  board.redraw(motionEvent(Qelt::kActionUp, {{1.0f, 1.0f}}, Qelt::kToolFinger));
  board.takeBatches();
  board.move({{20.0f, 10.0f}});
  EXPECT_THAT(board.takeStamps(), IsEmpty());
  board.move({{29.0f, 10.0f}});
  EXPECT_THAT(board.takeStamps(), Not(IsEmpty()));
}

TEST_P(Redraw, TakesWhateverArraysAreMissing) {
  DrawingBoard board({.version = version});
  const auto floatsOf = [&board](const auto& stroke) { return redrawn(board, stroke).buffers.front(); };
  PartialStroke bare;
  bare.count = 3;
  bare.missing = 31;
  Error::SetError(0);
  EXPECT_THAT(floatsOf(bare), IsEmpty());  // no points: as if there were none
  EXPECT_EQ(Error::GetError(), 7u);

  bare.missing = 30;
  bare.points = {{10.0f, 10.0f}, {20.0f, 10.0f}, {30.0f, 20.0f}};
  const std::vector<float> without = floatsOf(bare);
  // No pressure is the version's own.
  std::vector<Sample> samples;
  for (const Qelt::PointF& at : bare.points) samples.push_back({at.x, at.y, expected.unknownPressure});
  // Angles that are not stored are zeros.
  for (const bool hasAngles : {true, false}) EXPECT_EQ(without, floatsOf(*board.stored(samples, hasAngles)));

  bare.count = -5;
  EXPECT_THAT(floatsOf(bare), IsEmpty());
}

// --- What goes back into the caller's data ---

TEST_P(Redraw, CapsTiltsInTheEventButNotInTheStoredStroke) {
  DrawingBoard board({.version = version});
  const std::vector<Sample> tilted = {{10.0f, 10.0f, 0.5f, 0.5f}, {50.0f, 10.0f, 0.5f, 1.2f}};
  const MotionEvent event = board.recorded(tilted);
  board.redraw(event);
  EXPECT_EQ(event.GetHistoricalTilt(0), 0.5f);
  EXPECT_EQ(event.GetHistoricalTilt(1), expected.tiltCap);
  EXPECT_EQ(event.GetTilt(0), expected.tiltCap);

  const auto stroke = board.stored(tilted);
  board.redraw(*stroke);
  EXPECT_EQ(stroke->GetTilt()[1], 1.2f);
}

// Of a stylus on a touch screen only the end is substituted in a recorded event; the first segment ends with
// the recorded pressure's alpha.
TEST_P(Redraw, TakesATouchStylussHistoryAsRecorded) {
  DrawingBoard board({.version = version, .color = 0x50202020u, .curve = false});
  const MotionEvent event =
      motionEvent(Qelt::kActionUp, {{10.0f, 10.0f, 0.4f}, {110.0f, 10.0f, 0.4f}, {210.0f, 10.0f, 0.4f}},
                  Qelt::kToolStylus, Qelt::kSourceTouchScreen);
  board.redraw(event);
  const float recorded = expected.alpha[0];
  const std::vector<Stamp> stamps = board.takeStamps();
  for (const Stamp& stamp : stamps) {
    const bool isFirst = stamp.x < 110.0f;
    EXPECT_TRUE(isFirst ? stamp.alpha <= recorded + 1e-5f : stamp.alpha >= recorded - 1e-5f) << stamp;
  }
  EXPECT_NEAR(stamps.at(stamps.size() - 1).alpha, expected.tapAlpha, 0.01f);
}

INSTANTIATE_TEST_SUITE_P(Versions, Redraw, testing::ValuesIn(allVersions()), versionName);

}  // namespace
}  // namespace QeltTests
