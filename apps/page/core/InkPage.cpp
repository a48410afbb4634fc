#include "core/InkPage.h"

#include <algorithm>
#include <cmath>
#include <exception>
#include <limits>
#include <utility>

#include "core/EraserHit.h"
#include "core/History.h"
#include "core/InkmlStrokes.h"
#include "core/PageLayers.h"
#include "core/PagePens.h"
#include "core/PageRecord.h"
#include "core/PageStroke.h"
#include "core/StrokeList.h"
#include "core/WetInk.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/Compose.h"
#include "desktop/graphics/Presenter.h"
#include "play/PageDrawing.h"
#include "play/PageLayout.h"
#include "play/SamplePanel.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

// How many of the newest steps a redraw takes backups for, at most.
constexpr std::size_t kMostFreshBackups = 200;

// Strokes and layers of a replay, apart from the page's own.
struct Replay {
  Replay(RenderQueue& queue, PagePens& replayPens, const PageLayers& page)
      : pens(replayPens), layers(queue, pens, strokes, page.width(), page.height(), page.view()) {}
  ~Replay() {
    for (std::size_t i = 0; i < strokes.size(); ++i) pens.forget(strokes[i]);
  }
  Replay(const Replay&) = delete;
  Replay& operator=(const Replay&) = delete;

  PagePens& pens;
  StrokeList strokes;
  PageLayers layers;
};

void checkView(const PageView& view) {
  if (!(view.zoom >= kLeastZoom && view.zoom <= kMostZoom)) {
    throw Refusal("a page is shown from a thousandth to a thousand times its size");
  }
  if (!(std::abs(view.x) <= kFarthestShift && std::abs(view.y) <= kFarthestShift)) {
    throw Refusal("a page is not moved so far");
  }
}

int pixelsFor(double length) {
  return static_cast<int>(std::max(std::ceil(length - 1e-3), 1.0));
}

}  // namespace

struct InkPage::Parts {
  Parts(const PluginLibrary& penLibrary, RenderQueue& renderQueue, int width, int height,
        const PageMemory& memory)
      : plugin(penLibrary),
        queue(renderQueue),
        pens(plugin, queue, memory.mostCachedBytes),
        layers(queue, pens, strokes, width, height, PageView{}),
        wet(plugin, queue, pens, width, height, PageView{}),
        history(memory.mostBackupBytes) {}

  // The replay's, while there is one.
  StrokeList& activeStrokes();
  PageLayers& activeLayers();

  void refuseIfBusy() const;
  void dropUndone();
  void setShape(int width, int height, const PageView& view);
  bool placeOnTop(std::size_t index, Step* step);
  void backUpInto(Step& step, const PixelArea& area);
  std::optional<PageChange> travel(bool isForth);
  void apply(Step& step, bool isDone);
  bool swapBackups(Step& step, bool isDone);
  Step* additionOf(std::size_t index);
  std::size_t indexOf(StrokeId id) const;
  void hide(std::size_t index, Step& step);
  std::vector<Sample> usable(std::span<const Sample> samples, double earliest) const;

  const PluginLibrary& plugin;
  RenderQueue& queue;
  StrokeList strokes;  // outlive the pens, which cache their drawings
  PagePens pens;
  PageLayers layers;
  WetInk wet;
  History history;
  std::unique_ptr<Replay> replay;
  std::optional<Presenter> presenter;
  StrokeId lastId = 0;
  bool isLost = false;
  std::optional<std::pair<int, int>> sizeToBe;  // asked for while the context was lost
  bool isErasing = false;                       // the last step is open
  PixelArea staleBefore;                        // the erasing
};

InkPage::InkPage(const PluginLibrary& plugin, RenderQueue& queue, int width, int height,
                 const PageMemory& memory)
    : mParts(std::make_unique<Parts>(plugin, queue, width, height, memory)) {}

InkPage::~InkPage() = default;

StrokeList& InkPage::Parts::activeStrokes() {
  if (replay != nullptr) return replay->strokes;
  return strokes;
}

PageLayers& InkPage::Parts::activeLayers() {
  if (replay != nullptr) return replay->layers;
  return layers;
}

// --- The window ---

