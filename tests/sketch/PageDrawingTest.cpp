#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <functional>
#include <new>
#include <stdexcept>
#include <vector>

#include "CallRecorder.h"
#include "Ink.h"
#include "Options.h"
#include "OutputFile.h"
#include "PageDrawing.h"
#include "PageLayout.h"
#include "Progress.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/CallTask.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/pencommon/BatchObserver.h"
#include "support/LogCapture.h"

namespace {

using QeltDesktop::Batch;
using QeltDesktop::RenderQueue;

// Draws a zigzag of far points, 200 of which make 40 MB of vertices, in a queue that runs nothing by itself.
std::vector<std::uint8_t> drawZigzag(int points = 200,
                                     const std::function<void(RenderQueue&)>& prepare = {}) {
  QeltDesktop::Page page;
  for (int i = 0; i < points; ++i) {
    page.traces.addSample({.x = i % 2 == 0 ? 0.0f : 600.0f, .y = static_cast<float>(i), .time = 4.0 * i});
  }
  page.traces.finishTrace(QeltDesktop::kNoNumber, {});
  const QeltDesktop::PluginLibrary plugin(QELT_PLUGIN_PATH);
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  QeltDesktop::Progress progress("drawing stroke", 1);
  QeltDesktop::Options options;
  if (prepare) {
    options.outline = {2.0f, 0xFF0000FFu};
    prepare(queue);
  }
  return QeltDesktop::drawPage(plugin, queue, page, options, QeltDesktop::layOut({0, 0, 32, 32}, 1, 0),
                               drawablesFor(options), progress)
      .rgba;
}

TEST(PageDrawing, IsOnlySoFarAheadOfTheRenderThread) {
  const std::uint64_t before = QeltDesktop::writtenBytes();
  std::uint64_t drawn = 0, mostWaiting = 0;
  QeltDesktop::setBatchObserver([&](const Batch& batch) {
    mostWaiting = std::max(mostWaiting, QeltDesktop::writtenBytes() - before - drawn);
    drawn += batch.buffers[0].size() * sizeof(float);
  });
  drawZigzag();
  QeltDesktop::setBatchObserver({});
  EXPECT_EQ(QeltDesktop::writtenBytes() - before, drawn);
  EXPECT_GT(drawn, 32'000'000u);
  EXPECT_LT(mostWaiting, 20'000'000u);
}

TEST(PageDrawing, OfWhichSomethingWasLostIsNoPicture) {
  const QeltTests::LogCapture log;
  QeltDesktop::setBatchObserver([](const Batch&) { throw std::runtime_error("lost"); });
  EXPECT_THROW(drawZigzag(), std::runtime_error);
  QeltDesktop::setBatchObserver({});
}

TEST(PageDrawing, StartsAgainWhereTheContextIsLost) {
  int posts = 0;
  const auto lostAhead = [&posts](int number) {
    return [&posts, number](RenderQueue& queue) {
      posts = 0;
      queue.accept = [&](const Qelt::ITask&) {
        if (++posts == number) {
          queue.loseContext();
          queue.restoreContext();
        }
        return true;
      };
    };
  };
  const std::vector<std::uint8_t> whole = drawZigzag(12, lostAhead(0));
  const int all = posts;
  for (const int number : {1, all / 2, all})
    EXPECT_TRUE(drawZigzag(12, lostAhead(number)) == whole) << number;
  EXPECT_NE(whole, std::vector<std::uint8_t>(whole.size(), 255));
}

TEST(CallRecorder, LeavesNoCallWithoutItsBatches) {
  const QeltTests::LogCapture log;
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::None);
  QeltDesktop::OutputFile file("/dev/null");
  QeltDesktop::CallRecorder recorder(queue, file, QeltDesktop::DrawableKind::Stroke, 8);
  const auto call = [&](const std::function<void()>& task) {
    recorder.call({QeltDesktop::DrawableKind::Stroke, 0, "Draw", {}},
                  [&](Qelt::RectF*) { return QeltDesktop::postCall(queue, task); });
  };
  EXPECT_NO_THROW(call([] {}));
  EXPECT_THROW(call([] { throw std::bad_alloc(); }), std::runtime_error);
}

}  // namespace
