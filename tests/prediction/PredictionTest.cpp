#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "desktop/pencommon/PenDataManager.h"
#include "engine/MotionEvent.h"
#include "pen/Pencil2.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "prediction/Pencil2PredictionDrawableGL.h"
#include "stroke/StrokeDrawables.h"
#include "support/DrawableBoard.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using Qelt::MotionEvent;
using Qelt::Pencil2PredictionDrawableGL;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

using PredictionBoard = DrawableBoard<Pencil2PredictionDrawableGL>;

void leaveStrokeAlongX(Qelt::Pencil2Data& shared) {
  leaveStroke(shared, {3.3f, 2.7f}, {10.0f, 0.0f}, {20.0f, 0.0f});
  std::tie(shared.mLastWidth, shared.mLastOrientation, shared.mTiltBlend) = std::tuple(4.0f, 0.0f, 0.25f);
}

TEST(Prediction, GoesOnFromTheLastStampWithItsLooks) {
  PredictionBoard board;
  leaveStrokeAlongX(board.shared);
  EXPECT_TRUE(board.move({{30.5f, 0.0f, 0.1f, 0.7f, 2.0f}}));  // only the position counts
  const std::vector<Stamp> placed = board.takeStamps();
  ASSERT_THAT(placed, SizeIs(20));  // from 10 to 30.5, one a unit
  for (std::size_t i = 0; i < placed.size(); ++i) {
    EXPECT_THAT(placed[i], StampNear(11.0f + static_cast<float>(i), 0.0f, 0.02f)) << i;
    EXPECT_NEAR(placed[i].halfWidth, 2.5f, 1e-5f);  // half of 4, and half a pixel
    EXPECT_NEAR(placed[i].alpha, 0.2f, 1e-6f);      // 0.6 / 3
    EXPECT_EQ(placed[i].tile, static_cast<int>((7 + i) % 3)) << i;
    EXPECT_EQ(placed[i].narrowing, 0.25f);
    EXPECT_EQ(placed[i].directionY, 1.0f);
  }
  // The live stroke goes on from where it was.
  EXPECT_EQ(board.shared.mStampCount, 7);
  EXPECT_EQ(board.shared.mLastStampX, 10.0f);
  // From the last stamp to the last stamp placed, a quarter of the width and 1 around.
  EXPECT_FLOAT_EQ(board.rect.left, 9.0f);
  EXPECT_NEAR(board.rect.right, 32.0f, 0.02f);
  EXPECT_FLOAT_EQ(board.rect.top, -2.0f);
  EXPECT_THAT(board.takePosts(),
              ElementsAre("SetStartPoint", "SetPenData", "SetRect", "Batch", "Render", "DeleteBatch"));
}

TEST(Prediction, EveryStateOfTheLiveStrokeIsPredictedFromOnce) {
  PredictionBoard board;
  EXPECT_FALSE(board.move({{30.0f, 0.0f}}));  // no stroke yet
  EXPECT_THAT(board.takePosts(), IsEmpty());
  // Any other event uses the state up and draws nothing.
  leaveStrokeAlongX(board.shared);
  EXPECT_FALSE(board.up({30.0f, 0.0f}));
  EXPECT_THAT(board.takePosts(), ElementsAre("SetRect", "Batch", "Render", "DeleteBatch"));
  EXPECT_THAT(board.takeStamps(), IsEmpty());
  EXPECT_FALSE(board.shared.mHasLastStroke);
  // Nothing is carried from one to the next.
  std::vector<float> once;
  for (const float x : {30.0f, 77.7f, 30.0f}) {
    leaveStrokeAlongX(board.shared);
    EXPECT_TRUE(board.move({{x, 0.0f}}));
    const std::vector<float> floats = board.takeFloats();
    EXPECT_FALSE(board.move({{x, 0.0f}}));
    EXPECT_THAT(board.takeBatches(), IsEmpty());
    if (once.empty()) once = floats;
    EXPECT_EQ(floats == once, x == 30.0f);
  }
}