void InkPage::Parts::setShape(int width, int height, const PageView& view) {
  const int widthBefore = layers.width(), heightBefore = layers.height();
  const PageView viewBefore = layers.view();
  try {
    wet.setShape(width, height, view, activeStrokes());
    if (replay != nullptr) replay->layers.setShape(width, height, view);
    layers.setShape(width, height, view);
  } catch (...) {
    const std::exception_ptr reason = std::current_exception();
    wet.setShape(widthBefore, heightBefore, viewBefore, activeStrokes());
    if (replay != nullptr) replay->layers.setShape(widthBefore, heightBefore, viewBefore);
    std::rethrow_exception(reason);
  }
  history.dropAllBackups();
}

void InkPage::resize(int width, int height) {
  Parts& page = *mParts;
  if (page.isLost) {
    page.sizeToBe = {width, height};
    return;
  }
  if (width == page.layers.width() && height == page.layers.height()) return;
  page.setShape(width, height, page.layers.view());
}

int InkPage::width() const {
  return mParts->layers.width();
}

int InkPage::height() const {
  return mParts->layers.height();
}

void InkPage::setView(const PageView& view) {
  checkView(view);
  if (view == mParts->layers.view()) return;
  mParts->setShape(mParts->layers.width(), mParts->layers.height(), view);
}

const PageView& InkPage::view() const {
  return mParts->layers.view();
}

void InkPage::present(const std::array<std::uint8_t, 3>& paper) {
  Parts& page = *mParts;
  if (page.isLost) return;
  if (!page.presenter) page.presenter.emplace(page.queue);
  std::vector<ShownLayer> shown;
  page.activeLayers().addShown(shown);
  page.wet.addShown(shown);
  page.presenter->present(shown, paper, width(), height());
}

bool InkPage::work(double milliseconds) {
  Parts& page = *mParts;
  if (page.isLost) return false;
  const double most = std::clamp(milliseconds, 0.0, 1000.0);
  const auto deadline = PageLayers::Clock::now() + std::chrono::duration_cast<PageLayers::Clock::duration>(
                                                       std::chrono::duration<double, std::milli>(most));
  PageLayers& layers = page.activeLayers();
  const bool hasMore =
      layers.work(deadline, [&page](std::size_t index, const std::function<PageBackup()>& backUp) {
        if (page.replay != nullptr) return;
        Step* const step = page.additionOf(index);
        if (step == nullptr || step->isBacked) return;
        try {
          step->isBacked = true;
          page.history.addBackup(*step, backUp());
        } catch (const std::exception&) {
          page.history.dropBackups(*step);  // it will be undone by a redraw
        }
      });
  if (layers.frontFits()) page.wet.dry(page.activeStrokes());
  return hasMore;
}

bool InkPage::isBusy() const {
  return !mParts->isLost && mParts->activeLayers().isBusy();
}

// Nothing is exact without a context, so that no backups are taken either.
void InkPage::contextLost() {
  Parts& page = *mParts;
  if (page.isLost) return;
  page.isLost = true;
  page.history.dropAllBackups();
  page.queue.loseContext();
  page.layers.spoilAll();
  if (page.replay != nullptr) page.replay->layers.spoilAll();
}

void InkPage::contextRestored() {
  Parts& page = *mParts;
  if (!page.isLost) return;
  page.queue.restoreContext();
  page.isLost = false;
  page.layers.spoilAll();
  if (page.replay != nullptr) page.replay->layers.spoilAll();
  page.wet.redraw(page.activeStrokes());
  if (const auto size = std::exchange(page.sizeToBe, std::nullopt)) resize(size->first, size->second);
}

// --- The pen ---

PenLimits InkPage::limits(int look) {
  PageStyle style;
  style.look = look;
  checkStyle(style);
  return mParts->pens.limits(look);
}

void InkPage::begin(const PageStyle& style, const Sample& sample) {
  Parts& page = *mParts;
  if (page.wet.isDrawing()) throw Refusal("a stroke is under way already");
  checkStyle(style);
  if (!isUsable(sample)) throw Refusal("a stroke cannot begin at no place of the page");
  page.isErasing = false;
  page.wet.begin(style, inRange(sample, -std::numeric_limits<double>::infinity()));
}

std::vector<Sample> InkPage::Parts::usable(std::span<const Sample> samples, double earliest) const {
  std::vector<Sample> good;
  good.reserve(samples.size());
  for (const Sample& sample : samples) {
    if (!isUsable(sample)) continue;
    good.push_back(inRange(sample, earliest));
    earliest = good.back().time;
  }
  return good;
}

