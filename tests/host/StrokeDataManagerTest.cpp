#include <gtest/gtest.h>

#include <limits>
#include <vector>

#include "base/RefCount.h"
#include "desktop/graphics/PenCanvas.h"
#include "math/Matrix3.h"
#include "pencommon/PenStrokeDataManager.h"

namespace {

using Qelt::PenStrokeData;
using Qelt::PenStrokeDataManager;
using Qelt::PenStrokePointData;

PenStrokePointData* pointsOf(std::vector<float> floats) {
  auto* const points = new PenStrokePointData;
  points->mBuffer = new std::vector<float>(std::move(floats));
  return points;
}

class StrokeDataManager : public testing::Test {
 protected:
  void SetUp() override { manager.SetInverseScale({1.0f, 1.0f}); }
  void TearDown() override { manager.DropStrokeData(kHandle); }

  static constexpr int kHandle = 1 << 30;  // no living object's
  PenStrokeDataManager& manager = *PenStrokeDataManager::GetInstance();
};

// Under AddressSanitizer this is the test that the last use frees, and no sooner.
TEST_F(StrokeDataManager, ADroppedEntryGoesWithItsLastUseAndOneMadeAnewMeanwhileIsEmpty) {
  for (const bool isMadeAnew : {false, true}) {
    manager.CreateStrokeData(kHandle);
    PenStrokeData* const data = manager.GetStrokeData(kHandle);
    PenStrokePointData* const points = pointsOf({1, 2, 3});
    EXPECT_TRUE(data->SetPointData(points));
    points->Unref();
    PenStrokePointData* const counted = data->GetPointData();
    manager.DropStrokeData(kHandle);
    EXPECT_EQ(manager.GetStrokeData(kHandle), nullptr);
    if (isMadeAnew) {
      manager.CreateStrokeData(kHandle);
      EXPECT_EQ(manager.GetStrokeData(kHandle), data);
      EXPECT_EQ(data->GetPointData(), nullptr);
      manager.ReleaseStrokeData(kHandle);
    }
    manager.ReleaseStrokeData(kHandle);
    EXPECT_EQ(counted->mBuffer->size(), 3u);
    counted->Unref();
    manager.ReleaseStrokeData(kHandle);
  }
}

// That is the canvas that a pen asked for its matrix last, not the one that was made or moved last.
TEST_F(StrokeDataManager, PointsRecordTheScaleOfTheViewThatTheyWereStoredIn) {
  QeltDesktop::PenCanvas canvas(nullptr, nullptr);
  Qelt::Matrix3<float> zoom;
  zoom.setScale(4.0f, 2.0f);
  canvas.setMatrix(zoom);
  canvas.GetMatrix();
  QeltDesktop::PenCanvas other(nullptr, nullptr);
  other.setMatrix(Qelt::Matrix3<float>());
  PenStrokeData data;
  PenStrokePointData* const points = pointsOf({1});
  EXPECT_TRUE(data.SetPointData(points));
  EXPECT_TRUE(points->hasSameInverseScale({0.25f, 0.5f}));
  EXPECT_FALSE(points->hasSameInverseScale({0.5f, 0.5f}));
  EXPECT_FALSE(points->hasSameInverseScale({0.25f, 0.25f}));
  canvas.setMatrix(Qelt::Matrix3<float>());
  EXPECT_TRUE(points->hasSameInverseScale({0.25f, 0.5f}));
  // Of a view that squeezes everything into a point.
  constexpr float kInfinity = std::numeric_limits<float>::infinity();
  EXPECT_FALSE(points->hasSameInverseScale({kInfinity, kInfinity}));
  points->Unref();
}

}  // namespace
