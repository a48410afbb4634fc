#include "core/PageLayers.h"

#include <algorithm>
#include <cstdint>
#include <exception>
#include <utility>

#include "desktop/base/Log.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/Compose.h"
#include "graphics/ISPBitmap.h"

namespace QeltDesktop {
namespace {

// How many bytes of vertices a slice hands to the GPU, which on some machines is ten times as slow as the
// thread that feeds it: as many as it draws in the time below. A single stroke may exceed them.
constexpr std::size_t kLeastSliceBytes = std::size_t{128} << 10;
constexpr std::size_t kMostSliceBytes = std::size_t{8} << 20;
constexpr std::chrono::milliseconds kLongestOnGpu{8};
// How many strokes outside the view are passed over before the clock is looked at.
constexpr std::size_t kMostPassedOver = 1000;

}  // namespace

std::size_t PageBackup::bytes() const {
  return (strokes != nullptr ? strokes->bytes() : 0) + (outlines != nullptr ? outlines->bytes() : 0);
}

PageLayers::PageLayers(RenderQueue& queue, PagePens& pens, StrokeList& strokes, int width, int height,
                       const PageView& view)
    : mQueue(queue),
      mPens(pens),
      mStrokes(strokes),
      mWidth(width),
      mHeight(height),
      mView(view),
      mFrontView(view) {
  mFront.strokes = newLayer(width, height);
  mBack.strokes = newLayer(width, height);
  mQueue.run([this] { mFence = std::make_unique<GpuFence>(); });
}

PageLayers::~PageLayers() {
  try {
    mQueue.run([this] { mFence.reset(); });
  } catch (...) {
    logError("a fence could not be given back to OpenGL; it goes with the context");
  }
}

std::unique_ptr<CanvasLayer> PageLayers::newLayer(int width, int height) {
  return std::make_unique<CanvasLayer>(mQueue, width, height);
}

void PageLayers::setShape(int width, int height, const PageView& view) {
  if (width == mWidth && height == mHeight && view == mView) return;
  if (width != mWidth || height != mHeight) {
    Pair back;
    back.strokes = newLayer(width, height);
    if (mBack.outlines != nullptr) back.outlines = newLayer(width, height);
    mBack = std::move(back);
  }
  mWidth = width;
  mHeight = height;
  mView = view;
  mJob.reset();
  // Back at the view of the front, what a redraw was to mend is no longer known.
  mStale = window();
}

bool PageLayers::frontFits() const {
  return mView == mFrontView && mFront.strokes->width() == mWidth && mFront.strokes->height() == mHeight;
}

PixelArea PageLayers::areaOf(const PageStroke& stroke) const {
  return pixelsOf(stroke.line(), reachOf(stroke.style()), mView, mWidth, mHeight);
}

std::vector<PixelArea> PageLayers::areasOf(std::size_t index) const {
  std::vector<PixelArea> areas{areaOf(mStrokes[index])};
  for (const std::size_t above : mStrokes.outlinesThatFollow(index)) areas.push_back(areaOf(mStrokes[above]));
  std::erase_if(areas, [](const PixelArea& area) { return isEmpty(area); });
  return areas;
}

PageCanvas PageLayers::canvasOf(const Pair& pair, const PageView& view) const {
  return {pair.strokes.get(), pair.outlines.get(), view};
}

void PageLayers::makeRoomFor(const PageStroke& stroke) {
  if (!stroke.style().outline || mFront.outlines != nullptr) return;
  mFront.outlines = newLayer(mFront.strokes->width(), mFront.strokes->height());
}

void PageLayers::drawOnTop(std::size_t index) {
  makeRoomFor(mStrokes[index]);
  mPens.draw(mStrokes, index, canvasOf(mFront, mFrontView));
}

void PageLayers::spoilAll() {
  mJob.reset();
  mStale = window();
}

void PageLayers::redraw(std::size_t index, const std::vector<PixelArea>& areas) {
  for (const PixelArea& area : areas) {
    if (!mJob || !holds(mJob->area, area)) {
      spoil(area);
    } else if (index < mJob->next) {
      mJob->stale = united(mJob->stale, area);
    }
  }
}

void PageLayers::removed(std::size_t index) {
  if (mJob && index < mJob->next) --mJob->next;
}

void PageLayers::restart() {
  if (!mJob) return;
  spoil(united(mJob->area, mJob->stale));
  mJob.reset();
}

void PageLayers::showNothing() {
  mFront.strokes->clear();
  if (mFront.outlines != nullptr) mFront.outlines->clear();
  mJob.reset();
  mStale = {};
}

PageBackup PageLayers::backUp(RenderQueue& queue, Pair& pair, const PixelArea& area) {
  PageBackup backup{.area = area, .strokes = nullptr, .outlines = nullptr};
  backup.strokes = std::make_unique<LayerBackup>(queue, *pair.strokes, area);
  if (pair.outlines != nullptr) {
    backup.outlines = std::make_unique<LayerBackup>(queue, *pair.outlines, area);
  }
  return backup;
}

PageBackup PageLayers::backUp(const PixelArea& area) {
  return backUp(mQueue, mFront, area);
}

void PageLayers::swap(PageBackup& backup) {
  backup.strokes->swapWith(*mFront.strokes);
  if (backup.outlines != nullptr && mFront.outlines != nullptr) backup.outlines->swapWith(*mFront.outlines);
}

bool PageLayers::work(Clock::time_point deadline, const BeforeDrawing& beforeDrawing) {
  if (!isBusy()) return false;
  if (!isGpuDone()) return true;
  if (!mJob) begin();
  std::size_t bytes = 0, passedOver = 0;
  while (mJob && mJob->next < mStrokes.size()) {
    const PageStroke& stroke = mStrokes[mJob->next];
    if (stroke.isShown && meet(areaOf(stroke), mJob->area)) {
      bytes += drawNext(beforeDrawing);
    } else {
      ++mJob->next;
      if (++passedOver % kMostPassedOver != 0) continue;
    }
    if (Clock::now() >= deadline || bytes > mSliceBytes) break;
  }
  if (mJob && mJob->next == mStrokes.size()) finish();
  mQueue.run([&] { mFence->set(); });
  mSliceEnd = Clock::now();
  mWasSlow = false;
  return isBusy();
}

// Slices grow while the GPU keeps up with them, and shrink where it was found to take too long.
bool PageLayers::isGpuDone() {
  bool hasPassed = true;
  mQueue.run([&] { hasPassed = mFence->hasPassed(); });
  if (!hasPassed) {
    mWasSlow = mWasSlow || Clock::now() - mSliceEnd > kLongestOnGpu;
    return false;
  }
  mSliceBytes = std::clamp(mWasSlow ? mSliceBytes / 2 : mSliceBytes + mSliceBytes / 4, kLeastSliceBytes,
                           kMostSliceBytes);
  return true;
}

void PageLayers::begin() {
  Job job{.area = mStale, .isWhole = !frontFits(), .stale = {}};
  if (!frontFits()) job.area = window();
  if (mFront.outlines != nullptr && mBack.outlines == nullptr) mBack.outlines = newLayer(mWidth, mHeight);
  mBack.strokes->clear(job.area);
  if (mBack.outlines != nullptr) mBack.outlines->clear(job.area);
  mJob = job;
  mStale = {};
}

std::size_t PageLayers::drawNext(const BeforeDrawing& beforeDrawing) {
  const std::size_t index = mJob->next;
  const PageStroke& stroke = mStrokes[index];
  if (stroke.style().outline && mBack.outlines == nullptr) mBack.outlines = newLayer(mWidth, mHeight);
  const PixelArea area = areaOf(stroke);
  if (holds(mJob->area, area) && !meet(area, mJob->stale))
    beforeDrawing(index, [&] { return backUp(mQueue, mBack, area); });
  ++mJob->next;
  try {
    return mPens.draw(mStrokes, index, canvasOf(mBack, mView));
  } catch (const std::exception&) {
    // What is cached of others is the first thing to do without.
    mPens.cache().dropAll();
    if (std::exchange(mFailed, stroke.id()) != stroke.id()) {
      restart();
    } else {
      logError("a stroke cannot be drawn, and is left out");
    }
  }
  return 0;
}

// All that may throw comes ahead of the change.
void PageLayers::finish() {
  if (mJob->isWhole) {
    Pair back;
    const bool isAsLarge = mFront.strokes->width() == mWidth && mFront.strokes->height() == mHeight;
    if (!isAsLarge) back.strokes = newLayer(mWidth, mHeight);
    std::swap(mFront, mBack);
    if (!isAsLarge) mBack = std::move(back);
    mFrontView = mView;
  } else {
    if (mBack.outlines != nullptr && mFront.outlines == nullptr) mFront.outlines = newLayer(mWidth, mHeight);
    mFront.strokes->copyFrom(*mBack.strokes, mJob->area);
    if (mBack.outlines != nullptr) {
      mFront.outlines->copyFrom(*mBack.outlines, mJob->area);
    } else if (mFront.outlines != nullptr) {
      mFront.outlines->clear(mJob->area);
    }
  }
  const PixelArea stale = mJob->stale;
  mJob.reset();
  mFailed = 0;
  spoil(stale);
}

void PageLayers::addShown(std::vector<ShownLayer>& shown) const {
  const double scale = mView.zoom / mFrontView.zoom;
  const auto place = [&](CanvasLayer* layer) {
    if (layer == nullptr) return;
    shown.push_back({.layer = layer,
                     .scale = static_cast<float>(scale),
                     .x = static_cast<float>(mView.x - scale * mFrontView.x),
                     .y = static_cast<float>(mView.y - scale * mFrontView.y)});
  };
  place(mFront.outlines.get());
  place(mFront.strokes.get());
}

PagePicture PageLayers::frontPicture() {
  std::vector<std::vector<std::uint8_t>> pixels;
  if (mFront.outlines != nullptr) pixels.push_back(mFront.outlines->readPixels());
  pixels.push_back(mFront.strokes->readPixels());
  return {mFront.strokes->width(), mFront.strokes->height(), composeLayers(pixels, std::nullopt)};
}

std::size_t PageLayers::tiles() const {
  std::size_t count = 0;
  for (const Pair* pair : {&mFront, &mBack}) {
    for (CanvasLayer* layer : {pair->strokes.get(), pair->outlines.get()}) {
      if (layer != nullptr) count += static_cast<std::size_t>(layer->GetBitmap()->GetTileCount());
    }
  }
  return count;
}

}  // namespace QeltDesktop