void InkPage::move(std::span<const Sample> samples, std::span<const Sample> predicted) {
  Parts& page = *mParts;
  if (!page.wet.isDrawing()) return;
  const std::vector<Sample> good = page.usable(samples, page.wet.samples().back().time);
  const double latest = good.empty() ? page.wet.samples().back().time : good.back().time;
  page.wet.move(good, page.usable(predicted, latest));
}

StrokeId InkPage::end(const Sample& sample) {
  Parts& page = *mParts;
  if (!page.wet.isDrawing()) return 0;
  const Sample before = page.wet.samples().back();
  if (isUsable(sample) && (sample.x != before.x || sample.y != before.y)) {
    Sample last = inRange(sample, before.time);
    if (last.pressure == 0.0f) last.pressure = before.pressure;
    page.wet.add({&last, 1});
  }
  StrokeList& strokes = page.activeStrokes();
  const StrokeId id = page.lastId + 1;
  auto stroke = std::make_unique<PageStroke>(id, page.wet.style(), page.wet.samples());
  Step* step = nullptr;
  if (page.replay == nullptr) {
    Step addition{.isAddition = true, .strokes = {id}, .backups = {}};
    strokes.makeRoom();
    page.dropUndone();
    step = &page.history.add(std::move(addition));
  }
  strokes.add(std::move(stroke));
  page.lastId = id;
  if (page.placeOnTop(strokes.size() - 1, step)) {
    page.wet.remove(strokes);
  } else {
    page.wet.hold(id);
  }
  return page.replay == nullptr ? id : 0;
}

// Draws the topmost stroke to the front layers where they fit; else answers false. Whatever fails, the stroke
// will be there after a redraw.
bool InkPage::Parts::placeOnTop(std::size_t index, Step* step) {
  PageLayers& on = activeLayers();
  if (!on.frontFits()) return false;
  const PixelArea area = on.areaOf(activeStrokes()[index]);
  const bool isExact = !isLost && on.isExact(area);
  try {
    on.makeRoomFor(activeStrokes()[index]);
    if (step != nullptr && isExact) {
      step->isBacked = true;
      if (!isEmpty(area)) backUpInto(*step, area);
    }
    if (!isEmpty(area)) on.drawOnTop(index);
  } catch (const std::exception&) {
    if (step != nullptr) history.dropBackups(*step);
    on.spoil(area);
  }
  return true;
}

// A step whose backup fails is not backed.
void InkPage::Parts::backUpInto(Step& step, const PixelArea& area) {
  try {
    history.addBackup(step, layers.backUp(area));
  } catch (const std::exception&) {
    history.dropBackups(step);
  }
}

void InkPage::cancel() {
  mParts->wet.remove(mParts->activeStrokes());
}

bool InkPage::isDrawing() const {
  return mParts->wet.isDrawing();
}

// --- The history ---

void InkPage::Parts::refuseIfBusy() const {
  if (wet.isDrawing()) throw Refusal("a stroke is under way");
  if (replay != nullptr) throw Refusal("a replay is under way");
}

// What was undone cannot come back once something new is done.
void InkPage::Parts::dropUndone() {
  while (history.canRedo()) {
    const Step& step = history.last();
    for (const StrokeId id : step.strokes) {
      const auto index = step.isAddition ? strokes.indexOf(id) : std::nullopt;
      if (!index) continue;
      pens.forget(strokes[*index]);
      strokes.take(*index);
      layers.removed(*index);
    }
    history.dropLast();
  }
}

// Shows or hides what a step that was just done or undone says, and brings the layers up to date.
void InkPage::Parts::apply(Step& step, bool isDone) {
  for (const StrokeId id : step.strokes) strokes.show(indexOf(id), step.isAddition == isDone);
  layers.restart();
  if (wet.isHolding()) wet.redraw(strokes);
  if (step.isBacked && layers.frontFits() && swapBackups(step, isDone)) return;
  history.dropBackups(step);
  if (strokes.shown() == 0) {
    layers.showNothing();
    return;
  }
  if (isDone && step.isAddition && step.strokes.size() == 1) {
    const std::size_t index = indexOf(step.strokes.front());
    if (strokes.isTop(index) && placeOnTop(index, &step)) return;
  }
  for (const StrokeId id : step.strokes) {
    const std::size_t index = indexOf(id);
    layers.redraw(index, layers.areasOf(index));
  }
}

