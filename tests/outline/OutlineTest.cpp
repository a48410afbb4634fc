#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <limits>
#include <memory>
#include <string>
#include <typeinfo>
#include <utility>
#include <vector>

#include "base/Error.h"
#include "desktop/model/StoredStroke.h"
#include "desktop/pencommon/PenDataManager.h"
#include "engine/MotionEvent.h"
#include "gl/ITask.h"
#include "outline/Outliner.h"
#include "outline/Pencil2OutlineDrawableGLV1.h"
#include "outline/Pencil2OutlineDrawableGLV2.h"
#include "outline/Pencil2OutlineDrawableGLV3.h"
#include "outline/Pencil2OutlineDrawableGLV4.h"
#include "outline/Pencil2OutlineDrawableGLV5.h"
#include "pen/Pencil2.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using Qelt::Error;
using Qelt::MotionEvent;
using Qelt::RectF;
using QeltDesktop::StoredStroke;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

using V1 = Qelt::Pencil2OutlineDrawableGLV1;
using V2 = Qelt::Pencil2OutlineDrawableGLV2;
using V3 = Qelt::Pencil2OutlineDrawableGLV3;
using V4 = Qelt::Pencil2OutlineDrawableGLV4;
using V5 = Qelt::Pencil2OutlineDrawableGLV5;

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInfinity = std::numeric_limits<float>::infinity();

template <typename Drawable>
class OutlineVersions : public testing::Test {};
using AllOutlines = testing::Types<V1, V2, V3, V4, V5>;
TYPED_TEST_SUITE(OutlineVersions, AllOutlines);

const std::vector<Sample> kStroke = {{10.7f, 20.2f},
                                     {31.3f, 24.6f, 0.5f, 0.3f, 0.2f},
                                     {55.1f, 20.9f, 0.9f, 0.77f, 0.9f},
                                     {70.4f, 41.8f, 0.4f, 0.95f, 1.2f}};

// Stamps up to 1 unit wide are drawn 1.3 wide in versions 1 to 3, all of them 1 wider in 4 and 5.
template <typename Drawable>
constexpr float drawnWidth(float size) {
  if constexpr (std::is_same_v<Drawable, V4> || std::is_same_v<Drawable, V5>) return size + 1.0f;
  return size > 1.0f ? size : 1.3f;
}

TYPED_TEST(OutlineVersions, OnePointIsOneStampCutToWholeNumbers) {
  for (const bool curve : {true, false}) {
    Outliner<TypeParam> board(outlinePaper(10.0f, curve));
    board.drawable->SetOutlineSize(3.0f);
    EXPECT_TRUE(board.outline({{10.7f, -20.9f, 0.5f, 0.0f, 0.5f}}));
    for (const std::size_t stream : {0u, 1u}) {
      EXPECT_TRUE(board.outline({{10.7f, -20.9f, 0.5f, 0.0f, 0.5f}}));
      const std::vector<OutlineStamp> stamps = board.takeStamps(stream);
      const OutlineStamp& stamp = stamps.back();
      EXPECT_FLOAT_EQ(stamp.x, 10.0f);
      EXPECT_FLOAT_EQ(stamp.y, -20.0f);
      EXPECT_NEAR(stamp.directionX, -std::sin(0.5f), 1e-6f);
      EXPECT_NEAR(stamp.directionY, std::cos(0.5f), 1e-6f);
      EXPECT_EQ(stamp.tiltFactor, 0.0f);
      // The size reached so far is 0; the second stream is larger by the outline size.
      EXPECT_NEAR(stamp.half, drawnWidth<TypeParam>(0.0f) / 2.0f + (stream == 1 ? 3.0f : 0.0f), 1e-5f);
    }
    // The area goes by the point itself: 1 around the end, a straight replay 5, the outline size 3.
    EXPECT_NEAR(board.rect.left, 10.7f - 4.0f - (curve ? 0.0f : 5.0f), 1e-4f);
    EXPECT_NEAR(board.rect.bottom, -20.9f + 4.0f + (curve ? 0.0f : 5.0f), 1e-4f);
  }
}

TYPED_TEST(OutlineVersions, TheSizeReachedGoesOnToTheNextOutline) {
  Outliner<TypeParam> board(outlinePaper(4.0f, false));
  board.outline({{0.0f, 0.0f}, {40.0f, 0.0f}});
  EXPECT_NEAR(board.takeStamps().front().half, drawnWidth<TypeParam>(0.0f) / 2.0f, 1e-6f);
  // A tap does not change it, nor does the end of a stroke.
  for (int i = 0; i < 2; ++i) {
    board.outline({{5.0f, 5.0f}});
    EXPECT_NEAR(board.takeStamps().front().half, drawnWidth<TypeParam>(4.0f) / 2.0f, 1e-5f);
  }
  board.settings.size = 8.0f;
  board.outline({{0.0f, 0.0f}, {40.0f, 0.0f}});
  const std::vector<OutlineStamp> stamps = board.takeStamps();
  EXPECT_NEAR(stamps.front().half, drawnWidth<TypeParam>(4.0f) / 2.0f, 1e-5f);
  EXPECT_GT(stamps[stamps.size() / 3].half, stamps.front().half);
}

