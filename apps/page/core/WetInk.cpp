#include "core/WetInk.h"

#include <new>
#include <stdexcept>
#include <utility>

#include "desktop/base/Log.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/pencommon/BatchObserver.h"
#include "engine/MotionEvent.h"
#include "graphics/ISPBitmap.h"
#include "pen/RenderingVersions.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "play/Options.h"
#include "play/PenSession.h"
#include "play/StrokeFeeder.h"

namespace QeltDesktop {
namespace {

const Qelt::RenderingVersion& versionOf(const PageStyle& style) {
  return Qelt::kRenderingVersions[static_cast<std::size_t>(style.look - 1)];
}

std::unique_ptr<CanvasLayer> predictionLayer(RenderQueue& queue, int width, int height) {
  try {
    return std::make_unique<CanvasLayer>(queue, width, height, CanvasLayer::kOneTile);
  } catch (const std::runtime_error&) {
    return nullptr;  // larger than OpenGL draws at once: the page does without predictions
  }
}

}  // namespace

// A pen that draws live.
class WetInk::Pen {
 public:
  Pen(const PluginLibrary& plugin, RenderQueue& queue, const PageStyle& style)
      : mInkCanvas(&queue, nullptr),
        mPredictionCanvas(&queue, nullptr),
        mSession(plugin, queue, {style.look, style.smooth}),
        mStroke(mSession.pen().GetStrokeDrawableGL()) {
    if (mStroke == nullptr) throw std::bad_alloc();
    if (!versionOf(style).predicts) return;
    mPrediction = mSession.pen().GetPredictionStrokeDrawableGL();
    if (mPrediction == nullptr) throw std::bad_alloc();
    mPrediction->SetOpacity(Options().opacity);
  }

  // Before a call.
  void aim(const PageStyle& style, const PageView& view, CanvasLayer* ink, CanvasLayer* prediction) {
    mSession.setStyle({style.size, style.argb});
    aim(mStroke, mInkCanvas, view, ink);
    aim(mPrediction, mPredictionCanvas, view, prediction);
  }

  Qelt::PenStrokeDrawableGL& stroke() { return *mStroke; }
  // Null where the look has none.
  Qelt::IPenPredictionDrawableGL* prediction() { return mPrediction; }

 private:
  template <typename Drawable>
  static void aim(Drawable* drawable, PenCanvas& canvas, const PageView& view, CanvasLayer* layer) {
    canvas.setLayer(layer);
    canvas.setMatrix(matrixOf(view));
    if (drawable != nullptr && layer != nullptr && drawable->GetCanvas() == nullptr) {
      drawable->SetCanvas(&canvas);
    }
  }

