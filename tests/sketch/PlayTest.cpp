#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <functional>
#include <new>
#include <optional>
#include <stdexcept>

#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/CallTask.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/pencommon/BatchObserver.h"
#include "ink/Ink.h"
#include "output/OutputFile.h"
#include "output/Terminal.h"
#include "play/CallRecorder.h"
#include "play/Options.h"
#include "play/PageDrawing.h"
#include "play/PageLayout.h"
#include "play/StrokeFeeder.h"
#include "support/LogCapture.h"

namespace {

using QeltDesktop::Batch;
using QeltDesktop::RenderQueue;

// Draws a zigzag of 200 far points, 40 MB of vertices in all, in a queue that runs nothing by itself.
void drawZigzag() {
  QeltDesktop::Page page;
  for (int i = 0; i < 200; ++i) {
    page.strokes.addSample({.x = i % 2 == 0 ? 0.0f : 600.0f, .y = static_cast<float>(i), .time = 4.0 * i});
  }
  page.strokes.finishStroke(QeltDesktop::kNoNumber, {});
  const QeltDesktop::PluginLibrary plugin(QELT_PLUGIN_PATH);
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  QeltDesktop::Progress progress("drawing stroke", 1);
  QeltDesktop::Options options;
  QeltDesktop::drawPage(plugin, queue, page, options, QeltDesktop::layOut({0, 0, 32, 32}, 1, 0),
                        drawablesFor(options), progress);
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

TEST(CallRecorder, LeavesNoCallWithoutItsBatches) {
  const QeltTests::LogCapture log;
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::None);
  QeltDesktop::OutputFile file("/dev/null");
  QeltDesktop::Progress progress("tracing stroke", 1);
  QeltDesktop::CallRecorder recorder(queue, file, progress, QeltDesktop::DrawableKind::Stroke, 8);
  const auto call = [&](const std::function<void()>& task) {
    recorder.call({QeltDesktop::DrawableKind::Stroke, 0, "Draw", {}},
                  [&](Qelt::RectF*) { return QeltDesktop::postCall(queue, task); });
  };
  EXPECT_NO_THROW(call([] {}));
  EXPECT_THROW(call([] { throw std::bad_alloc(); }), std::runtime_error);
}

// No stamp depends on these.
TEST(StrokeFeeder, NamesToolsSourcesAndTimes) {
  QeltDesktop::Page page;
  page.strokes.add({{.time = -1e300}, {.time = 4.6}, {.time = 1e300}}, {}, 1);
  const QeltDesktop::Stroke stroke = page.strokes[0];
  const auto expectPointer = [&](std::optional<int> tool, std::optional<int> source,
                                 const QeltDesktop::Pointer& wanted) {
    const QeltDesktop::Pointer pointer = QeltDesktop::pointerFor(stroke, tool, source);
    EXPECT_EQ(pointer.tool, wanted.tool);
    EXPECT_EQ(pointer.source, wanted.source);
  };
  expectPointer({}, {}, {1, 4098});
  expectPointer(2, {}, {2, 16386});
  expectPointer(3, {}, {3, 8194});
  expectPointer(2, 99, {2, 99});
  const Qelt::MotionEvent event = recordedEvent(stroke, {1, 77});
  EXPECT_EQ(event.GetToolType(0), 1);
  EXPECT_EQ(event.GetSource(), 77);
  // Times that no clock shows stay as far away as they can.
  EXPECT_LT(event.GetDownTime(), -1'000'000'000);
  EXPECT_EQ(storedStroke(stroke, {1, 77})->GetTimeStamp()[1], 5);
  EXPECT_GT(event.GetEventTime(), 1'000'000'000);
}

}  // namespace
