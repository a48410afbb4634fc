// Pens on their hosts' threads beside render threads that keep up and that fall behind: for ThreadSanitizer
// above all. QELT_SOAK_SECONDS sets how long each case runs.

#include <gtest/gtest.h>

#include <chrono>
#include <cstdlib>
#include <functional>
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

using QeltDesktop::RenderQueue;

struct Surroundings {
  const char* name;
  RenderQueue::GL gl;
  int mostSleep;  // of the render thread after each action, microseconds
  int mostAhead;  // actions the main thread is ahead, at the most
  int hosts = 1;
  bool oneQueue = false;  // of all hosts, as of a page and a settings dialog with a pen each
};

class Soak : public testing::TestWithParam<Surroundings> {};
INSTANTIATE_TEST_SUITE_P(
    Hosts, Soak,
    testing::Values(Surroundings{"ARenderThreadThatKeepsUp", RenderQueue::GL::None, 0, 4},
                    Surroundings{"ARenderThreadThatFallsBehind", RenderQueue::GL::None, 2000, 60},
                    Surroundings{"TwoHostsInOneProcess", RenderQueue::GL::None, 300, 20, 2},
                    Surroundings{"TwoPensThroughOneQueue", RenderQueue::GL::None, 300, 20, 2, true},
                    Surroundings{"APictureAndALostContext", RenderQueue::GL::Context, 200, 12}),
    [](const auto& test) { return std::string(test.param.name); });

// Draws, redraws, predicts, and takes pens away with their work queued, without a pattern.
void act(PenBoard& board, const std::function<int(int)>& below) {
  switch (const int action = below(12)) {
    case 5:
      return board.deletePen();
    case 6:
      return board.zoom(1.0f + 0.5f * static_cast<float>(below(4)));
    case 7:
      if (board.pen != nullptr) board.pen->setVersion(1 + below(newestVersion()));
      return;
    case 8:
      board.turnPage();
      if (board.layer != nullptr && below(4) == 0) board.loseAndRestoreContext();
      return;
    default:
      return board.draw(kAllKinds[static_cast<std::size_t>(action % 5)]);
  }
}

TEST_P(Soak, LetsNothingOut) {
  const char* const asked = std::getenv("QELT_SOAK_SECONDS");
  const std::chrono::duration<double> time(asked != nullptr ? std::strtod(asked, nullptr) : 1.5);
  const auto soak = [time](const Surroundings& around, PenBoard& board, unsigned seed) {
    std::mt19937 random(seed);
    const auto below = [&random](int bound) {
      return static_cast<int>(random() % static_cast<unsigned>(bound));
    };
    int ahead = 0;
    for (const auto start = std::chrono::steady_clock::now();
         std::chrono::steady_clock::now() - start < time;) {
      act(board, below);
      if (around.mostSleep > 0) {
        const std::chrono::microseconds sleep(below(around.mostSleep));
        QeltDesktop::postCall(board.queue, [sleep] { std::this_thread::sleep_for(sleep); });
      }
      if (++ahead > below(around.mostAhead)) {
        board.finish();
        ahead = 0;
      }
    }
  };
  LogCapture log;
  std::vector<std::unique_ptr<RenderQueue>> queues;
  std::unique_ptr<QeltDesktop::CanvasLayer> layer;
  std::vector<std::unique_ptr<PenBoard>> boards;
  std::vector<std::thread> hosts;
  for (int host = 0; host < GetParam().hosts; ++host) {
    if (queues.empty() || !GetParam().oneQueue)
      queues.push_back(std::make_unique<RenderQueue>(RenderQueue::Mode::Thread, GetParam().gl));
    RenderQueue& queue = *queues.back();
    if (GetParam().gl == RenderQueue::GL::Context)
      layer = std::make_unique<QeltDesktop::CanvasLayer>(queue, 96, 64, 64);
    boards.push_back(std::make_unique<PenBoard>(BoardOptions{.size = 4.0f}, queue, layer.get()));
    hosts.emplace_back(soak, GetParam(), std::ref(*boards.back()), 7u + static_cast<unsigned>(host));
  }
  for (std::thread& host : hosts) host.join();
  for (const LogLine& line : log.take()) EXPECT_EQ(line.text.find("threw"), std::string::npos) << line.text;
}

}  // namespace
}  // namespace QeltTests
