// Pens on their hosts' threads beside render threads that keep up and that fall behind: for ThreadSanitizer
// above all. QELT_SOAK_SECONDS sets how long each case runs.

#include <gtest/gtest.h>

#include <chrono>
#include <cstdint>
#include <cstdlib>
#include <memory>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include "desktop/gl/CallTask.h"
#include "support/LogCapture.h"
#include "support/PenBoard.h"

namespace QeltTests {
namespace {

using Clock = std::chrono::steady_clock;
using QeltDesktop::RenderQueue;

double seconds() {
  const char* const asked = std::getenv("QELT_SOAK_SECONDS");
  return asked != nullptr ? std::strtod(asked, nullptr) : 1.5;
}

struct Pace {
  int mostSleep;  // of the render thread after each action, microseconds
  int mostAhead;  // actions the main thread is ahead, at the most
};

// Draws, redraws, predicts, and takes pens away with their work queued, without a pattern.
void drawFor(double time, PenBoard& board, Pace pace, std::uint32_t seed) {
  std::mt19937 random(seed);
  const auto below = [&random](int bound) {
    return static_cast<int>(random() % static_cast<unsigned>(bound));
  };
  const Clock::time_point end =
      Clock::now() + std::chrono::duration_cast<Clock::duration>(std::chrono::duration<double>(time));
  for (int ahead = 0; Clock::now() < end;) {
    switch (const int action = below(12)) {
      case 5:
        board.deletePen();
        break;
      case 6:
        board.zoom(1.0f + 0.5f * static_cast<float>(below(4)));
        break;
      case 7:
        if (board.pen != nullptr) board.pen->setVersion(1 + below(newestVersion()));
        break;
      case 8:
        board.turnPage();
        if (board.layer != nullptr && below(4) == 0) board.loseAndRestoreContext();
        break;
      default:
        board.draw(kAllKinds[static_cast<std::size_t>(action % 5)]);
        break;
    }
    if (pace.mostSleep > 0) {
      const std::chrono::microseconds sleep(below(pace.mostSleep));
      QeltDesktop::postCall(board.queue, [sleep] { std::this_thread::sleep_for(sleep); });
    }
    if (++ahead >= 1 + below(pace.mostAhead)) {
      board.finish();
      ahead = 0;
    }
  }
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
      PenBoard board({.size = 4.0f}, queue, layer.get());
      drawFor(time, board, pace, 7u + static_cast<std::uint32_t>(host));
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
