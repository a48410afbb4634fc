#include "core/InkPage.h"

#include <GLES3/gl3.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <functional>
#include <limits>
#include <random>
#include <string>
#include <vector>

#include "desktop/graphics/CanvasLayer.h"
#include "output/Terminal.h"
#include "page/PageBoard.h"
#include "pencommon/PenStrokeDataManager.h"
#include "play/Options.h"
#include "play/PageDrawing.h"
#include "play/PageLayout.h"
#include "play/SamplePanel.h"
#include "support/AllocationGate.h"

namespace QeltTests {
namespace {

using QeltDesktop::PageView;
using QeltDesktop::Refusal;

class PageOf : public testing::Test {
 protected:
  // Two tiles wide and high, the second ones narrow.
  static constexpr int kWidth = 560, kHeight = 530;

  void expectAsDrawnAfresh(InkPage& page, const std::string& after) {
    settle(page);
    const PagePicture fresh = drawnAfresh(page, mQueue);
    EXPECT_EQ(differing(page.windowPicture(), fresh), 0u) << after;
  }

  RenderQueue mQueue{RenderQueue::Mode::Caller, RenderQueue::GL::Context};
};

// --- Equality with the program ---

std::vector<std::vector<Sample>> severalLines() {
  std::vector<std::vector<Sample>> lines;
  lines.push_back(line(20, 30, 500, 80, 40));
  lines.push_back(line(540, 20, 505, 500, 25));  // across the border of the tiles
  lines.push_back(line(60, 60, 60, 60, 1));      // a tap
  for (int i = 0; i < 4; ++i) {
    std::vector<Sample> loop;
    for (int k = 0; k < 60; ++k) {
      const float turn = 0.15f * static_cast<float>(k + i);
      loop.push_back({.x = 100.0f + 90.0f * static_cast<float>(i) + 40.0f * std::cos(turn),
                      .y = 300.0f + 60.0f * std::sin(1.3f * turn),
                      .pressure = 0.5f + 0.4f * std::sin(turn),
                      .tilt = 0.4f + 0.4f * std::cos(0.2f * turn),
                      .orientation = turn - 3.0f,
                      .time = 5.0 * k});
    }
    lines.push_back(loop);
  }
  return lines;
}

struct Look {
  int number;
  bool smooth;
  bool hasOutline;
};

class PageOfLook : public PageOf, public testing::WithParamInterface<Look> {};

// On paper and bare, drawn by hand, and redrawn.
TEST_P(PageOfLook, LooksAsTheProgramDrawsItsInk) {
  const Look look = GetParam();
  PageStyle style;
  style.look = look.number;
  style.smooth = look.smooth;
  style.size = 3.0f;
  style.argb = 0xC0204060u;
  if (look.hasOutline) style.outline = {2.0f, 0xFF00A0FFu};
  QeltDesktop::Options options;
  options.mode = QeltDesktop::Mode::Stroke;
  options.renderingVersion = look.number;
  options.curve = look.smooth;
  options.size = style.size;
  options.argb = style.argb;
  if (look.hasOutline) options.outline = {style.outline->size, style.outline->argb};
  options.background.transparent = true;

  InkPage page(plugin(), mQueue, kWidth, kHeight);
  QeltDesktop::Page ink;
  for (const std::vector<Sample>& samples : severalLines()) {
    drawWhole(page, style, samples);
    ink.strokes.add(samples);
  }
  EXPECT_FALSE(page.isBusy()) << "a stroke is on the page when it ends";
  QeltDesktop::Progress progress("drawing stroke", 1);
  const auto expected = QeltDesktop::drawPage(plugin(), mQueue, ink, options,
                                              QeltDesktop::layOut({0, 0, kWidth, kHeight}, 1.0f, 0.0f),
                                              drawablesFor(ink, options), progress);
  const PagePicture program{expected.width, expected.height, expected.rgba};
  EXPECT_GT(inked(program), 1000u);
  EXPECT_EQ(differing(page.windowPicture(), program), 0u) << "drawn by hand";
  EXPECT_EQ(differing(drawnAfresh(page, mQueue), program), 0u) << "redrawn";

  const QeltDesktop::PageArea area =
      pageArea(ink, {}, QeltDesktop::pageMargin(style.size, style.outline ? style.outline->size : 0.0f));
  options.background.transparent = false;
  const auto whole = QeltDesktop::drawPage(plugin(), mQueue, ink, options, layOut(area, 1.7f, 0.0f),
                                           drawablesFor(ink, options), progress);
  EXPECT_EQ(differing(page.picture(1.7f, {{255, 255, 255}}), {whole.width, whole.height, whole.rgba}), 0u);
  expectAsDrawnAfresh(page, "the picture took the cache for another zoom");
}

INSTANTIATE_TEST_SUITE_P(Looks, PageOfLook,
                         testing::Values(Look{1, true, true}, Look{2, true, false}, Look{3, true, true},
                                         Look{4, false, true}, Look{5, true, true}, Look{6, true, false},
                                         Look{7, false, false}, Look{8, true, true}, Look{8, false, true}),
                         [](const auto& one) {
                           return "Look" + std::to_string(one.param.number) +
                                  (one.param.smooth ? "" : "Straight") +
                                  (one.param.hasOutline ? "Outlined" : "");
                         });

// What a pen remembers of a stroke must not reach into one of another look, on the page or in the program.
TEST_F(PageOf, MixedLooksAreAsTheProgramDrawsThem) {
  InkPage page(plugin(), mQueue, kWidth, kHeight);
  QeltDesktop::Page ink;
  int number = 0;
  for (const std::vector<Sample>& samples : severalLines()) {
    PageStyle style;
    style.look = number % 3 == 0 ? 4 : 8;
    style.smooth = number++ % 2 == 0;
    style.size = 3.0f;
    style.outline = {2.0f, 0xFF00A0FFu};
    drawWhole(page, style, samples);
    ink.strokes.add(samples, {.width = style.size,
                              .rgb = 0u,
                              .transparency = std::uint8_t{0},
                              .renderingVersion = style.look,
                              .curve = style.smooth,
                              .outlineSize = style.outline->size,
                              .outlineArgb = style.outline->argb});
  }
  QeltDesktop::Options options;
  options.mode = QeltDesktop::Mode::Stroke;
  options.background.transparent = true;
  QeltDesktop::Progress progress("drawing stroke", 1);
  const auto expected = QeltDesktop::drawPage(plugin(), mQueue, ink, options,
                                              QeltDesktop::layOut({0, 0, kWidth, kHeight}, 1.0f, 0.0f),
                                              drawablesFor(ink, options), progress);
  EXPECT_EQ(differing(page.windowPicture(), {expected.width, expected.height, expected.rgba}), 0u);
}

TEST_F(PageOf, PreviewIsTheProgramsSampleStroke) {
  InkPage page(plugin(), mQueue, 64, 64);
  PageStyle style;
  style.size = 2.5f;
  style.look = 4;
  QeltDesktop::Options options;
  options.mode = QeltDesktop::Mode::Event;
  options.renderingVersion = style.look;
  options.size = style.size;
  options.background.transparent = true;
  QeltDesktop::Progress progress("drawing stroke", 1);
  const auto expected =
      QeltDesktop::drawPage(plugin(), mQueue, QeltDesktop::samplePanel(), options,
                            QeltDesktop::layOut({0, 0, 480, 160}, 1.0f, 0.0f), {.preview = true}, progress);
  const PagePicture preview = page.preview(480, 160, style);
  EXPECT_EQ(differing(preview, {expected.width, expected.height, expected.rgba}), 0u);
  EXPECT_GT(inked(preview), 500u);
  EXPECT_GT(inked(page.preview(960, 320, style)), 3 * inked(preview)) << "fitted";
  EXPECT_THROW(page.preview(0, 10, style), Refusal);
  EXPECT_THROW(page.preview(10, 5000, style), Refusal);
}

// --- Whatever happens ---

struct Walk {
  unsigned seed;
  PageMemory memory;
};

class PageOnAnyWalk : public PageOf, public testing::WithParamInterface<Walk> {
 protected:
  int upTo(int most) { return std::uniform_int_distribution<int>(0, most)(mRandom); }
  float between(float least, float most) {
    return std::uniform_real_distribution<float>(least, most)(mRandom);
  }