// What comes is exact in any case; what goes only where it was.
bool InkPage::Parts::swapBackups(Step& step, bool isDone) {
  bool isExact = true;
  for (const PageBackup& backup : step.backups) isExact = isExact && layers.isExact(backup.area);
  try {
    const std::size_t count = step.backups.size();
    for (std::size_t i = 0; i < count; ++i) layers.swap(step.backups[isDone ? i : count - 1 - i]);
  } catch (const std::exception&) {
    for (const PageBackup& backup : step.backups) layers.spoil(backup.area);
    isExact = false;
  }
  if (!isExact) history.dropBackups(step);
  return true;
}

// The step that added a stroke, if undoing it would show what lies below the stroke: that is so for the
// newest steps, as long as each has added the topmost stroke.
Step* InkPage::Parts::additionOf(std::size_t index) {
  if (strokes.size() - index > kMostFreshBackups) return nullptr;
  std::size_t back = 0;
  for (std::size_t i = strokes.size(); i-- > index;) {
    if (!strokes[i].isShown) continue;
    Step* const step = history.doneBefore(back++);
    if (step == nullptr || !step->isAddition || step->strokes.size() != 1) return nullptr;
    if (step->strokes.front() != strokes[i].id()) return nullptr;
    if (i == index) return step;
  }
  return nullptr;
}

std::size_t InkPage::Parts::indexOf(StrokeId id) const {
  const auto index = strokes.indexOf(id);
  if (!index) throw Refusal("the page has no stroke " + std::to_string(id));
  return *index;
}

std::size_t InkPage::erase(float x0, float y0, float x1, float y1, float radius) {
  Parts& page = *mParts;
  page.refuseIfBusy();
  const EraserMark mark{{x0, y0}, {x1, y1}, radius};
  if (!isUsable(mark)) throw Refusal("nothing can be erased at no place of the page");
  std::vector<StrokeId> hits;
  for (std::size_t i = 0; i < page.strokes.size(); ++i) {
    if (page.strokes[i].isShown && isHit(page.strokes[i], mark)) hits.push_back(page.strokes[i].id());
  }
  if (hits.empty()) return 0;
  if (!page.isErasing) {
    Step erasure{.isAddition = false, .strokes = {}, .backups = {}};
    page.dropUndone();
    erasure.isBacked = page.layers.frontFits() && !page.isLost;
    page.history.add(std::move(erasure));
    page.staleBefore = page.layers.stale();
    page.isErasing = true;
  }
  Step& step = *page.history.toUndo();
  step.strokes.reserve(step.strokes.size() + hits.size());
  for (const StrokeId id : hits) page.hide(page.indexOf(id), step);
  if (page.strokes.shown() == 0) page.layers.showNothing();
  if (page.wet.isHolding()) page.wet.redraw(page.strokes);
  return hits.size();
}

// The step has room for the stroke.
void InkPage::Parts::hide(std::size_t index, Step& step) {
  const std::vector<PixelArea> areas = layers.areasOf(index);
  for (const PixelArea& area : areas) {
    if (!step.isBacked) break;
    if (meet(area, staleBefore)) {
      history.dropBackups(step);
    } else {
      backUpInto(step, area);
    }
  }
  strokes.show(index, false);
  step.strokes.push_back(strokes[index].id());
  layers.redraw(index, areas);
}

std::optional<PageChange> InkPage::eraseEnd() {
  Parts& page = *mParts;
  if (!std::exchange(page.isErasing, false)) return std::nullopt;
  return PageChange{.shown = {}, .hidden = page.history.toUndo()->strokes};
}

// Undoes the last step, or does the next one again.
std::optional<PageChange> InkPage::Parts::travel(bool isForth) {
  refuseIfBusy();
  isErasing = false;
  Step* const step = isForth ? history.toRedo() : history.toUndo();
  if (step == nullptr) return std::nullopt;
  PageChange change;
  (step->isAddition == isForth ? change.shown : change.hidden) = step->strokes;
  if (isForth) {
    history.redone();
  } else {
    history.undone();
  }
  apply(*step, isForth);
  return change;
}

std::optional<PageChange> InkPage::undo() {
  return mParts->travel(false);
}
std::optional<PageChange> InkPage::redo() {
  return mParts->travel(true);
}