TYPED_TEST(OutlineVersions, EventsAndStoredStrokesGiveTheSameOutline) {
  for (const bool curve : {true, false}) {
    Outliner<TypeParam> board(outlinePaper(6.0f, curve));
    StoredStroke stroke(Qelt::kToolStylus);
    for (const Sample& s : kStroke) stroke.addPoint({s.x, s.y}, 4, s.pressure, s.tilt, s.orientation);
    board.outline(kStroke);  // brings the size up
    board.takeBatches();
    EXPECT_TRUE(board.outline(kStroke));
    const RectF area = board.rect;
    const auto fromEvent = board.takeBatches();
    EXPECT_TRUE(board.outline(stroke));
    const auto fromStroke = board.takeBatches();
    ASSERT_THAT(fromEvent, SizeIs(1));
    ASSERT_THAT(fromStroke, SizeIs(1));
    EXPECT_EQ(fromEvent[0].buffers, fromStroke[0].buffers);
    EXPECT_FALSE(fromEvent[0].buffers[0].empty());
    EXPECT_EQ(area.left, board.rect.left);
    // Pressure has no effect.
    std::vector<Sample> harder = kStroke;
    for (Sample& sample : harder) sample.pressure = 1.0f;
    board.outline(harder);
    EXPECT_EQ(board.takeBatches()[0].buffers, fromEvent[0].buffers);
  }
}

TYPED_TEST(OutlineVersions, HandsOverTwoStreamsAndNothingElse) {
  Outliner<TypeParam> board(outlinePaper(6.0f));
  board.outline(kStroke);
  EXPECT_THAT(board.takePosts(), ElementsAre("SetRect", "Batch", "Render", "DeleteBatch", "DeleteBatch"));
}

TYPED_TEST(OutlineVersions, RefusesWhatIsMissing) {
  Outliner<TypeParam> board(outlinePaper(6.0f));
  const MotionEvent event = board.recorded(kStroke);
  StoredStroke empty(Qelt::kToolStylus);
  RectF rect;
  for (int i = 0; i < 4; ++i) {
    Error::SetError(0);
    const bool answer = i == 0 ? board.drawable->DrawOutline(static_cast<const MotionEvent*>(nullptr), &rect)
                        : i == 1 ? board.drawable->DrawOutline(static_cast<StoredStroke*>(nullptr), &rect)
                        : i == 2 ? board.drawable->DrawOutline(&event, nullptr)
                                 : board.drawable->DrawOutline(&empty, nullptr);
    EXPECT_FALSE(answer) << i;
    EXPECT_EQ(Error::GetError(), Error::kInvalidArgument) << i;
  }
  Error::SetError(0);
  EXPECT_TRUE(board.drawable->DrawOutline(&empty, &rect));  // Kept: on curves true all the same
  EXPECT_EQ(Error::GetError(), Error::kInvalidArgument);
  EXPECT_THAT(board.takeStamps(), IsEmpty());
  board.shared.mCurveEnabled = false;
  EXPECT_FALSE(board.drawable->DrawOutline(&empty, &rect));
  board.takePosts();
  board.drawable->SetCanvas(nullptr);
  EXPECT_FALSE(board.drawable->DrawOutline(&event, &rect));
  EXPECT_THAT(board.takePosts(), IsEmpty());
  TypeParam orphan(nullptr, nullptr);
  orphan.SetCanvas(&board.canvas);
  EXPECT_FALSE(orphan.DrawOutline(&event, &rect));
  EXPECT_EQ(orphan.getSpeedScale(), 0.0f);
}

TYPED_TEST(OutlineVersions, WholeStampsWhateverComesIn) {
  const LogCapture log;
  const float bad[] = {kNaN, kInfinity, -kInfinity, 3e38f, -3e38f, 1e-40f, 0.0f, -1.0f, 5.0f};
  Outliner<TypeParam> board(outlinePaper(10.0f));
  unsigned next = 0;
  const auto value = [&] { return bad[(next = next * 5u + 3u) % 9u]; };
  for (int round = 0; round < 10; ++round) {
    next += static_cast<unsigned>(round);
    board.shared.mCurveEnabled = round % 2 == 0;
    board.settings.size = round % 3 == 0 ? value() : 10.0f;
    board.drawable->SetOutlineSize(value());
    const float x = round % 4 == 0 ? value() : static_cast<float>(round);
    board.outline({{1.0f, 2.0f, value(), value(), value()},
                   {x, 30.0f, value(), value(), value()},
                   {40.0f, 3.0f, value(), value(), value()}});
    for (const QeltDesktop::Batch& batch : board.takeBatches()) {
      ASSERT_THAT(batch.buffers, SizeIs(2));
      EXPECT_EQ(batch.buffers[0].size() % 42, 0u);
      EXPECT_EQ(batch.buffers[0].size(), batch.buffers[1].size());
    }
  }
  for (const float size : {0.0f, -3.0f, kNaN, kInfinity}) {
    board.settings.size = size;
    board.outline({{1.0f, 2.0f}, {50.0f, 2.0f}});
    EXPECT_THAT(board.takeStamps(), IsEmpty());
  }
}

