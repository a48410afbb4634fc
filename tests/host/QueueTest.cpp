#include <gmock/gmock.h>

#include <atomic>
#include <chrono>
#include <future>
#include <memory>
#include <new>
#include <set>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

#include "desktop/gl/CallTask.h"
#include "desktop/gl/RenderQueue.h"
#include "gl/ITask.h"
#include "support/AllocationGate.h"
#include "support/LogCapture.h"

namespace {

using QeltDesktop::postCall;
using QeltDesktop::RenderQueue;

class Queue : public testing::TestWithParam<RenderQueue::Mode> {};

INSTANTIATE_TEST_SUITE_P(Modes, Queue, testing::Values(RenderQueue::Mode::Thread, RenderQueue::Mode::Caller));

// Counts the tasks alive, to see each one deleted once.
class CountedTask final : public Qelt::ITask {
 public:
  CountedTask(std::atomic<int>& alive, std::atomic<int>& ran) : mAlive(alive), mRan(ran) { ++mAlive; }
  ~CountedTask() override { --mAlive; }
  void run() override { ++mRan; }

 private:
  std::atomic<int>& mAlive;
  std::atomic<int>& mRan;
};

TEST_P(Queue, TasksMayPostTasks) {
  RenderQueue queue(GetParam(), RenderQueue::GL::None);
  std::string order;
  // Both from the render thread: neither can run before both are posted.
  queue.run([&] {
    postCall(queue, [&] {
      order += 'a';
      postCall(queue, [&] { order += 'c'; });
      queue.finish();  // returns at once instead of waiting for itself
      EXPECT_TRUE(queue.run([&] { order += '!'; }));
    });
    postCall(queue, [&] { order += 'b'; });
  });
  queue.finish();
  queue.finish();
  EXPECT_EQ(order, "a!bc");
}

TEST_P(Queue, RefusesWithoutTakingOwnershipAndIgnoresNull) {
  std::atomic<int> alive{0}, ran{0};
  RenderQueue queue(GetParam(), RenderQueue::GL::None);
  EXPECT_TRUE(queue.Post(nullptr));
  queue.accept = [](const Qelt::ITask&) { return false; };
  auto task = std::make_unique<CountedTask>(alive, ran);
  EXPECT_FALSE(queue.Post(task.get()));
  EXPECT_EQ(alive, 1);
  // The host's own calls get through.
  bool called = false;
  EXPECT_TRUE(queue.run([&] { called = true; }));
  EXPECT_TRUE(called);
  queue.accept = nullptr;
  EXPECT_TRUE(queue.Post(task.release()));
  queue.finish();
  EXPECT_EQ(ran, 1);
  EXPECT_EQ(alive, 0);
}

// So a layer, too, can go while there is none; and a task that runs out of it takes nothing else along.
TEST_P(Queue, AsksForNoMemory) {
  std::atomic<int> alive{0}, ran{0};
  RenderQueue queue(GetParam(), RenderQueue::GL::None);
  auto* const task = new CountedTask(alive, ran);
  postCall(queue, [] { throw std::bad_alloc(); });
  const QeltTests::FailingAllocation first(0);
  EXPECT_TRUE(queue.Post(task));
  EXPECT_TRUE(queue.run([&] { EXPECT_EQ(ran, 1); }));
  queue.finish();
  EXPECT_FALSE(first.hasFailed());
  EXPECT_EQ(alive, 0);
}

TEST_P(Queue, ItsEndRunsWhatWasPostedAndTakesNoMore) {
  std::atomic<int> alive{0}, ran{0};
  for (const bool isShutDown : {true, false}) {
    RenderQueue queue(GetParam(), RenderQueue::GL::None);
    for (int i = 0; i < 50; ++i) queue.Post(new CountedTask(alive, ran));
    if (!isShutDown) continue;
    queue.shutDown();
    EXPECT_EQ(ran, 50);
    const auto late = std::make_unique<CountedTask>(alive, ran);
    EXPECT_FALSE(queue.Post(late.get()));
    EXPECT_FALSE(queue.run([] { FAIL(); }));
    queue.finish();
    queue.shutDown();
  }
  EXPECT_EQ(ran, 100);
  EXPECT_EQ(alive, 0);
}

TEST_P(Queue, LogsWhatATaskThrowsAndHandsBackWhatACallThrows) {
  const auto capture = std::make_unique<QeltTests::LogCapture>();
  RenderQueue queue(GetParam(), RenderQueue::GL::None);
  bool next = false;
  postCall(queue, [] { throw std::runtime_error("pencil broke"); });
  postCall(queue, [] { throw 5; });
  postCall(queue, [&] { next = true; });
  queue.finish();
  EXPECT_TRUE(next);
  const auto lines = capture->take();
  ASSERT_EQ(lines.size(), 2u);
  EXPECT_EQ(lines[0].priority, 6);
  EXPECT_EQ(lines[0].tag, "qel_log");
  EXPECT_THAT(lines[0].text, testing::HasSubstr("pencil broke"));
  EXPECT_EQ(lines[1].priority, 6);
  EXPECT_THROW(queue.run([] { throw std::logic_error("no"); }), std::logic_error);
}

// Of a suite so named googletest runs the cases first. A child that dies is a fork of the test, which has no
// other thread yet that the child would miss; nor is the test's program started again, which an emulator
// could not do.
using QueueDeathTest = Queue;
INSTANTIATE_TEST_SUITE_P(Modes, QueueDeathTest,
                         testing::Values(RenderQueue::Mode::Thread, RenderQueue::Mode::Caller));

TEST_P(QueueDeathTest, DiesWithOneClearLineWhenItsOwnTaskDestroysIt) {
  EXPECT_DEATH(
      {
        auto* const queue = new RenderQueue(GetParam(), RenderQueue::GL::None);
        queue->run([&] { delete queue; });
      },
      "destroyed by one of its own tasks");
}

TEST(QueueThreads, NoOtherThreadIsTakenForTheOneThatHasEnded) {
  RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::None);
  std::thread::id ended;
  queue.run([&] { ended = std::this_thread::get_id(); });
  queue.shutDown();
  // The system hands out the numbers of ended threads again, mostly at once.
  bool met = false;
  for (int i = 0; i < 100 && !met; ++i) {
    std::thread([&] {
      met = std::this_thread::get_id() == ended;
      EXPECT_FALSE(met && queue.run([] { FAIL(); }));
    }).join();
  }
  if (!met) GTEST_SKIP() << "no thread got the number";
}