std::optional<PageChange> InkPage::clear() {
  Parts& page = *mParts;
  page.refuseIfBusy();
  page.isErasing = false;
  if (page.strokes.shown() == 0) return std::nullopt;
  PageChange change{.shown = {}, .hidden = strokes()};
  Step clearing{.isAddition = false, .strokes = change.hidden, .backups = {}};
  page.dropUndone();
  Step& step = page.history.add(std::move(clearing));
  if (!page.isLost && page.layers.isExact(page.layers.window())) {
    step.isBacked = true;
    page.backUpInto(step, page.layers.window());
  }
  for (const StrokeId id : step.strokes) page.strokes.show(page.indexOf(id), false);
  page.layers.showNothing();
  if (page.wet.isHolding()) page.wet.dry(page.strokes);
  return change;
}

bool InkPage::canUndo() const {
  return mParts->history.canUndo();
}

bool InkPage::canRedo() const {
  return mParts->history.canRedo();
}

PageChange InkPage::openInkml(std::span<const std::uint8_t> bytes, const std::string& name) {
  Parts& page = *mParts;
  page.refuseIfBusy();
  page.isErasing = false;
  // All that may throw comes ahead of the change.
  std::vector<std::unique_ptr<PageStroke>> read =
      readStrokes(bytes, name, page.lastId + 1, page.pens.limits(PageStyle{}.look));
  PageChange change;
  change.shown.reserve(read.size());
  for (const auto& stroke : read) change.shown.push_back(stroke->id());
  Step addition{.isAddition = true, .strokes = change.shown, .backups = {}};
  page.strokes.makeRoom(read.size());
  page.dropUndone();
  Step& step = page.history.add(std::move(addition));
  PixelArea area;
  for (auto& stroke : read) {
    area = united(area, page.layers.areaOf(*stroke));
    page.lastId = stroke->id();
    page.strokes.add(std::move(stroke));
  }
  if (!page.isLost && page.layers.isExact(area)) {
    step.isBacked = true;
    if (!isEmpty(area)) page.backUpInto(step, area);
  }
  page.layers.redraw(page.strokes.size() - 1, {area});
  return change;
}

// --- The strokes ---

// Backups know nothing of a stroke that came between the steps.
StrokeId InkPage::addRecord(std::span<const std::uint8_t> bytes) {
  Parts& page = *mParts;
  const StrokeRecord record = readRecord(bytes);
  auto stroke = std::make_unique<PageStroke>(page.lastId + 1, record.style, record.samples);
  const std::vector<PixelArea> areas{page.layers.areaOf(*stroke)};
  page.strokes.makeRoom();
  page.strokes.add(std::move(stroke));
  page.history.dropAllBackups();
  page.layers.redraw(page.strokes.size() - 1, areas);
  return ++page.lastId;
}

void InkPage::setShown(StrokeId id, bool isShown) {
  Parts& page = *mParts;
  page.refuseIfBusy();
  page.isErasing = false;
  const std::size_t index = page.indexOf(id);
  if (page.strokes[index].isShown == isShown) return;
  const std::vector<PixelArea> areas = page.layers.areasOf(index);
  page.history.dropAllBackups();
  page.strokes.show(index, isShown);
  page.layers.redraw(index, areas);
  if (page.strokes.shown() == 0) page.layers.showNothing();
  if (page.wet.isHolding()) page.wet.redraw(page.strokes);
}

std::vector<std::uint8_t> InkPage::record(StrokeId id) const {
  const PageStroke& stroke = mParts->strokes[mParts->indexOf(id)];
  return writeRecord(stroke.style(), stroke.samples());
}

const PageStyle& InkPage::style(StrokeId id) const {
  return mParts->strokes[mParts->indexOf(id)].style();
}

std::vector<Sample> InkPage::samples(StrokeId id) const {
  return mParts->strokes[mParts->indexOf(id)].samples();
}

bool InkPage::isShown(StrokeId id) const {
  return mParts->strokes[mParts->indexOf(id)].isShown;
}

std::vector<StrokeId> InkPage::strokes() const {
  std::vector<StrokeId> ids;
  ids.reserve(mParts->strokes.shown());
  for (std::size_t i = 0; i < mParts->strokes.size(); ++i) {
    if (mParts->strokes[i].isShown) ids.push_back(mParts->strokes[i].id());
  }
  return ids;
}

std::optional<PageBounds> InkPage::bounds() const {
  std::optional<Qelt::RectF> all;
  for (std::size_t i = 0; i < mParts->strokes.size(); ++i) {
    const PageStroke& stroke = mParts->strokes[i];
    if (!stroke.isShown) continue;
    Qelt::RectF box = stroke.line();
    box.IncreaseRect(stroke.style().size / 2.0f);
    if (!all) all = box;
    all->Union(box);
  }
  if (!all) return std::nullopt;
  return PageBounds{all->left, all->top, all->right, all->bottom};
}