  PenCanvas mInkCanvas, mPredictionCanvas;  // outlive the pen's drawables
  PenSession mSession;
  Qelt::PenStrokeDrawableGL* mStroke;
  Qelt::IPenPredictionDrawableGL* mPrediction = nullptr;
};

WetInk::WetInk(const PluginLibrary& plugin, RenderQueue& queue, PagePens& pens, int width, int height,
               const PageView& view)
    : mPlugin(plugin),
      mQueue(queue),
      mPens(pens),
      mView(view),
      mInk(std::make_unique<CanvasLayer>(queue, width, height)),
      mPrediction(predictionLayer(queue, width, height)) {}

WetInk::~WetInk() = default;

void WetInk::setShape(int width, int height, const PageView& view, StrokeList& strokes) {
  const bool isNewSize = width != mInk->width() || height != mInk->height();
  if (!isNewSize && view == mView) return;
  if (isNewSize) {
    auto ink = std::make_unique<CanvasLayer>(mQueue, width, height);
    mPrediction = predictionLayer(mQueue, width, height);
    mInk = std::move(ink);
    mPredicted = {};
  }
  mView = view;
  if (isDrawing() || isHolding()) redraw(strokes);
}

void WetInk::redraw(StrokeList& strokes) {
  try {
    mInk->clear();
    clearPrediction();
    for (const StrokeId id : mHeld) {
      const auto index = strokes.indexOf(id);
      if (index && strokes[*index].isShown) {
        mPens.draw(strokes, *index, {.strokes = mInk.get(), .outlines = nullptr, .view = mView});
      }
    }
    if (isDrawing()) feedAgain();
  } catch (const std::bad_alloc&) {
    logError("there is no memory to draw what is being drawn again; it shows when the stroke ends");
  }
}

// The pen begins the stroke under way once more, and goes on with it from there.
void WetInk::feedAgain() {
  const std::span<const Sample> all = mSamples;
  mHasInk = false;
  draw(all.first(1), Qelt::kActionDown);
  if (all.size() > 1) mHasInk = draw(all.subspan(1), Qelt::kActionMove);
  if (!mHasInk) drawFirstDot();
}

WetInk::Pen& WetInk::penFor(const PageStyle& style) {
  std::unique_ptr<Pen>& pen = mWetPens[style];
  if (pen == nullptr) pen = std::make_unique<Pen>(mPlugin, mQueue, style);
  return *pen;
}

bool WetInk::draw(std::span<const Sample> samples, int action) {
  Pen& pen = penFor(mStyle);
  pen.aim(mStyle, mView, mInk.get(), mPrediction.get());
  const Qelt::MotionEvent event = eventOf(samples, mSamples.front().time, action, pointerOf(mStyle));
  const std::uint64_t before = writtenBytes();
  try {
    Qelt::RectF rect;
    pen.stroke().Draw(&event, &rect);
  } catch (...) {
    mQueue.runPending();
    throw;
  }
  mQueue.runPending();
  const std::uint64_t floats = static_cast<std::uint64_t>(versionOf(mStyle).floatsPerVertex);
  const std::uint64_t stamps = (writtenBytes() - before) / (6 * floats * sizeof(float));
  mStamps += stamps;
  return stamps > 0;
}

// A pen places its first stamp with the second event. Until then a dot shows that it is down, where
// predictions are drawn, because it must go again.
void WetInk::drawFirstDot() {
  if (mPrediction == nullptr) return;
  PageStroke dot(0, mStyle, std::span(mSamples).first(1));
  mPredicted = areaOf({});
  mPens.drawAlone(dot, {.strokes = mPrediction.get(), .outlines = nullptr, .view = mView});
}

void WetInk::begin(const PageStyle& style, const Sample& sample) {
  std::vector<Sample> samples;
  samples.reserve(256);
  samples.push_back(sample);
  mSamples = std::move(samples);
  mLine.Set(sample.x, sample.y, sample.x, sample.y);
  mStyle = style;
  mHasInk = false;
  try {
    draw(mSamples, Qelt::kActionDown);
    drawFirstDot();
  } catch (...) {
    clearPrediction();
    mSamples.clear();
    throw;
  }
}

void WetInk::move(std::span<const Sample> samples, std::span<const Sample> predicted) {
  add(samples);
  if (!samples.empty()) mHasInk = draw(samples, Qelt::kActionMove) || mHasInk;
  if (!mHasInk) return;
  clearPrediction();
  if (!predicted.empty()) drawPrediction(predicted);
}

void WetInk::drawPrediction(std::span<const Sample> predicted) {
  Pen& pen = penFor(mStyle);
  if (pen.prediction() == nullptr || mPrediction == nullptr) return;
  mPredicted = areaOf(predicted);
  const Qelt::MotionEvent event =
      eventOf(predicted, mSamples.front().time, Qelt::kActionMove, pointerOf(mStyle));
  try {
    Qelt::RectF rect;
    pen.prediction()->Draw(&event, &rect);
  } catch (...) {
    mQueue.runPending();
    throw;
  }
  mQueue.runPending();
}

void WetInk::clearPrediction() {
  if (mPrediction != nullptr) mPrediction->clear(mPredicted);
  mPredicted = {};
}

PixelArea WetInk::areaOf(std::span<const Sample> predicted) const {
  Qelt::RectF box = mLine;
  for (const Sample& sample : predicted) box.MakeRect(sample.x, sample.y);
  return pixelsOf(box, reachOf(mStyle), mView, mInk->width(), mInk->height());
}

void WetInk::add(std::span<const Sample> samples) {
  mSamples.insert(mSamples.end(), samples.begin(), samples.end());
  for (const Sample& sample : samples) mLine.MakeRect(sample.x, sample.y);
}

void WetInk::remove(StrokeList& strokes) {
  clearPrediction();
  if (mSamples.empty()) return;
  const PixelArea area = areaOf({});
  mSamples.clear();
  if (isHolding()) {
    redraw(strokes);
  } else {
    mInk->clear(area);
  }
}

void WetInk::hold(StrokeId id) {
  mHeld.push_back(id);
  clearPrediction();
  mSamples.clear();
}

void WetInk::dry(StrokeList& strokes) {
  if (!isHolding()) return;
  mHeld.clear();
  redraw(strokes);
}

void WetInk::addShown(std::vector<ShownLayer>& shown) const {
  shown.push_back({.layer = mInk.get()});
  if (mPrediction != nullptr) shown.push_back({.layer = mPrediction.get()});
}

std::size_t WetInk::tiles() const {
  const auto inkTiles = static_cast<std::size_t>(mInk->GetBitmap()->GetTileCount());
  return inkTiles + (mPrediction != nullptr ? 1 : 0);
}

}  // namespace QeltDesktop
