#include "play/PageDrawing.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <functional>
#include <optional>
#include <span>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/Compose.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/pencommon/BatchObserver.h"
#include "output/PictureSink.h"
#include "output/StageTimes.h"
#include "output/Terminal.h"
#include "play/PagePlayer.h"
#include "play/PenSession.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

// How much of its vertices the pen may be ahead of the render thread, which is some ten times as slow. A
// single call may exceed it.
constexpr std::uint64_t kMostWaitingBytes = 4 << 20;
// Roughly what the tasks of a call take besides their vertices.
constexpr std::uint64_t kTaskBytes = 1024;
// How much of a picture is composed at once; a single row may exceed it.
constexpr std::size_t kBandBytes = 1 << 20;

// Rounded up to whole pixels, at least one; a tiny excess from rounding errors adds none.
double pixelsFor(double length) {
  return std::max(std::ceil(length - 1e-3), 1.0);
}

PixelSize pixelSizeOf(const PageLayout& layout, const Page& page, const Options& options) {
  const double width = pixelsFor(layout.width);
  const double height = pixelsFor(layout.height);
  // The page's extent, in single precision, is then beyond its range.
  if (!std::isfinite(width) || !std::isfinite(height))
    throw Refusal(page.name + ": the page is too large to draw at any zoom: its points lie too far apart");
  if (width <= kLongestSide && height <= kLongestSide && width * height <= kMostPixels) {
    return {static_cast<int>(width), static_cast<int>(height)};
  }
  std::array<char, 192> text{};
  std::snprintf(text.data(), text.size(),
                ": the picture is too large to draw: %.6g x %.6g pixels, at most %d a side and %d in all",
                width, height, kLongestSide, kMostPixels);
  if (options.fit) throw Refusal(std::string("--fit") + text.data());
  if (options.page) throw Refusal(std::string("--page") + text.data());
  if (options.command == Command::Preview) throw Refusal(std::string("--zoom") + text.data());
  throw Refusal(page.name + text.data() + "; --fit WxH draws it smaller");
}

// A layer of the picture, and the canvas through which a drawable draws the page into it.
class Layer {
 public:
  Layer(RenderQueue& queue, PixelSize size, const Qelt::Matrix3<float>& matrix,
        int tileSize = CanvasLayer::kTileSize)
      : mQueue(queue),
        mTileSize(tileSize),
        mPixels(std::in_place, queue, size.width, size.height, tileSize),
        mCanvas(&queue, &*mPixels) {
    mCanvas.setMatrix(matrix);
  }

  CanvasLayer& pixels() { return *mPixels; }
  PenCanvas* canvas() { return &mCanvas; }

  // Gives it another size, and no pixels. Nothing posted through the canvas may still wait.
  void resize(PixelSize size) {
    if (mPixels->width() == size.width && mPixels->height() == size.height) return;
    mCanvas.setLayer(nullptr);
    mPixels.reset();
    mPixels.emplace(mQueue, size.width, size.height, mTileSize);
    mCanvas.setLayer(&*mPixels);
  }

 private:
  RenderQueue& mQueue;
  const int mTileSize;
  std::optional<CanvasLayer> mPixels;
  PenCanvas mCanvas;
};

// A page on its layers. All but the last prediction, if the pen stays down after it, is gone again in the
// finished picture; so the predictions' layer, which nobody sees until then, has a single pixel.
class Drawing : public PlayObserver {
 public:
  Drawing(RenderQueue& queue, PixelSize size, const PageLayout& layout, const DrawableSet& drawables,
          Progress& progress, StageTimes& times)
      : mWatch(queue), mProgress(progress), mTimes(times), mSize(size) {
    const StageTimes::Watch watch(mTimes, Stage::GL);
    if (drawables.outline) mOutline.emplace(queue, size, layout.matrix);
    if (drawables.stroke || drawables.preview) mStroke.emplace(queue, size, layout.matrix);
    if (drawables.prediction) mPrediction.emplace(queue, kUnseen, layout.matrix, CanvasLayer::kOneTile);
    mCanvases.stroke = drawables.stroke ? mStroke->canvas() : nullptr;
    mCanvases.preview = drawables.preview ? mStroke->canvas() : nullptr;
    mCanvases.outline = mOutline ? mOutline->canvas() : nullptr;
    mCanvases.prediction = mPrediction ? mPrediction->canvas() : nullptr;
  }

  const Canvases& canvases() const { return mCanvases; }
  PixelSize size() const { return mSize; }

  void passBegins() override {
    const StageTimes::Watch watch(mTimes, Stage::GL);
    if (!std::exchange(mIsNew, false)) {
      for (Layer* const layer : pageLayers()) layer->pixels().clear();
    }
    if (mPrediction) {
      letQueueCatchUp();
      mPrediction->resize(kUnseen);
      mPredictionIsSeen = false;
    }
  }

  void call(const DrawableCall& call, const std::function<bool(Qelt::RectF*)>& make) override {
    if (call.staysInSight) {
      const StageTimes::Watch watch(mTimes, Stage::GL);
      letQueueCatchUp();
      mPrediction->resize(mSize);
      mPredictionIsSeen = true;
    }
    {
      const StageTimes::Watch watch(mTimes, Stage::Geometry);
      const std::uint64_t before = writtenBytes();
      Qelt::RectF rect;
      make(&rect);
      mWaitingBytes += writtenBytes() - before + kTaskBytes;
    }
    if (mWaitingBytes > kMostWaitingBytes) {
      const StageTimes::Watch watch(mTimes, Stage::GL);
      letQueueCatchUp();
    }
  }

