#include <gtest/gtest.h>

#include <vector>

#include "base/RefCount.h"
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

}  // namespace