// Kept: before a stroke's first stamp the prediction goes on from wherever the stroke before it ended.
TEST(Prediction, BeforeTheFirstStampStartsFromTheStrokeBefore) {
  PredictionBoard board;
  leaveStrokeAlongX(board.shared);
  // A new stroke far away has begun, and has not placed a stamp yet.
  board.shared.mStartX = board.shared.mLastX = 500.0f;
  board.shared.mStartY = board.shared.mLastY = 500.0f;
  board.shared.mStampCount = 0;
  board.move({{510.0f, 500.0f}});
  EXPECT_THAT(board.takeStamps().at(0), StampNear(10.0f, 0.0f, 1.01f));
}

TEST(Prediction, StartsNowhereFromARecordOutOfBounds) {
  PredictionBoard board;
  const MotionEvent event = motionEvent(Qelt::kActionMove, {{30.0f, 0.0f}});
  using Data = Qelt::Pencil2Data;
  for (const auto field :
       {&Data::mLastStampX, &Data::mLastStampY, &Data::mLastX, &Data::mLastY, &Data::mLastWidth,
        &Data::mLastOrientation, &Data::mLastAlpha, &Data::mTiltBlend}) {
    for (const float value : {NAN, INFINITY, -INFINITY}) {
      leaveStrokeAlongX(board.shared);
      board.shared.*field = value;
      EXPECT_FALSE(board.send(event));
      EXPECT_THAT(board.takeFloats(), IsEmpty());
    }
  }
  // A count below 0 does no harm, nor does a drawable without a record, as when memory ran out.
  leaveStrokeAlongX(board.shared);
  board.shared.mStampCount = -5;
  EXPECT_TRUE(board.send(event));
  EXPECT_EQ(board.takeStamps().at(0).tile, 0);
  Pencil2PredictionDrawableGL orphan(nullptr, nullptr);
  orphan.SetCanvas(&board.canvas);
  orphan.SetOpacity(0.5f);
  EXPECT_FALSE(orphan.Draw(&event, &board.rect));
}

// --- The getter ---

class PredictionGetter : public testing::Test {
 protected:
  PredictionGetter() { mPen.setPenDataManager(&mData); }

  QeltDesktop::PenDataManager mData{nullptr};
  Qelt::Pencil2 mPen;
};

TEST_F(PredictionGetter, AnswersForVersionEightAlone) {
  mPen.setVersion(8);
  Qelt::IPenPredictionDrawableGL* const made = mPen.GetPredictionStrokeDrawableGL();
  ASSERT_NE(made, nullptr);
  for (const auto& [version, stroke] :
       {std::pair(7, 7), std::pair(6, 6), std::pair(newestVersion() + 1, 1)}) {
    mPen.setVersion(version);
    LogCapture log;
    EXPECT_EQ(mPen.GetPredictionStrokeDrawableGL(), nullptr);
    const std::vector<LogLine> lines = log.take();
    ASSERT_THAT(lines, SizeIs(2));
    // Kept: the two numbers stand the wrong way round.
    EXPECT_EQ(lines[0].text,
              "virtual Qelt::IPenPredictionDrawableGL *Qelt::Pencil2::GetPredictionStrokeDrawableGL() - "
              "Stroke drawble version (8) does not match prediction drawable(" +
                  std::to_string(stroke) + ").");
    EXPECT_EQ(lines[1].text,
              "Please, update prediction drawable to last stroke drawable and update "
              "PEN_PREDICTION_CURRENT_VERSION");
    EXPECT_EQ(lines[0].priority, 6);
  }
  mPen.setVersion(8);
  EXPECT_EQ(mPen.GetPredictionStrokeDrawableGL(), made);  // it was not made anew
}

// Kept: the getter stores the version as if it had made a stroke drawable of it.
TEST_F(PredictionGetter, MakesTheStrokeGetterKeepADrawableOfAnotherVersion) {
  mPen.setVersion(1);
  mPen.GetStrokeDrawableGL();
  mPen.setVersion(8);
  mPen.GetPredictionStrokeDrawableGL();
  EXPECT_NE(dynamic_cast<Qelt::Pencil2StrokeDrawableGLV1*>(mPen.GetStrokeDrawableGL()), nullptr);
}

}  // namespace
}  // namespace QeltTests
