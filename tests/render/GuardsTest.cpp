#include <gmock/gmock.h>

#include <cstddef>
#include <string>
#include <utility>
#include <vector>

#include "base/RectF.h"
#include "gl/ITask.h"
#include "render/Fakes.h"
#include "render/PenGLRenderMsg.h"
#include "stroke/StrokeGuards.h"
#include "support/Allocations.h"
#include "support/DrawableBoard.h"

namespace QeltTests {
namespace {

using namespace Qelt;
using testing::ElementsAre;
using testing::IsEmpty;

class Guards : public testing::Test {
 protected:
  Guards() { canvas.queue = &queue; }
  // What was handed over frees itself.
  ~Guards() override { queue.run(); }

  // One call that collects `floats` floats.
  void draw(std::size_t floats) {
    Pencil2V8ReturnCallback guard(&drawable, &canvas, &unclaimed);
    if (drawable.writeBuffer() != nullptr) drawable.writeBuffer()->resize(floats);
    guard.setRect({1.0f, 2.0f, 3.0f, 4.0f});
  }
  Events take() { return std::exchange(events, {}); }
  std::vector<std::string> posted() const {
    std::vector<std::string> names;
    for (const auto& task : queue.tasks) names.push_back(taskName(*task));
    return names;
  }
  // The post of that number, from 0 on, is refused.
  void refuse(int number) {
    queue.refuses = [number](const ITask&) mutable { return number-- == 0; };
  }

  Events events;
  FakeQueue queue;
  FakeCanvas canvas{events};
  FakeDrawable drawable{events};
  UnclaimedBatch unclaimed;
};

TEST_F(Guards, HandABatchOverWithItsMessageAndItsDeletion) {
  draw(66);
  // The drawable appends nowhere before anything is posted.
  EXPECT_THAT(take(), ElementsAre("buffer", "queue", "no buffer"));
  EXPECT_THAT(posted(), ElementsAre("Batch", "Render", "DeleteBatch"));
  EXPECT_TRUE(queue.tasks[0]->isGlobalLockAllowed());
  EXPECT_EQ(queue.tasks[0]->mNext, nullptr);
  const auto& message = dynamic_cast<const PenGLRenderMsg&>(*queue.tasks[1]);
  EXPECT_EQ(message.mRect.bottom, 4.0f);
  EXPECT_EQ(message.mDrawable, &drawable);
  EXPECT_EQ(message.mCanvas, &canvas);
  EXPECT_FALSE(message.mUseCacheBuffer);
  EXPECT_EQ(message.mReferenceBitmap, nullptr);
  EXPECT_EQ(message.mDepthMapBitmap, nullptr);
  queue.run();
  EXPECT_THAT(take(), ElementsAre("send 66", "update", "begin 0", "draw at 0", "end 0", "clear"));
}

// Refused: the batch, its message, or its deletion. The next call puts it right before its own batch.
TEST_F(Guards, LoseNothingToARefusal) {
  const long before = liveAllocations();
  refuse(0);
  draw(1);
  EXPECT_THAT(posted(), IsEmpty());  // the guard frees what nobody took
  draw(2);
  EXPECT_THAT(posted(), ElementsAre("Batch", "Render", "DeleteBatch"));
  queue.run();

  refuse(1);
  draw(3);
  EXPECT_THAT(posted(), ElementsAre("Batch"));
  draw(4);  // first the one that was never drawn is forgotten and freed
  EXPECT_THAT(posted(), ElementsAre("Batch", "Clear", "DeleteBatch", "Batch", "Render", "DeleteBatch"));
  queue.run();

  refuse(2);
  draw(5);
  EXPECT_THAT(posted(), ElementsAre("Batch", "Render"));
  draw(6);
  EXPECT_THAT(posted(), ElementsAre("Batch", "Render", "DeleteBatch", "Batch", "Render", "DeleteBatch"));
  queue.run();

  // While the old one cannot be freed, no new batch is handed over.
  refuse(2);
  draw(7);
  queue.run();
  refuse(0);
  draw(8);
  EXPECT_THAT(posted(), IsEmpty());
  draw(9);
  EXPECT_THAT(posted(), ElementsAre("DeleteBatch", "Batch", "Render", "DeleteBatch"));
  queue.run();
  take();
  EXPECT_EQ(liveAllocations(), before);
}

TEST_F(Guards, StayInertWithoutMemoryForTheBatch) {
  if (!countsAllocations()) GTEST_SKIP() << "allocations are the sanitizer's";
  {
    const FailingAllocation first(0);
    const Pencil2V8ReturnCallback guard(&drawable, &canvas, &unclaimed);
    EXPECT_EQ(guard.buffer(), nullptr);
  }
  EXPECT_THAT(take(), IsEmpty());
  EXPECT_THAT(posted(), IsEmpty());
}

TEST_F(Guards, OfACachedBatchBorrowIt) {
  std::vector<float> cached(54, 1.0f);
  const auto redraw = [&](std::vector<float>* batch) {
    return Pencil2V7CacheRedrawCallback(&drawable, &canvas, &unclaimed).present(batch, {});
  };
  EXPECT_TRUE(redraw(&cached));
  EXPECT_THAT(posted(), ElementsAre("Batch", "Render"));
  EXPECT_TRUE(dynamic_cast<const PenGLRenderMsg&>(*queue.tasks[1]).mUseCacheBuffer);
  take();
  queue.run();
  EXPECT_THAT(take(), ElementsAre("cache 54", "update cache", "begin 0", "draw at 0", "end 0", "clear"));
  EXPECT_EQ(cached.size(), 54u);

  EXPECT_FALSE(redraw(nullptr));
  EXPECT_THAT(posted(), IsEmpty());
  refuse(0);
  EXPECT_FALSE(redraw(&cached));
  EXPECT_THAT(posted(), IsEmpty());  // no message that would draw the batch before
}

}  // namespace
}  // namespace QeltTests