// A task posted while somebody waits may itself wait for that somebody.
TEST(QueueThreads, NobodyWaitsForWhatIsPostedLater) {
  RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::None);
  bool came = false;
  for (int i = 0; i < 1000 && !came; ++i) {
    std::promise<void> bothPosted, calling, returned;
    bool called = false;
    // What is posted meanwhile is taken from the queue together.
    postCall(queue, [&] { bothPosted.get_future().wait(); });
    std::thread waits([&] {
      calling.set_value();
      queue.run([&] { called = true; });
      returned.set_value();
    });
    calling.get_future().wait();
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
    postCall(queue, [&] {
      if (!called) return;  // this one came first: once more
      came = true;
      EXPECT_EQ(returned.get_future().wait_for(std::chrono::seconds(10)), std::future_status::ready);
    });
    bothPosted.set_value();
    waits.join();
    queue.finish();
  }
  EXPECT_TRUE(came);
}

TEST(QueueThreads, MayGoAsSoonAsTheLastTaskHasRun) {
  for (int i = 0; i < 200; ++i) {
    std::promise<void> ran;
    auto queue = std::make_unique<RenderQueue>(RenderQueue::Mode::Thread, RenderQueue::GL::None);
    std::thread poster([&queue = *queue, &ran] { postCall(queue, [&ran] { ran.set_value(); }); });
    ran.get_future().wait();
    queue.reset();  // the poster may still be on its way out of `Post`
    poster.join();
  }
}

TEST(QueueThreads, ManyPostersKeepTheirOwnOrderOnOneThreadThatIsNoneOfThem) {
  constexpr int kThreads = 4, kTasks = 2000;
  RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::None);
  int next[kThreads] = {};
  std::set<std::thread::id> ranOn;
  std::atomic<int> accepted{0}, unordered{0};
  queue.onAccepted = [&](const Qelt::ITask&) { ++accepted; };
  std::vector<std::thread> posters;
  for (int& mine : next) {
    posters.emplace_back([&] {
      for (int i = 0; i < kTasks; ++i) {
        postCall(queue, [&, i] {
          if (mine++ != i) ++unordered;
          ranOn.insert(std::this_thread::get_id());
        });
      }
    });
  }
  for (std::thread& poster : posters) poster.join();
  queue.finish();
  EXPECT_EQ(accepted, kThreads * kTasks);
  EXPECT_THAT(next, testing::Each(kTasks));
  EXPECT_EQ(unordered, 0);
  EXPECT_EQ(ranOn.size(), 1u);
  EXPECT_FALSE(ranOn.contains(std::this_thread::get_id()));
}

}  // namespace