  PageStyle anyStyle() {
    PageStyle style;
    style.look = upTo(2) == 0 ? 8 : 1 + upTo(7);
    style.size = between(0.5f, 6.0f);
    style.argb = 0xFF000000u | static_cast<std::uint32_t>(upTo(0xFFFFFF));
    style.smooth = upTo(3) != 0;
    if (upTo(2) == 0) style.outline = {between(0.0f, 4.0f), 0xFF2040C0u};
    style.tool = 1 + upTo(2);
    return style;
  }

  std::vector<Sample> anyLine() {
    const float x = between(-50, 600), y = between(-50, 560);
    const int count = upTo(5) == 0 ? 1 : 2 + upTo(30);
    const float far = upTo(4) == 0 ? 3.0f : 180.0f;  // some are hardly longer than a tap
    return line(x, y, x + between(-far, far), y + between(-far, far), count);
  }

  // One step of a person's, or of the system's. Its name, for people.
  std::string anyStep(InkPage& page) {
    switch (upTo(15)) {
      case 0:
        return page.undo() ? "undo" : "no undo";
      case 1:
        return page.redo() ? "redo" : "no redo";
      case 2:
        for (int i = upTo(2); i >= 0; --i) {
          const float x = between(0, 560), y = between(0, 530);
          page.erase(x, y, x + between(-80, 80), y + between(-80, 80), between(0, 20));
          if (upTo(2) == 0) page.work(0.0);
        }
        return page.eraseEnd() ? "erase" : "erase nothing";
      case 3:
        return upTo(4) == 0 && page.clear() ? "clear" : "no clear";
      case 4:
      case 5:
        page.setView({.zoom = std::exp2(between(-1.0f, 1.0f)), .x = between(-90, 90), .y = between(-90, 90)});
        return "view";
      case 6:
        if (upTo(1) == 0) page.setView({.zoom = page.view().zoom, .x = page.view().x + 16});
        return "pan";
      case 7:
        page.resize(kWidth - 40 * upTo(3), kHeight - 30 * upTo(3));
        return "resize";
      case 8:
        page.contextLost();
        if (upTo(1) == 0) drawWhole(page, anyStyle(), anyLine());
        if (upTo(3) == 0) page.undo();
        page.contextRestored();
        return "loss";
      case 9:
        page.addRecord(writeRecord(anyStyle(), anyLine()));
        return "record";
      case 10:
        return midStroke(page);
      default:
        drawWhole(page, anyStyle(), anyLine());
        return "stroke";
    }
  }

