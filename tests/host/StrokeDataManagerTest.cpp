#include <gtest/gtest.h>

#include <cmath>
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

// Under AddressSanitizer this is the test that the last use frees, and no sooner.
TEST(StrokeDataManager, ADroppedEntryGoesWithItsLastUseAndOneMadeAnewMeanwhileIsEmpty) {
  constexpr int kHandle = 1 << 30;  // no living object's
  PenStrokeDataManager& manager = *PenStrokeDataManager::GetInstance();
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
  manager.DropStrokeData(kHandle);
}

// That is the canvas that a pen asked for its matrix last, not the one that was made or moved last.
TEST(StrokeDataManager, PointsRecordTheScaleOfTheViewThatTheyWereStoredIn) {
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
  // Of a view that squeezes everything into a point.
  EXPECT_FALSE(points->hasSameInverseScale({INFINITY, INFINITY}));
  points->Unref();
  PenStrokeDataManager::GetInstance()->SetInverseScale({1.0f, 1.0f});
}

}  // namespace