// --- Pictures ---

PagePicture InkPage::picture(double zoom, const std::optional<std::array<std::uint8_t, 3>>& background) {
  Parts& page = *mParts;
  if (page.strokes.shown() == 0) throw Refusal("there is nothing on the page");
  checkView({.zoom = zoom});
  std::optional<Qelt::RectF> box;
  float largest = 0.0f, largestOutline = 0.0f;
  bool hasOutlines = false;
  for (std::size_t i = 0; i < page.strokes.size(); ++i) {
    const PageStroke& stroke = page.strokes[i];
    if (!stroke.isShown) continue;
    if (!box) box = stroke.line();
    box->Union(stroke.line());
    largest = std::max(largest, stroke.style().size);
    if (!stroke.style().outline) continue;
    hasOutlines = true;
    largestOutline = std::max(largestOutline, stroke.style().outline->size);
  }
  const float margin = pageMargin(largest, largestOutline);
  const PageArea area{box->left - margin, box->top - margin, box->right - box->left + 2.0f * margin,
                      box->bottom - box->top + 2.0f * margin};
  const PageLayout layout = layOut(area, static_cast<float>(zoom), 0.0f);
  if (!(layout.width <= kLongestSide && layout.height <= kLongestSide) ||
      std::ceil(layout.width) * std::ceil(layout.height) > kMostPixels) {
    throw Refusal("the picture would be too large; a smaller zoom helps");
  }
  const int width = pixelsFor(layout.width), height = pixelsFor(layout.height);
  const PageView view{layout.matrix[0], layout.matrix[6], layout.matrix[7]};
  CanvasLayer strokes(page.queue, width, height);
  std::optional<CanvasLayer> outlines;
  if (hasOutlines) outlines.emplace(page.queue, width, height);
  for (std::size_t i = 0; i < page.strokes.size(); ++i) {
    if (!page.strokes[i].isShown) continue;
    page.pens.draw(page.strokes, i, {&strokes, outlines ? &*outlines : nullptr, view});
  }
  std::vector<std::vector<std::uint8_t>> pixels;
  if (outlines) pixels.push_back(outlines->readPixels());
  pixels.push_back(strokes.readPixels());
  return {width, height, composeLayers(pixels, background)};
}

PagePicture InkPage::preview(int width, int height, const PageStyle& style) {
  constexpr int kMostSide = 4096;
  checkStyle(style);
  if (width < 1 || height < 1 || width > kMostSide || height > kMostSide) {
    throw Refusal("a sample stroke is drawn 1 to 4096 pixels wide and high");
  }
  const double zoom = std::min(width / double{kPanelWidth}, height / double{kPanelHeight});
  CanvasLayer layer(mParts->queue, width, height);
  mParts->pens.drawPreview(style, layer,
                           {zoom, (width - zoom * kPanelWidth) / 2.0, (height - zoom * kPanelHeight) / 2.0});
  return {width, height, composeLayers({layer.readPixels()}, std::nullopt)};
}

PagePicture InkPage::windowPicture() {
  return mParts->activeLayers().frontPicture();
}

// --- Replay ---

void InkPage::replayBegin() {
  Parts& page = *mParts;
  page.refuseIfBusy();
  page.isErasing = false;
  page.replay = std::make_unique<Replay>(page.queue, page.pens, page.layers);
  page.wet.dry(page.strokes);
}

void InkPage::replayEnd() {
  Parts& page = *mParts;
  if (page.replay == nullptr) return;
  cancel();
  page.wet.dry(page.activeStrokes());
  page.replay.reset();
}

bool InkPage::isReplaying() const {
  return mParts->replay != nullptr;
}

PageStats InkPage::stats() const {
  const Parts& page = *mParts;
  PageStats stats;
  stats.strokes = page.strokes.shown();
  stats.stamps = page.pens.stamps() + page.wet.stamps();
  stats.tiles = page.layers.tiles() + page.wet.tiles();
  if (page.replay != nullptr) stats.tiles += page.replay->layers.tiles();
  stats.cacheHits = page.pens.cache().hits();
  stats.cacheMisses = page.pens.cache().misses();
  stats.cachedBytes = page.pens.cache().bytes();
  stats.backupBytes = page.history.bytes();
  return stats;
}

}  // namespace QeltDesktop
