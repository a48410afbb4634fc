// What a pen makes of memory that runs out half way and is there again at the next demand.

#include <gtest/gtest.h>

#include <memory>

#include "base/RectF.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/pencommon/PenDataManager.h"
#include "engine/MotionEvent.h"
#include "pen/PencilEntry.h"
#include "pencommon/IPenMorphable.h"
#include "pencommon/Pen.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "support/Allocations.h"

namespace QeltTests {
namespace {

using Qelt::MotionEvent;
using Qelt::Pen;
using Qelt::RectF;
using QeltDesktop::RenderQueue;

class Recovery : public testing::Test {
 protected:
  void SetUp() override {
    if (!countsAllocations()) GTEST_SKIP() << "the sanitizers bring allocation functions of their own";
  }
  ~Recovery() override {
    pen.reset();
    queue.finish();
  }

  // One that failed while it was made, at the given allocation; null when the pen itself was that one.
  bool makePen(long failingAllocation) {
    pen.reset();
    queue.finish();
    bool failed;
    {
      const FailingAllocation failing(failingAllocation);
      pen.reset(createPenInst());
      failed = failing.hasFailed();
    }
    if (pen == nullptr) return failed;
    pen->setPenDataManager(&data);
    pen->setVersion(8);
    return failed;
  }

  static MotionEvent down() {
    const Qelt::PointerProperties pointer{0, Qelt::kToolStylus};
    const Qelt::PointerCoords coords{10.0f, 10.0f, 0.5f, 0.0f, 0.0f};
    return MotionEvent(0, 1, Qelt::kActionDown, 1, &pointer, &coords, 0, Qelt::kSourceStylus, 0);
  }

  RenderQueue queue{RenderQueue::Mode::Caller, RenderQueue::GL::None};
  QeltDesktop::PenDataManager data{&queue};
  QeltDesktop::PenCanvas canvas{&queue, nullptr};
  std::unique_ptr<Pen> pen;
};

TEST_F(Recovery, APenWhoseRecordCouldNotBeMadeMakesItLater) {
  for (long number = 0; makePen(number); ++number) {
    if (pen == nullptr) continue;
    EXPECT_TRUE(pen->GetMorphable()->IsCurveEnabled()) << "allocation " << number;
    EXPECT_TRUE(pen->GetMorphable()->SetFixedWidth(3.0f));
    EXPECT_EQ(pen->GetMorphable()->GetFixedWidth(), 3.0f) << "allocation " << number;
    Qelt::PenStrokeDrawableGL* const drawable = pen->GetStrokeDrawableGL();
    ASSERT_NE(drawable, nullptr);
    drawable->SetCanvas(&canvas);
    const MotionEvent event = down();
    RectF rect;
    EXPECT_TRUE(drawable->Draw(&event, &rect)) << "allocation " << number;
  }
}

TEST_F(Recovery, AGetterMakesAWholeDrawableOrNone) {
  ASSERT_FALSE(makePen(1000));
  int failures = 0;
  const auto each = [&](auto get, auto draws) {
    for (long number = 0;; ++number) {
      ASSERT_FALSE(makePen(1000));
      bool failed;
      {
        const FailingAllocation failing(number);
        (pen.get()->*get)();
        failed = failing.hasFailed();
      }
      if (!failed) break;
      ++failures;
      auto* const drawable = (pen.get()->*get)();
      ASSERT_NE(drawable, nullptr);
      drawable->SetCanvas(&canvas);
      EXPECT_TRUE(draws(*drawable)) << "allocation " << number;
    }
  };
  const MotionEvent event = down();
  RectF rect;
  each(&Pen::GetStrokeDrawableGL, [&](auto& drawable) { return drawable.Draw(&event, &rect); });
  each(&Pen::GetOutlineDrawableGL, [&](auto& drawable) { return drawable.DrawOutline(&event, &rect); });
  each(&Pen::GetPreviewDrawableGL, [&](auto& drawable) { return drawable.Draw(&event, &rect); });
  // Each kind has two halves at the least.
  EXPECT_GE(failures, 6);
}

}  // namespace
}  // namespace QeltTests