  // A stroke that something comes between.
  std::string midStroke(InkPage& page) {
    const std::vector<Sample> samples = anyLine();
    draw(page, anyStyle(), samples, samples.size() / 2);
    switch (upTo(3)) {
      case 0:
        page.setView({.zoom = 1.25, .x = between(-60, 60), .y = 0});
        break;
      case 1:
        page.contextLost();
        page.contextRestored();
        break;
      case 2:
        settle(page);
        break;
      default:
        page.cancel();
        return "cancelled stroke";
    }
    page.end(samples.back());
    return "stroke with something in between";
  }

  std::mt19937 mRandom{GetParam().seed};
};

TEST_P(PageOnAnyWalk, IsAtRestWhatItsStrokesAndItsViewMakeIt) {
  InkPage page(plugin(), mQueue, kWidth, kHeight, GetParam().memory);
  std::string steps;
  for (int i = 0; i < 70 && !HasFailure(); ++i) {
    steps += anyStep(page) + ", ";
    // Most steps come while the page is still busy with those before.
    for (int slices = upTo(3); slices > 0; --slices) page.work(0.0);
    if (i % 7 == 6) expectAsDrawnAfresh(page, steps);
    EXPECT_LE(page.stats().cachedBytes, GetParam().memory.mostCachedBytes);
    EXPECT_LE(page.stats().backupBytes, GetParam().memory.mostBackupBytes);
  }
  // And all the way back, and forth.
  while (page.undo()) page.work(0.0);
  expectAsDrawnAfresh(page, steps + "all undone");
  for (int i = 0; page.redo(); ++i) {
    if (i % 5 == 0) settle(page);
  }
  expectAsDrawnAfresh(page, steps + "all done again");
}

constexpr PageMemory kPlenty{};
INSTANTIATE_TEST_SUITE_P(Seeds, PageOnAnyWalk,
                         testing::Values(Walk{1, kPlenty}, Walk{2, kPlenty}, Walk{3, kPlenty},
                                         Walk{4, {.mostCachedBytes = 300'000}},
                                         Walk{5, {.mostBackupBytes = 200'000}},
                                         Walk{6, {.mostCachedBytes = 0, .mostBackupBytes = 0}}),
                         [](const auto& one) { return "Seed" + std::to_string(one.param.seed); });

// --- What has to happen at once ---

TEST_F(PageOf, FirstInkComesWithTheFirstEventAndGoesWithACancel) {
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context, {"", 200, 150});
  InkPage page(plugin(), queue, 200, 150);
  const auto shown = [&] {
    page.present({255, 255, 255});
    std::vector<std::uint8_t> pixels(200 * 150 * 4);
    queue.run([&] {
      glBindFramebuffer(GL_FRAMEBUFFER, 0);
      glReadPixels(0, 0, 200, 150, GL_RGBA, GL_UNSIGNED_BYTE, pixels.data());
    });
    return pixels;
  };
  const auto blank = shown();
  for (const int look : {1, 8}) {
    PageStyle style;
    style.look = look;
    style.size = 4.0f;
    const auto samples = line(40, 40, 150, 100);
    page.begin(style, samples[0]);
    const auto dot = shown();
    EXPECT_NE(dot, blank) << look;
    page.move(std::span(samples).subspan(1, 6), std::span(samples).subspan(7, 1));
    const auto ahead = shown();
    page.move({}, {});
    EXPECT_EQ(shown() != ahead, look == 8) << "the predicted continuation of look " << look;
    page.cancel();
    EXPECT_EQ(shown(), blank) << look;
    EXPECT_FALSE(page.isBusy());
    EXPECT_FALSE(page.canUndo());
  }
  drawWhole(page, PageStyle{}, line(20, 20, 120, 90));
  const auto drawn = shown();
  page.setView({.zoom = 1.5, .x = 10, .y = 10});
  EXPECT_NE(shown(), drawn) << "moved before it is redrawn";
  EXPECT_TRUE(page.isBusy());
  drawWhole(page, PageStyle{}, line(20, 90, 120, 20));
  const auto before = shown();
  settle(page);
  EXPECT_NE(shown(), before);
}

// Undo and redo only exchange pixels, whatever the page holds; after a change of the view too.
TEST_F(PageOf, UndoAndRedoRedrawNothing) {
  InkPage page(plugin(), mQueue, kWidth, kHeight);
  PageStyle style;
  for (int i = 0; i < 12; ++i) {
    style.outline.reset();
    if (i % 3 == 0) style.outline = {1.0f, 0xFF00FF00u};
    drawWhole(page, style, line(20.0f + 30.0f * static_cast<float>(i), 40, 300, 300));
  }
  page.erase(20, 40, 60, 40, 5);
  page.eraseEnd();
  settle(page);
  const auto backAndForth = [&](int steps, const std::string& when) {
    std::vector<PagePicture> pictures{page.windowPicture()};
    const std::uint64_t stamps = page.stats().stamps, hits = page.stats().cacheHits;
    for (int i = 0; i < steps; ++i) {
      ASSERT_TRUE(page.undo());
      ASSERT_FALSE(page.isBusy()) << when << ": undo " << i;
      pictures.push_back(page.windowPicture());
    }
    for (int i = steps; i-- > 0;) {
      ASSERT_TRUE(page.redo());
      EXPECT_EQ(differing(page.windowPicture(), pictures[static_cast<std::size_t>(i)]), 0u)
          << when << ": redo " << i;
    }
    EXPECT_EQ(page.stats().stamps, stamps) << when;
    EXPECT_EQ(page.stats().cacheHits, hits) << when;
  };
  backAndForth(13, "at the first view");
  page.undo();
  page.setView({.zoom = 1.3, .x = -20, .y = 7});
  settle(page);
  backAndForth(12, "after a change of the view");
  page.clear();
  EXPECT_FALSE(page.isBusy());
  EXPECT_EQ(inked(page.windowPicture()), 0u);
  backAndForth(13, "after a clear");
}

// A slice does one stroke at least, and the page grows while a redraw is under way.
TEST_F(PageOf, DrawsOnWhileARedrawIsUnderWay) {
  InkPage page(plugin(), mQueue, kWidth, kHeight);
  for (int i = 0; i < 30; ++i)
    drawWhole(page, PageStyle{}, line(10, 17.0f * static_cast<float>(i), 500, 200));
  page.setView({.zoom = 0.8});
  int slices = 0;
  for (; page.work(0.0); ++slices) {
    if (slices % 4 == 1)
      drawWhole(page, PageStyle{}, line(300, 10.0f * static_cast<float>(slices), 400, 500));
    if (slices == 9) page.erase(10, 0, 10, 60, 4);
    ASSERT_LT(slices, 100'000);
  }
  EXPECT_GE(slices, 29);
  page.eraseEnd();
  expectAsDrawnAfresh(page, "drawn and erased meanwhile");
}

// --- Input that is none ---

TEST_F(PageOf, BadSamplesAreDroppedOrRefused) {
  constexpr float kNan = std::numeric_limits<float>::quiet_NaN();
  constexpr float kInfinite = std::numeric_limits<float>::infinity();
  InkPage page(plugin(), mQueue, 64, 64);
  const PageStyle style;
  for (const Sample& bad :
       {Sample{.x = kNan}, Sample{.y = -kInfinite}, Sample{.pressure = kNan}, Sample{.tilt = kInfinite},
        Sample{.orientation = kNan}, Sample{.time = std::numeric_limits<double>::quiet_NaN()},
        Sample{.x = 2e5f}, Sample{.y = -1e30f}, Sample{.time = 1e300}}) {
    EXPECT_THROW(page.begin(style, bad), Refusal);
    EXPECT_FALSE(page.isDrawing());
    page.begin(style, {.x = 5, .y = 5, .time = 10});
    EXPECT_THROW(page.begin(style, {.x = 6}), Refusal) << "a second pointer";
    page.move({{bad, {.x = 20, .y = 20, .pressure = 7, .tilt = -1, .time = 4}, bad}}, {{bad}});
    const StrokeId id = page.end(bad);
    const std::vector<Sample> kept = page.samples(id);
    ASSERT_EQ(kept.size(), 2u);
    EXPECT_EQ(kept[1].x, 20.0f);
    EXPECT_EQ(kept[1].pressure, 1.0f);
    EXPECT_EQ(kept[1].tilt, 0.0f);
    EXPECT_EQ(kept[1].time, 10.0) << "it does not run back";
  }
  PageStyle wrong;
  for (const auto& change : std::vector<std::function<void()>>{
           [&] { wrong.look = 0; }, [&] { wrong.look = 9; }, [&] { wrong.size = 0; },
           [&] { wrong.size = kNan; }, [&] { wrong.size = 1e9f; }, [&] { wrong.tool = 4; },
           [&] {
             wrong.outline = {-1.0f, 0};
           },
           [&] {
             wrong.outline = {kNan, 0};
           }}) {
    wrong = PageStyle{};
    change();
    EXPECT_THROW(page.begin(wrong, {}), Refusal);
  }
  EXPECT_THROW(page.limits(0), Refusal);
  const std::size_t before = page.strokes().size();
  page.move({{{.x = 1}}});
  EXPECT_EQ(page.end({}), 0u);
  page.cancel();
  for (const PageView& view : {PageView{.zoom = 0}, PageView{.zoom = kNan}, PageView{.x = kInfinite}})
    EXPECT_THROW(page.setView(view), Refusal);
  EXPECT_THROW(page.erase(kNan, 0, 0, 0, 1), Refusal);
  EXPECT_THROW(page.erase(0, 0, 0, 0, -1), Refusal);
  EXPECT_THROW(page.resize(0, 10), std::runtime_error);
  EXPECT_THROW(page.resize(1 << 20, 10), std::runtime_error);
  EXPECT_THROW(page.picture(1000.0, {}), Refusal);
  EXPECT_THROW(page.record(999), Refusal);
  EXPECT_EQ(page.strokes().size(), before);
  EXPECT_EQ(page.width(), 64);
  // An up elsewhere is the last sample; a browser's has no pressure.
  page.begin(style, {.x = 5, .pressure = 0.4f});
  EXPECT_EQ(page.samples(page.end({.x = 9, .pressure = 0.0f})).back().pressure, 0.4f);
  expectAsDrawnAfresh(page, "all that");
}

TEST_F(PageOf, RefusesWhatDoesNotGoTogether) {
  InkPage page(plugin(), mQueue, 64, 64);
  EXPECT_FALSE(page.undo() || page.redo() || page.clear() || page.eraseEnd());
  page.begin(PageStyle{}, {.x = 5, .y = 5});
  EXPECT_THROW(page.undo(), Refusal);
  EXPECT_THROW(page.redo(), Refusal);
  EXPECT_THROW(page.clear(), Refusal);
  EXPECT_THROW(page.erase(0, 0, 9, 9, 1), Refusal);
  EXPECT_THROW(page.replayBegin(), Refusal);
  EXPECT_THROW(page.openInkml({}, "a"), Refusal);
  page.end({.x = 5, .y = 5});
  EXPECT_EQ(page.strokes().size(), 1u) << "a tap";
  EXPECT_THROW(page.picture(0.0, {}), Refusal);
}

struct HitCase {
  float x0, y0, x1, y1, radius;
  bool hits;
};

// A pen 2 wide from (10, 10) to (50, 10), and then to (50, 50).
TEST_F(PageOf, TheEraserTakesWhatItTouches) {
  for (const HitCase& at : {HitCase{30, 10, 30, 10, 0, true}, HitCase{30, 0, 30, 20, 0, true},
                            HitCase{30, 12.5f, 30, 12.5f, 1, false}, HitCase{30, 11.9f, 30, 11.9f, 1, true},
                            HitCase{0, 30, 49.5f, 30, 0, true}, HitCase{0, 30, 48, 30, 0.9f, false},
                            HitCase{20, 20, 40, 40, 5, false}, HitCase{-1000, 10, 1000, 10, 0, true},
                            HitCase{53, 53, 53, 53, 3.3f, true}, HitCase{53, 53, 53, 53, 3.1f, false}}) {
    InkPage page(plugin(), mQueue, 64, 64);
    PageStyle style;
    style.size = 2.0f;
    drawWhole(page, style, {{.x = 10, .y = 10}, {.x = 50, .y = 10}, {.x = 50, .y = 50}});
    EXPECT_EQ(page.erase(at.x0, at.y0, at.x1, at.y1, at.radius), at.hits ? 1u : 0u) << at.x0 << " " << at.y0;
    EXPECT_EQ(page.eraseEnd().has_value(), at.hits);
  }
}

TEST_F(PageOf, StepsTellWhatTheyChanged) {
  InkPage page(plugin(), mQueue, 128, 128);
  const StrokeId a = drawWhole(page, PageStyle{}, line(10, 10, 100, 10));
  const StrokeId b = drawWhole(page, PageStyle{}, line(10, 60, 100, 60));
  EXPECT_LT(a, b);
  EXPECT_EQ(page.undo()->hidden, std::vector{b});
  EXPECT_EQ(page.redo()->shown, std::vector{b});
  page.erase(50, 0, 50, 30, 1);
  page.erase(50, 40, 50, 80, 1);
  EXPECT_EQ(page.eraseEnd()->hidden, (std::vector{a, b}));
  EXPECT_TRUE(page.strokes().empty());
  EXPECT_FALSE(page.bounds());
  EXPECT_EQ(page.undo()->shown, (std::vector{a, b}));
  EXPECT_EQ(page.bounds()->left, 9.5f);
  EXPECT_EQ(page.clear()->hidden, (std::vector{a, b}));
  page.undo();
  page.undo();
  EXPECT_FALSE(page.isShown(b));
  const StrokeId c = drawWhole(page, PageStyle{}, line(10, 90, 100, 90));
  EXPECT_FALSE(page.canRedo());
  EXPECT_THROW(page.record(b), Refusal) << "it cannot come back";
  EXPECT_EQ(page.strokes(), (std::vector{a, c}));
  expectAsDrawnAfresh(page, "all that");
}

TEST_F(PageOf, OpensInkmlAsOneStepOrNotAtAll) {
  InkPage page(plugin(), mQueue, 200, 200);
  drawWhole(page, PageStyle{}, line(10, 10, 100, 10));
  const auto open = [&](const std::string& text) {
    return page.openInkml({reinterpret_cast<const std::uint8_t*>(text.data()), text.size()}, "notes.inkml");
  };
  const std::string head = "<ink xmlns='http://www.w3.org/2003/InkML'>\n";
  EXPECT_EQ(
      open(head + "<trace>10 20, 100 120</trace><trace>30 90, 90 30, 100 40</trace></ink>").shown.size(), 2u);
  expectAsDrawnAfresh(page, "opened");
  EXPECT_EQ(page.strokes().size(), 3u);
  EXPECT_EQ(page.style(2).size, page.limits(8).size) << "the file leaves it open";
  for (const auto& [text, message] : std::vector<std::pair<std::string, std::string>>{
           {head + "<trace>10 x</trace></ink>", "notes.inkml:2: "},
           {head + "<trace>1 1</trace><trace>900000 1</trace></ink>",
            "notes.inkml:2: farther away than a page reaches: 900000"},
           {"", "notes.inkml"}}) {
    try {
      open(text);
      ADD_FAILURE() << text;
    } catch (const Refusal& reason) {
      EXPECT_EQ(std::string(reason.what()).rfind(message, 0), 0u) << reason.what();
    }
  }
  EXPECT_EQ(page.strokes().size(), 3u);
  EXPECT_EQ(page.undo()->hidden.size(), 2u);
  EXPECT_FALSE(page.isBusy()) << "undone by its backup";
  expectAsDrawnAfresh(page, "undone");
}

TEST_F(PageOf, AReplayLeavesEverythingAsItWas) {
  InkPage page(plugin(), mQueue, kWidth, kHeight);
  PageStyle style;
  style.outline = {1.0f, 0xFF00FF00u};
  for (int i = 0; i < 4; ++i) drawWhole(page, style, line(20, 20.0f * static_cast<float>(i), 400, 300));
  page.undo();
  const PagePicture before = page.windowPicture();
  const std::vector<StrokeId> strokes = page.strokes();
  const std::size_t cached = page.stats().cachedBytes;

  page.replayBegin();
  EXPECT_EQ(inked(page.windowPicture()), 0u);
  for (const StrokeId id : strokes) EXPECT_EQ(drawWhole(page, page.style(id), page.samples(id)), 0u);
  EXPECT_EQ(differing(page.windowPicture(), before), 0u) << "replayed";
  EXPECT_THROW(page.undo(), Refusal);
  EXPECT_THROW(page.replayBegin(), Refusal);
  draw(page, style, line(5, 5, 90, 90));
  page.replayEnd();
  page.replayEnd();
  EXPECT_EQ(differing(page.windowPicture(), before), 0u);
  EXPECT_EQ(page.strokes(), strokes);
  EXPECT_EQ(page.stats().cachedBytes, cached);
  EXPECT_TRUE(page.redo());
  EXPECT_FALSE(page.isBusy());

  // The view, the size and the context may change in between.
  page.replayBegin();
  drawWhole(page, style, line(5, 5, 90, 90));
  page.setView({.zoom = 2.0});
  page.contextLost();
  page.contextRestored();
  drawWhole(page, style, line(5, 90, 90, 5));
  page.resize(300, 200);
  settle(page);
  EXPECT_GT(inked(page.windowPicture()), 0u);
  page.replayEnd();
  expectAsDrawnAfresh(page, "replayed");
}

// --- Bounds ---

TEST_F(PageOf, LosesNoMemoryToStrokesThatAreGone) {
  InkPage page(plugin(), mQueue, 128, 128, {.mostCachedBytes = 1 << 20, .mostBackupBytes = 1 << 20});
  for (int i = 0; i < 300; ++i) {
    drawWhole(page, PageStyle{}, line(10, 10, 100, static_cast<float>(i % 128)));
    if (i % 3 == 2) page.undo();
  }
  EXPECT_LE(page.stats().cachedBytes, std::size_t{1} << 20);
  EXPECT_GT(page.stats().cachedBytes, std::size_t{1} << 18);
  EXPECT_LE(page.stats().backupBytes, std::size_t{1} << 20);
  EXPECT_GT(page.stats().backupBytes, std::size_t{1} << 18);
  EXPECT_EQ(page.stats().strokes, 200u);
  expectAsDrawnAfresh(page, "many strokes");
}

// Whichever allocation fails, a stroke is stored or is none, and the page shows what it holds.
TEST_F(PageOf, SurvivesAnyFailedAllocation) {
  InkPage page(plugin(), mQueue, 96, 96);
  PageStyle style;
  style.outline = {1.0f, 0xFF00FF00u};
  drawWhole(page, style, line(10, 10, 80, 70, 6));
  const auto samples = line(10, 80, 90, 20, 6);
  const auto steps = std::vector<std::function<void()>>{
      [&] { page.begin(style, samples[0]); },
      [&] { page.move(std::span(samples).subspan(1)); },
      [&] { page.end(samples.back()); },
      [&] { page.undo(); },
      [&] { page.redo(); },
      [&] { page.erase(40, 0, 40, 96, 1); },
      [&] { page.eraseEnd(); },
      [&] { page.work(50.0); },
      [&] { page.undo(); },
      [&] { page.clear(); },
      [&] { page.undo(); },
  };
  AllocationGate::watch(plugin().path());
  int failures = 0;
  for (std::size_t at = 0; at < steps.size(); ++at) {
    for (long number = 1;; ++number) {
      bool hasFailed = false;
      {
        const PlugInCall call;
        AllocationGate::fail(number, false, AllocationGate::Whose::AndPrograms);
        try {
          steps[at]();
        } catch (const std::bad_alloc&) {
        }
        hasFailed = AllocationGate::open() >= number;
      }
      if (!hasFailed) break;
      ++failures;
      // Back to where the step begins.
      if (at < 2) {
        if (at == 0) page.cancel();
        continue;
      }
      if (page.isDrawing()) continue;
      page.eraseEnd();
      settle(page);
      if (number % 20 == 0) {
        // A pen may leave out what it has no memory for without a word, until the next redraw.
        page.contextLost();
        page.contextRestored();
        expectAsDrawnAfresh(page, "step " + std::to_string(at) + " " + std::to_string(number));
      }
      if (at == 2) draw(page, style, samples);
      ASSERT_LT(number, 5000);
    }
  }
  page.contextLost();
  page.contextRestored();
  EXPECT_GT(failures, 100);
  expectAsDrawnAfresh(page, "failed allocations");
}

}  // namespace
}  // namespace QeltTests