TYPED_TEST(OutlineVersions, ARefusingQueueLeavesNothingBehind) {
  Outliner<TypeParam> board(outlinePaper(6.0f));
  for (int refused = 0; refused < 5; ++refused) {
    int post = 0;
    board.queue.accept = [&](const Qelt::ITask&) { return post++ != refused; };
    board.outline(kStroke);
    board.queue.finish();
  }
  board.queue.accept = nullptr;
  board.takeBatches();
  board.outline(kStroke);
  EXPECT_FALSE(board.takeStamps().empty());
}

// --- What tells the versions apart ---

TEST(Outline, VersionFourDividesEachSegmentAndRampsToItsTarget) {
  Outliner<V4> board(outlinePaper(4.0f, false));
  board.outline({{0.5f, 0.5f}, {10.5f, 0.5f}});  // 10 long: 20 stamps, then the closing segment of none
  const std::vector<OutlineStamp> stamps = board.takeStamps();
  ASSERT_THAT(stamps, SizeIs(21));
  for (int i = 0; i < 20; ++i) {
    EXPECT_FLOAT_EQ(stamps[i].x, std::trunc(0.5f + 0.5f * static_cast<float>(i))) << i;
    EXPECT_NEAR(stamps[i].half, (0.2f * static_cast<float>(i) + 1.0f) / 2.0f, 1e-4f) << i;  // 0 to 4
  }
  // The end repeats the last point: a path without length holds its one stamp.
  EXPECT_FLOAT_EQ(stamps[20].x, 10.0f);
  EXPECT_NEAR(stamps[20].half, 2.5f, 1e-4f);
}

TEST(Outline, VersionsOneAndTwoAreTheSame) {
  Outliner<V1> one(outlinePaper(2.0f));
  Outliner<V2> two(outlinePaper(2.0f));
  for (int i = 0; i < 2; ++i) {
    // The observer shows batches of both to the board made last.
    one.outline(kStroke);
    one.queue.finish();
    const auto ofOne = two.takeBatches();
    two.outline(kStroke);
    const auto ofTwo = two.takeBatches();
    ASSERT_THAT(ofOne, SizeIs(1));
    EXPECT_EQ(ofOne[0].buffers, ofTwo[0].buffers);
  }
}

TEST(Outline, VersionOneCountsBySizeAndAQuarterOfTheLength) {
  Outliner<V1> board(outlinePaper(8.0f, false));
  board.outline({{0.0f, 0.0f}, {40.0f, 0.0f}});
  EXPECT_THAT(board.takeStamps(), SizeIs(15));  // trunc(40 / 8) + 40 / 4; the end is too short for one
}

// Kept: a segment below 1 moves the mid point and enters the histories, but neither the last point nor the
// mean orientation that the next sample is unwrapped against.
TEST(Outline, VersionOneDropsShortSegmentsAndKeepsTheMeanOrientation) {
  Outliner<V1> board(outlinePaper(1.0f, false));
  // Mean 3.0. The sample -3.0 becomes 3.2832 and would raise the mean to 3.0057; -0.139 lies within pi of
  // 3.0, but not of 3.0057.
  board.outline(
      {{0.0f, 0.0f, 0.5f, 0.0f, 3.0f}, {0.5f, 0.0f, 0.5f, 0.0f, -3.0f}, {10.0f, 0.0f, 0.5f, 0.0f, -0.139f}});
  const std::vector<OutlineStamp> stamps = board.takeStamps();
  ASSERT_FALSE(stamps.empty());
  EXPECT_EQ(stamps[0].x, 0.0f);
  const float mean = (48.0f * 3.0f + 3.283185f - 0.139f) / 50.0f;
  EXPECT_NEAR(stamps[0].directionX, -std::sin(mean), 1e-5f);
  EXPECT_NEAR(stamps[0].directionY, std::cos(mean), 1e-5f);
}

