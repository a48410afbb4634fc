// Pens on their hosts' threads beside render threads that keep up and that fall behind: for ThreadSanitizer
// above all. QELT_SOAK_SECONDS sets how long each case runs.

#include <gtest/gtest.h>

#include <chrono>
#include <cstdint>
#include <cstdlib>
#include <functional>
#include <iterator>
#include <memory>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include "Stage.h"
#include "gl/ITask.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using Clock = std::chrono::steady_clock;
using QeltDesktop::RenderQueue;

double seconds() {
  const char* const asked = std::getenv("QELT_SOAK_SECONDS");
  return asked != nullptr ? std::strtod(asked, nullptr) : 1.5;
}

class SleepTask final : public Qelt::ITask {
 public:
  explicit SleepTask(std::chrono::microseconds time) : mTime(time) {}
  void run() override { std::this_thread::sleep_for(mTime); }

 private:
  std::chrono::microseconds mTime;
};

struct Pace {
  int mostSleep;  // of the render thread after each action, microseconds
  int mostAhead;  // actions the main thread is ahead, at the most
};

// Draws, redraws, predicts, and takes pens away with their work queued, without a pattern. Answers the number
// of actions.
long drawFor(double time, Stage& stage, RenderQueue& queue, Pace pace, bool losesContext,
             std::uint32_t seed) {
  std::mt19937 random(seed);
  const auto below = [&random](int bound) {
    return static_cast<int>(random() % static_cast<unsigned>(bound));
  };
  const auto live = [&] { stage.live(false); };
  const auto redraw = [&] { stage.redraw(false); };
  const std::function<void()> all[] = {
      live,
      live,
      redraw,
      redraw,
      [&] { stage.beginLive(); },
      [&] { stage.outline(false); },
      [&] { stage.preview(false); },
      [&] { stage.predict(false); },
      [&] { stage.deletePen(); },
      [&] { stage.zoom(1.0f + 0.5f * static_cast<float>(below(4))); },
      [&] {
        if (stage.pen() != nullptr) stage.pen()->setVersion(1 + below(8));
      },
      [&] {
        stage.turnPage();
        if (losesContext && below(4) == 0) stage.loseAndRestoreContext();
      },
  };
  const Clock::time_point end =
      Clock::now() + std::chrono::duration_cast<Clock::duration>(std::chrono::duration<double>(time));
  long actions = 0;
  for (int ahead = 0; Clock::now() < end; ++actions) {
    all[below(static_cast<int>(std::size(all)))]();
    if (pace.mostSleep > 0) {
      auto* const sleep = new SleepTask(std::chrono::microseconds(below(pace.mostSleep)));
      if (!queue.Post(sleep)) delete sleep;
    }
    if (++ahead >= 1 + below(pace.mostAhead)) {
      queue.finish();
      ahead = 0;
    }
  }
  return actions;
}

void soak(RenderQueue::GL gl, Pace pace, int hosts, double time) {
  LogCapture log;
  std::vector<std::thread> threads;
  for (int host = 0; host < hosts; ++host) {
    threads.emplace_back([=] {
      RenderQueue queue(RenderQueue::Mode::Thread, gl);
      std::unique_ptr<QeltDesktop::CanvasLayer> layer;
      const bool draws = gl == RenderQueue::GL::Context;
      if (draws) layer = std::make_unique<QeltDesktop::CanvasLayer>(queue, 96, 64, 64);
      Stage stage(queue, layer.get(), 8);
      const long actions = drawFor(time, stage, queue, pace, draws, 7u + static_cast<std::uint32_t>(host));
      EXPECT_GT(actions, 0);
      std::printf("host %d: %ld actions\n", host, actions);
    });
  }
  for (std::thread& thread : threads) thread.join();
  for (const LogLine& line : log.take()) EXPECT_EQ(line.text.find("threw"), std::string::npos) << line.text;
}

TEST(Soak, ARenderThreadThatKeepsUp) {
  soak(RenderQueue::GL::None, {0, 4}, 1, seconds());
}

TEST(Soak, ARenderThreadThatFallsBehind) {
  soak(RenderQueue::GL::None, {2000, 60}, 1, seconds());
}

TEST(Soak, TwoHostsInOneProcess) {
  soak(RenderQueue::GL::None, {300, 20}, 2, seconds());
}

TEST(Soak, APictureAndALostContext) {
  soak(RenderQueue::GL::Context, {200, 12}, 1, seconds());
}

}  // namespace
}  // namespace QeltTests
