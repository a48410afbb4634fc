#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <functional>
#include <new>
#include <span>
#include <stdexcept>
#include <vector>

#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/CallTask.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/pencommon/BatchObserver.h"
#include "ink/Ink.h"
#include "output/OutputFile.h"
#include "output/PictureSink.h"
#include "output/StageTimes.h"
#include "output/Terminal.h"
#include "play/CallRecorder.h"
#include "play/Options.h"
#include "play/PageDrawing.h"
#include "play/PageLayout.h"
#include "play/StrokeFeeder.h"
#include "support/LogCapture.h"

namespace QeltDesktop {
namespace {

TEST(PageLayout, KeepsAMarginOfAnyPenWithinBounds) {
  EXPECT_EQ(pageMargin(6.0f, 2.0f), 30.0f);  // 16 + 2 * 6 + 2
  EXPECT_EQ(pageMargin(NAN, -1.0f), 16.0f);
  EXPECT_EQ(pageMargin(1e30f, 0.0f), 512.0f);
}

// Draws a zigzag of far points, 200 of which make 40 MB of vertices, in a queue that runs nothing by itself.
std::vector<std::uint8_t> drawZigzag(int points = 200,
                                     const std::function<void(RenderQueue&)>& prepare = {}) {
  Page page;
  for (int i = 0; i < points; ++i) {
    page.strokes.addSample({.x = i % 2 == 0 ? 0.0f : 600.0f, .y = static_cast<float>(i), .time = 4.0 * i});
  }
  page.strokes.finishStroke(kNoNumber, {});
  const PluginLibrary plugin(QELT_PLUGIN_PATH);
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  if (prepare) prepare(queue);
  Progress progress("drawing stroke", 1);
  Options options;
  options.outline = {2.0f, 0xFF0000FFu};
  return drawPage(plugin, queue, page, options, layOut({0, 0, 32, 32}, 1, 0),
                  {.stroke = true, .outline = points < 200}, progress)
      .rgba;
}

TEST(PageDrawing, IsOnlySoFarAheadOfTheRenderThread) {
  const std::uint64_t before = writtenBytes();
  std::uint64_t drawn = 0, mostWaiting = 0;
  setBatchObserver([&](const Batch& batch) {
    mostWaiting = std::max(mostWaiting, writtenBytes() - before - drawn);
    drawn += batch.buffers[0].size() * sizeof(float);
  });
  drawZigzag();
  setBatchObserver({});
  EXPECT_EQ(writtenBytes() - before, drawn);
  EXPECT_GT(drawn, 32'000'000u);
  EXPECT_LT(mostWaiting, 6'000'000u);
}

TEST(PageDrawing, OfWhichSomethingWasLostIsNoPicture) {
  const QeltTests::LogCapture log;
  setBatchObserver([](const Batch&) { throw std::runtime_error("lost"); });
  EXPECT_THROW(drawZigzag(), std::runtime_error);
  setBatchObserver({});
}

TEST(PageDrawing, StartsAgainWhereTheContextIsLost) {
  int posts = 0, lost = 0;  // how often; from that post on, each time
  const auto losing = [&](int number, int times) {
    return [&, number, times](RenderQueue& queue) {
      posts = lost = 0;
      queue.accept = [&, number, times](const Qelt::ITask&) {
        if (++posts % number == 0 && lost < times) {
          ++lost;
          queue.loseContext();
          queue.restoreContext();
        }
        return true;
      };
    };
  };
  const std::vector<std::uint8_t> whole = drawZigzag(12, losing(1, 0));
  const int all = posts;
  // With outlines two layers are drawn, each of which may be lost.
  for (const int number : {1, all / 4, all / 2, all / 2 + 1, 3 * all / 4, all})
    EXPECT_TRUE(drawZigzag(12, losing(number, 1)) == whole) << number;
  EXPECT_NE(whole, std::vector<std::uint8_t>(whole.size(), 255));
  EXPECT_THROW(drawZigzag(12, losing(all / 2, 1000)), std::runtime_error) << "no end";
}

// Takes a picture, and the context away after some of its rows.
class LosingSink : public PictureSink {
 public:
  LosingSink(RenderQueue& queue, int losses) : mQueue(queue), mLosses(losses) {}
  void begin(int, int) override {}
  void takeRows(std::span<const std::uint8_t> rows) override {
    pixels.insert(pixels.end(), rows.begin(), rows.end());
    if (mLosses-- <= 0) return;
    mQueue.loseContext();
    mQueue.restoreContext();
  }