TEST(Outline, VersionFiveCapsTiltHigherAndAveragesThreeSamples) {
  const std::vector<Sample> tilted(5, {0.0f, 0.0f, 0.5f, 1.3f});
  std::vector<Sample> samples = tilted;
  for (std::size_t i = 0; i < samples.size(); ++i) samples[i].x = 20.0f * static_cast<float>(i);
  Outliner<V4> four(outlinePaper(4.0f, false));
  MotionEvent event = four.recorded(samples);
  four.outline(event);
  EXPECT_EQ(event.GetHistoricalTilt(2), 0.79f);
  EXPECT_EQ(event.GetTilt(0), 0.79f);
  EXPECT_NEAR(four.takeStamps().back().tiltFactor, 0.5f, 1e-4f);  // (0.79 - 0.75) / 0.08
  Outliner<V5> five(outlinePaper(4.0f, false));
  event = five.recorded(samples);
  five.outline(event);
  EXPECT_EQ(event.GetHistoricalTilt(2), 1.0f);
  const std::vector<OutlineStamp> stamps = five.takeStamps();
  EXPECT_NEAR(stamps.back().tiltFactor, 0.5f, 1e-5f);  // (1 - 0.05) / 1.9
  EXPECT_NEAR(stamps.back().half, 7.5f, 0.1f);         // 4 + 4 * 5 * 0.5, and 1
  samples[0].tilt = 0.0f;                              // upright, then three of the samples at 1
  event = five.recorded(samples);
  five.outline(event);
  EXPECT_NEAR(five.takeStamps()[0].tiltFactor, (1.0f / 3.0f - 0.05f) / 1.9f, 1e-5f);
}

TEST(Outline, FingersTakeShortMovesEveryOtherTime) {
  BoardOptions options = outlinePaper(10.0f, false);
  options.tool = Qelt::kToolFinger;
  options.source = Qelt::kSourceTouchScreen;
  Outliner<V3> finger(options);
  finger.outline({{0.0f, 0.0f}, {20.0f, 0.0f}, {40.0f, 0.0f}});
  // From 0 to 40 in one segment of 32 stamps, and the one of the end.
  EXPECT_THAT(finger.takeStamps(), SizeIs(33));
  Outliner<V3> pen(outlinePaper(10.0f, false));
  pen.outline({{0.0f, 0.0f}, {20.0f, 0.0f}, {21.9f, 0.0f}, {40.0f, 0.0f}});
  // 16 to 20 and 16 to 40: the move below size / 5 is dropped, the others are not.
  EXPECT_THAT(pen.takeStamps(), SizeIs(33));
}

TEST(Outline, ScalesComeFromTheScreen) {
  Outliner<V4> board(outlinePaper(10.0f));
  EXPECT_EQ(board.drawable->getSpeedScale(), 0.0f);  // Kept: no screen, where a stroke answers 1
  EXPECT_EQ(board.drawable->getPixelScale(), 1.0f);
  board.settings.screenWidth = 720;
  board.settings.screenHeight = 2960;
  EXPECT_EQ(board.drawable->getSpeedScale(), 2.0f);
  EXPECT_EQ(board.drawable->getPixelScale(), 2.0f);
}

// --- The getter ---

TEST(OutlineGetter, FollowsTheVersionTable) {
  QeltDesktop::PenDataManager data(nullptr);
  Qelt::Pencil2 pen;
  pen.setPenDataManager(&data);
  const std::vector<std::pair<int, const std::type_info*>> expected = {
      {-3, &typeid(V1)}, {0, &typeid(V1)}, {1, &typeid(V1)}, {2, &typeid(V2)},
      {3, &typeid(V3)},  {4, &typeid(V4)}, {5, &typeid(V5)}, {6, &typeid(V4)},
      {7, &typeid(V4)},  {8, &typeid(V4)}, {9, &typeid(V1)}};
  for (const auto& [version, type] : expected) {
    pen.setVersion(version);
    Qelt::PenOutlineDrawableGL* outline = pen.GetOutlineDrawableGL();
    ASSERT_NE(outline, nullptr);
    const Qelt::PenOutlineDrawableGL& made = *outline;
    EXPECT_TRUE(typeid(made) == *type) << version;
    EXPECT_EQ(pen.GetOutlineDrawableGL(), outline);
  }
  // Versions 6 to 8 share one.
  pen.setVersion(6);
  pen.GetOutlineDrawableGL()->SetOutlineSize(7.0f);
  pen.setVersion(8);
  EXPECT_EQ(pen.GetOutlineDrawableGL()->GetOutlineSize(), 7.0f);
  // The preview has no version.
  Qelt::PenPreviewDrawableGL* preview = pen.GetPreviewDrawableGL();
  ASSERT_NE(preview, nullptr);
  pen.setVersion(2);
  EXPECT_EQ(pen.GetPreviewDrawableGL(), preview);
}

}  // namespace
}  // namespace QeltTests
