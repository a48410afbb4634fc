#include <gmock/gmock.h>

#include <chrono>
#include <future>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "desktop/gl/CallTask.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/pencommon/PenDataManager.h"
#include "gl/IGLMsgQueue.h"
#include "gl/ITask.h"
#include "pencommon/PenDrawableGL.h"
#include "pencommon/PenStrokeDrawableRT.h"
#include "support/LogCapture.h"

namespace {

using QeltDesktop::CanvasLayer;
using QeltDesktop::PenCanvas;
using QeltDesktop::PenDataManager;
using QeltDesktop::RenderQueue;
using testing::ElementsAre;

using Notes = std::vector<std::string>;

// Notes what the render thread is asked to do.
class NotingRT : public Qelt::PenStrokeDrawableRT {
 public:
  explicit NotingRT(Notes& notes) : PenStrokeDrawableRT(nullptr), mNotes(notes) {}
  ~NotingRT() override { mNotes.push_back("gone"); }
  void CreatePenCanvas(int width, int height, Qelt::IGLMsgQueue*) override {
    mNotes.push_back("create " + std::to_string(width) + " x " + std::to_string(height));
  }
  void Release() override { mNotes.push_back("release"); }

 private:
  Notes& mNotes;
};

class PlainGL : public Qelt::PenDrawableGL {
 public:
  PlainGL(Qelt::PenGLDataManager* manager, Qelt::PenDrawableRT* partner) : PenDrawableGL(manager) {
    setDrawableRT(partner);
  }
  ~PlainGL() override { destroy(); }
};

// Batches go by the canvas's queue, whoever's data manager has one.
TEST(Drawables, OfACanvasWithoutALayerPrepareNothingAndOutliveWhatIsQueued) {
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::None);
  PenCanvas canvas(&queue, nullptr);
  int posts = 0;
  queue.onAccepted = [&](const Qelt::ITask&) { ++posts; };
  for (RenderQueue* const managersQueue : {&queue, static_cast<RenderQueue*>(nullptr)}) {
    PenDataManager manager(managersQueue);
    Notes notes;
    {
      PlainGL drawable(&manager, new NotingRT(notes));
      posts = 0;
      drawable.SetCanvas(&canvas);
      EXPECT_EQ(drawable.GetCanvas(), &canvas);
      drawable.SetCanvas(nullptr);
      EXPECT_EQ(posts, 0);
    }
    EXPECT_THAT(notes, ElementsAre()) << "work for the partner may still be queued";
    queue.finish();
    EXPECT_THAT(notes, ElementsAre("gone"));
  }
}

// Refusals may come at any post; whatever was taken runs first, and the partner is released if it was
// prepared and gone exactly once.
TEST(Drawables, PrepareAndReleaseTheirPartnerThroughAQueueThatMayRefuse) {
  for (const auto mode : {RenderQueue::Mode::Thread, RenderQueue::Mode::Caller}) {
    for (int refusedPost = 0; refusedPost < 4; ++refusedPost) {
      for (const bool fromThereOn : {false, true}) {
        SCOPED_TRACE(std::to_string(refusedPost) + (fromThereOn ? " and after" : ""));
        RenderQueue queue(mode, RenderQueue::GL::Context);
        PenDataManager manager(&queue);
        CanvasLayer layer(queue, 30, 20);
        PenCanvas canvas(&queue, &layer);
        int posts = 0;
        queue.accept = [&](const Qelt::ITask&) {
          const int post = posts++;
          return fromThereOn ? post < refusedPost : post != refusedPost;
        };
        Notes notes;
        {
          PlainGL drawable(&manager, new NotingRT(notes));
          drawable.SetCanvas(&canvas);
        }
        queue.finish();
        const Notes whole{"create 30 x 20", "release", "gone"};
        EXPECT_EQ(notes, refusedPost == 0 ? Notes{"gone"} : whole);
      }
    }
  }
}

TEST(Drawables, DoNotAskAQueueThatIsGoneWithItsCanvas) {
  PenDataManager manager(nullptr);
  PlainGL drawable(&manager, nullptr);
  for (int i = 0; i < 2; ++i) {
    const auto queue = std::make_unique<RenderQueue>(RenderQueue::Mode::Caller, RenderQueue::GL::None);
    PenCanvas canvas(queue.get(), nullptr);
    drawable.SetCanvas(&canvas);
    EXPECT_EQ(RenderQueue::ifAlive(queue.get()), queue.get());
    drawable.SetCanvas(nullptr);
  }
}

// The queue still has work for the render drawable, and takes no more: then that goes after that work, or
// stays where nobody could wait for it.
TEST(Drawables, ARenderDrawableOutlivesItsWorkHoweverItsQueueEnds) {
  const QeltTests::LogCapture log;
  Notes notes;
  {
    RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::Context);
    PenDataManager manager(&queue);
    CanvasLayer layer(queue, 8, 8);
    PenCanvas canvas(&queue, &layer);
    auto drawable = std::make_unique<PlainGL>(&manager, new NotingRT(notes));
    drawable->SetCanvas(&canvas);
    std::promise<void> closed;
    // Both from the render thread: neither runs before both are posted.
    queue.run([&] {
      QeltDesktop::postCall(queue, [&] {
        queue.shutDown();
        closed.set_value();
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
      });
      QeltDesktop::postCall(queue, [&] { notes.push_back("drawn"); });
    });
    closed.get_future().wait();
    drawable.reset();
    EXPECT_THAT(notes, ElementsAre("create 8 x 8", "drawn", "release", "gone"));
  }
  notes.clear();
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::None),
      other(RenderQueue::Mode::Caller, RenderQueue::GL::None);
  PenDataManager manager(&queue);
  const std::unique_ptr<NotingRT> left(new NotingRT(notes));
  auto drawable = std::make_unique<PlainGL>(&manager, left.get());
  PenCanvas canvas(&queue, nullptr), others(&other, nullptr);
  drawable->SetCanvas(&canvas);
  QeltDesktop::postCall(queue, [&] { notes.push_back("drawn"); });
  drawable->SetCanvas(&others);
  EXPECT_THAT(notes, ElementsAre("drawn")) << "ahead of anything that the other canvas's queue runs";
  QeltDesktop::postCall(queue, [&] { notes.push_back("drawn on"); });
  queue.accept = [](const Qelt::ITask&) { return false; };
  std::thread([&] { drawable.reset(); }).join();  // may post, and not wait
  queue.finish();
  EXPECT_THAT(notes, ElementsAre("drawn", "drawn on"));
}

}  // namespace