  std::vector<std::uint8_t> pixels;

 private:
  RenderQueue& mQueue;
  int mLosses;
};

// The page is taller than what is read back at once, with a cross in each part. Outlines are white where
// their own stroke is, so they lie under another's ink only where strokes cross.
TEST(PageDrawing, LaysLayersOverEachOtherInEveryPart) {
  constexpr int kWidth = 128, kHeight = 9'000, kApart = 1'500;
  Page page;
  for (int y = 60; y < kHeight; y += kApart) {
    const float x = 40.0f + static_cast<float>(y) / 400.0f, middle = static_cast<float>(y);
    for (const float slope : {-1.0f, 1.0f}) {
      page.strokes.add({{.x = x - 20, .y = middle - 20 * slope},
                        {.x = x, .y = middle, .time = 8},
                        {.x = x + 20, .y = middle + 20 * slope, .time = 16}});
    }
  }
  const PluginLibrary plugin(QELT_PLUGIN_PATH);
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  StageTimes times;
  Options options;
  options.size = 6.0f;
  options.argb = 0xC0000000u;
  options.outline = {5.0f, 0xFF0000FFu};
  const auto draw = [&](const DrawableSet& drawables, int losses = 0) {
    Progress progress("drawing stroke", 1);
    LosingSink sink(queue, losses);
    PageDrawer(plugin, queue, times)
        .draw(page, options, layOut({0, 0, kWidth, kHeight}, 1, 0), drawables, progress, sink);
    return sink.pixels;
  };
  const auto both = draw({.stroke = true, .outline = true});
  EXPECT_TRUE(draw({.stroke = true, .outline = true}, 4) == both) << "drawn again";
  const std::vector<std::uint8_t> stroke = draw({.stroke = true});
  const std::vector<std::uint8_t> outline = draw({.outline = true});
  std::vector<int> shining(kHeight / kApart);  // pixels in which an outline is seen through ink
  for (std::size_t i = 0; i < both.size(); i += 4) {
    // Ink is grey, and blue below takes no blue from it.
    ASSERT_NEAR(both[i + 2], stroke[i + 2], 1) << i;
    ASSERT_NEAR(both[i], stroke[i] * outline[i] / 255, 1) << i;
    if (stroke[i] < 200 && both[i] + 30 < stroke[i]) ++shining[i / 4 / kWidth / kApart];
  }
  EXPECT_GT(*std::min_element(shining.begin(), shining.end()), 10);
}

TEST(CallRecorder, LeavesNoCallWithoutItsBatches) {
  const QeltTests::LogCapture log;
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::None);
  OutputFile file("/dev/null");
  Progress progress("tracing stroke", 1);
  CallRecorder recorder(queue, file, progress, DrawableKind::Stroke);
  const auto call = [&](const std::function<void()>& task) {
    recorder.call({DrawableKind::Stroke, 0, 8, "Draw", {}},
                  [&](Qelt::RectF*) { return postCall(queue, task); });
  };
  EXPECT_NO_THROW(call([] {}));
  EXPECT_THROW(call([] { throw std::bad_alloc(); }), std::runtime_error);
}

// No stamp depends on these.
TEST(StrokeFeeder, NamesToolsSourcesAndTimes) {
  Page page;
  page.strokes.add({{.time = -1e300}, {.time = 4.6}, {.time = 1e300}}, {}, 1);
  const Stroke stroke = page.strokes[0];
  EXPECT_EQ(pointerFor(stroke, {}, {}).tool, 1);
  EXPECT_EQ(pointerFor(stroke, {}, {}).source, 4098);
  EXPECT_EQ(pointerFor(stroke, 2, {}).source, 16386);
  EXPECT_EQ(pointerFor(stroke, 3, {}).source, 8194);
  EXPECT_EQ(pointerFor(stroke, 3, 99).source, 99);
  const Qelt::MotionEvent event = recordedEvent(stroke, {1, 77});
  // Times that no clock shows stay as far away as they can.
  EXPECT_LT(event.GetDownTime(), -1'000'000'000);
  EXPECT_EQ(storedStroke(stroke, {1, 77})->GetTimeStamp()[1], 5);
  EXPECT_GT(event.GetEventTime(), 1'000'000'000);
}

}  // namespace
}  // namespace QeltDesktop