  void strokeEnds() override {
    const StageTimes::Watch watch(mTimes, Stage::GL);
    letQueueCatchUp();
    mProgress.step();
  }

  // Goes up with every context loss that emptied the layers.
  int timesEmptied() { return pageLayers().front()->pixels().timesEmptied(); }

  // From the lowest to the highest, all of the page's size.
  std::vector<Layer*> pageLayers() {
    std::vector<Layer*> layers;
    for (std::optional<Layer>* layer : {&mOutline, &mStroke, &mPrediction}) {
      if (*layer && (layer != &mPrediction || mPredictionIsSeen)) layers.push_back(&**layer);
    }
    return layers;
  }

 private:
  static constexpr PixelSize kUnseen{1, 1};

  void letQueueCatchUp() {
    mWatch.finish();
    mWaitingBytes = 0;
  }

  QueueWatch mWatch;
  Progress& mProgress;
  StageTimes& mTimes;
  const PixelSize mSize;
  bool mIsNew = true;  // nothing has been drawn on the layers
  bool mPredictionIsSeen = false;
  std::uint64_t mWaitingBytes = 0;
  std::optional<Layer> mOutline, mStroke, mPrediction;
  Canvases mCanvases;
};

// Some rows of all layers.
class Band {
 public:
  void read(Drawing& drawing, int top, std::size_t bytes) {
    const std::vector<Layer*> layers = drawing.pageLayers();
    mRead.resize(layers.size());
    mViews.clear();
    for (std::size_t i = 0; i < layers.size(); ++i) {
      mRead[i].resize(bytes);
      layers[i]->pixels().readRows(top, mRead[i]);
      mViews.emplace_back(mRead[i]);
    }
  }
  // Lays them over each other, where the lowest was.
  std::span<const std::uint8_t> compose(const std::optional<std::array<std::uint8_t, 3>>& background) {
    composeLayers(mViews, background, mRead.front());
    return mRead.front();
  }

 private:
  std::vector<std::vector<std::uint8_t>> mRead;
  std::vector<std::span<const std::uint8_t>> mViews;
};

std::optional<std::array<std::uint8_t, 3>> backgroundOf(const Options& options) {
  if (options.background.transparent) return std::nullopt;
  const std::uint32_t rgb = options.background.rgb;
  return {{static_cast<std::uint8_t>(rgb >> 16), static_cast<std::uint8_t>(rgb >> 8),
           static_cast<std::uint8_t>(rgb)}};
}

// A picture that is wanted whole.
class PictureInMemory final : public PictureSink {
 public:
  void begin(int width, int height) override { mPicture.emplace(width, height, std::vector<std::uint8_t>()); }
  void takeRows(std::span<const std::uint8_t> rows) override {
    std::copy(rows.begin(), rows.end(), mPicture->rgba.begin() + static_cast<std::ptrdiff_t>(mTaken));
    mTaken += rows.size();
  }
  Picture take() { return std::move(*mPicture); }

 private:
  std::optional<Picture> mPicture;
  std::size_t mTaken = 0;
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

void PageDrawer::draw(const Page& page, const Options& options, const PageLayout& layout,
                      const DrawableSet& drawables, Progress& progress, PictureSink& sink) {
  const PixelSize size = pixelSizeOf(layout, page, options);
  Drawing drawing(mQueue, size, layout, drawables, progress, mTimes);
  // What was drawn before the context was lost is gone: then the page is drawn anew, by a new pen.
  constexpr int kMostTries = 8;
  int timesBefore = 0, tries = 0;
  const auto play = [&] {
    do {
      if (++tries > kMostTries) throw std::runtime_error("the GL context is lost again and again");
      timesBefore = drawing.timesEmptied();
      const PenSet pens(mPlugin, mQueue, page, options);
      PagePlayer(pens, page, options, drawing.canvases()).play(drawing);
      // Reading waits until all is drawn.
      const StageTimes::Watch watch(mTimes, Stage::GL);
      std::vector<std::uint8_t> row(static_cast<std::size_t>(size.width) * 4);
      drawing.pageLayers().front()->pixels().readRows(0, row);
    } while (drawing.timesEmptied() != timesBefore);
  };
  play();

  const auto background = backgroundOf(options);
  const std::size_t rowBytes = static_cast<std::size_t>(size.width) * 4;
  const int rowsAtOnce = std::max(static_cast<int>(kBandBytes / rowBytes), 1);
  Band band;
  for (int top = 0; top < size.height; top += rowsAtOnce) {
    const std::size_t bytes = rowBytes * static_cast<std::size_t>(std::min(rowsAtOnce, size.height - top));
    std::span<const std::uint8_t> rows;
    do {
      if (drawing.timesEmptied() != timesBefore) play();
      const StageTimes::Watch watch(mTimes, Stage::Compose);
      band.read(drawing, top, bytes);
      rows = band.compose(background);
    } while (drawing.timesEmptied() != timesBefore);
    const StageTimes::Watch watch(mTimes, Stage::Encode);
    if (top == 0) sink.begin(size.width, size.height);
    sink.takeRows(rows);
  }
}

Picture drawPage(const PluginLibrary& plugin, RenderQueue& queue, const Page& page, const Options& options,
                 const PageLayout& layout, const DrawableSet& drawables, Progress& progress) {
  StageTimes times;
  PictureInMemory picture;
  PageDrawer(plugin, queue, times).draw(page, options, layout, drawables, progress, picture);
  return picture.take();
}

}  // namespace QeltDesktop
