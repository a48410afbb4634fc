#include "play/PageDrawing.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <optional>
#include <string>
#include <vector>

#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/Compose.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/pencommon/BatchObserver.h"
#include "output/Terminal.h"
#include "play/PagePlayer.h"
#include "play/PenSession.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

// How much of its vertices the pen may be ahead of the render thread, which is some ten times as slow. A
// single call may exceed it.
constexpr std::uint64_t kMostWaitingBytes = 16 << 20;
// Roughly what the tasks of a call take besides their vertices.
constexpr std::uint64_t kTaskBytes = 1024;

// Rounded up to whole pixels, at least one; a tiny excess from rounding errors adds none.
double pixelsFor(double length) {
  return std::max(std::ceil(length - 1e-3), 1.0);
}

PixelSize pixelSizeOf(const PageLayout& layout, const Page& page, const Options& options) {
  const double width = pixelsFor(layout.width);
  const double height = pixelsFor(layout.height);
  // NaN fails these comparisons, so it is refused too.
  if (width <= kLongestSide && height <= kLongestSide && width * height <= kMostPixels) {
    return {static_cast<int>(width), static_cast<int>(height)};
  }
  std::array<char, 192> text{};
  std::snprintf(text.data(), text.size(),
                ": the picture is too large to draw: %.6g x %.6g pixels, at most %d a side and %d in all",
                width, height, kLongestSide, kMostPixels);
  if (options.fit && std::isfinite(width + height)) throw Refusal(std::string("--fit") + text.data());
  if (options.page) throw Refusal(std::string("--page") + text.data());
  throw Refusal(page.name + text.data() + "; --fit WxH draws it smaller");
}

// A layer of the picture, and the canvas through which a drawable draws the page into it.
class Layer {
 public:
  Layer(RenderQueue& queue, PixelSize size, const Qelt::Matrix3<float>& matrix,
        int tileSize = CanvasLayer::kTileSize)
      : mPixels(queue, size.width, size.height, tileSize), mCanvas(&queue, &mPixels) {
    mCanvas.setMatrix(matrix);
  }

  CanvasLayer& pixels() { return mPixels; }
  PenCanvas* canvas() { return &mCanvas; }

 private:
  CanvasLayer mPixels;
  PenCanvas mCanvas;
};

class Drawing : public PlayObserver {
 public:
  Drawing(RenderQueue& queue, PixelSize size, const PageLayout& layout, const DrawableSet& drawables,
          Progress& progress)
      : mWatch(queue), mProgress(progress) {
    if (drawables.outline) mOutline.emplace(queue, size, layout.matrix);
    if (drawables.stroke || drawables.preview) mStroke.emplace(queue, size, layout.matrix);
    if (drawables.prediction) mPrediction.emplace(queue, size, layout.matrix, CanvasLayer::kOneTile);
    mCanvases.stroke = drawables.stroke ? mStroke->canvas() : nullptr;
    mCanvases.preview = drawables.preview ? mStroke->canvas() : nullptr;
    mCanvases.outline = mOutline ? mOutline->canvas() : nullptr;
    mCanvases.prediction = mPrediction ? mPrediction->canvas() : nullptr;
  }

  const Canvases& canvases() const { return mCanvases; }

  void passBegins() override {
    for (std::optional<Layer>* layer : {&mOutline, &mStroke, &mPrediction}) {
      if (*layer) (*layer)->pixels().clear();
    }
  }

  void predictionEnds() override { mPrediction->pixels().clear(); }

  void call(const DrawableCall&, const std::function<bool(Qelt::RectF*)>& make) override {
    const std::uint64_t before = writtenBytes();
    Qelt::RectF rect;
    make(&rect);
    mWaitingBytes += writtenBytes() - before + kTaskBytes;
    if (mWaitingBytes > kMostWaitingBytes) letQueueCatchUp();
  }

  void strokeEnds() override {
    letQueueCatchUp();
    mProgress.step();
  }

  // Goes up with every context loss that emptied the layers.
  int timesEmptied() {
    int times = 0;
    for (std::optional<Layer>* layer : {&mOutline, &mStroke, &mPrediction}) {
      if (*layer) times += (*layer)->pixels().timesEmptied();
    }
    return times;
  }

  // The pixels of each, from the lowest layer to the highest.
  std::vector<std::vector<std::uint8_t>> readLayers() {
    std::vector<std::vector<std::uint8_t>> layers;
    for (std::optional<Layer>* layer : {&mOutline, &mStroke, &mPrediction}) {
      if (*layer) layers.push_back((*layer)->pixels().readPixels());
    }
    return layers;
  }

 private:
  void letQueueCatchUp() {
    mWatch.finish();
    mWaitingBytes = 0;
  }

  QueueWatch mWatch;
  Progress& mProgress;
  std::uint64_t mWaitingBytes = 0;
  std::optional<Layer> mOutline, mStroke, mPrediction;
  Canvases mCanvases;
};

}  // namespace

DrawableSet drawablesFor(const Page& page, const Options& options) {
  const auto asksForOutline = [&](const Stroke& stroke) {
    return outlineFor(stroke.brush, options).has_value();
  };
  return {.stroke = true,
          .outline = std::any_of(page.strokes.begin(), page.strokes.end(), asksForOutline),
          .preview = false,
          .prediction = options.predict > 0 && options.mode == Mode::Live};
}

float largestPenSize(const PluginLibrary& plugin, RenderQueue& queue, const Page& page,
                     const Options& options) {
  const PenSet pens(plugin, queue, page, options);
  float largest = 0.0f;
  for (const Stroke& stroke : page.strokes) {
    const PenStyle& own = pens.of(penKindFor(stroke.brush, options)).ownStyle();
    largest = std::fmax(largest, styleFor(stroke.brush, own, options).size);
  }
  return largest;
}

float largestOutlineSize(const Page& page, const Options& options) {
  float largest = 0.0f;
  for (const Stroke& stroke : page.strokes) {
    const std::optional<OutlineOptions> outline = outlineFor(stroke.brush, options);
    if (outline) largest = std::fmax(largest, outline->size);
  }
  return largest;
}

Picture drawPage(const PluginLibrary& plugin, RenderQueue& queue, const Page& page, const Options& options,
                 const PageLayout& layout, const DrawableSet& drawables, Progress& progress) {
  const PixelSize size = pixelSizeOf(layout, page, options);
  Drawing drawing(queue, size, layout, drawables, progress);
  // What was drawn before the context was lost is gone: then the page is drawn anew, by a new pen.
  constexpr int kMostTries = 8;
  std::vector<std::vector<std::uint8_t>> layers;
  int timesBefore = 0, tries = 0;
  do {
    if (++tries > kMostTries) throw std::runtime_error("the GL context is lost again and again");
    timesBefore = drawing.timesEmptied();
    {
      const PenSet pens(plugin, queue, page, options);
      PagePlayer(pens, page, options, drawing.canvases()).play(drawing);
    }
    layers = drawing.readLayers();
  } while (drawing.timesEmptied() != timesBefore);
  std::optional<std::array<std::uint8_t, 3>> background;
  if (!options.background.transparent) {
    const std::uint32_t rgb = options.background.rgb;
    background = {static_cast<std::uint8_t>(rgb >> 16), static_cast<std::uint8_t>(rgb >> 8),
                  static_cast<std::uint8_t>(rgb)};
  }
  return Picture(size.width, size.height, composeLayers(layers, background));
}

}  // namespace QeltDesktop
