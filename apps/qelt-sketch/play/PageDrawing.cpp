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
#include "output/PackedRows.h"
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

// The layers that a picture consists of, the lowest first.
std::vector<DrawableKind> layersOf(const DrawableSet& drawables, const Options& options) {
  std::vector<DrawableKind> layers;
  if (drawables.outline) layers.push_back(DrawableKind::Outline);
  if (drawables.stroke) layers.push_back(DrawableKind::Stroke);
  if (drawables.preview) layers.push_back(DrawableKind::Preview);
  // Predictions are gone again when the pen goes up.
  if (drawables.prediction && options.points) layers.push_back(DrawableKind::Prediction);
  // A picture of predictions alone, or of nothing, is bare.
  if (layers.empty()) layers.push_back(DrawableKind::Stroke);
  return layers;
}

// A page being drawn, one layer after the other, in the same pixels.
class Drawing : public PlayObserver {
 public:
  // What is given outlives it.
  Drawing(const PluginLibrary& plugin, RenderQueue& queue, const Page& page, const Options& options,
          const PageLayout& layout, const DrawableSet& drawables, Progress& progress, StageTimes& times)
      : mPlugin(plugin),
        mQueue(queue),
        mPage(page),
        mOptions(options),
        mDrawables(drawables),
        mProgress(progress),
        mTimes(times),
        mSize(pixelSizeOf(layout, page, options)),
        mLayers(layersOf(drawables, options)),
        mWatch(queue),
        mCanvas(&queue, nullptr),
        mUnseenCanvas(&queue, nullptr) {
    const StageTimes::Watch watch(mTimes, Stage::GL);
    mPixels.emplace(queue, mSize.width, mSize.height);
    mCanvas.setMatrix(layout.matrix);
    mUnseenCanvas.setMatrix(layout.matrix);
  }

  PixelSize size() const { return mSize; }
  // The lowest first.
  const std::vector<DrawableKind>& layers() const { return mLayers; }

  // Draws one of the layers, then reads it back in bands, which are the same for each layer, from the top on.
  // Where the context is lost, which empties the layer, it is drawn anew, by new pens.
  void draw(DrawableKind layer, const std::function<void(std::span<std::uint8_t> band)>& take) {
    mLayer = layer;
    mTries = 0;
    // Predictions reach over the edges of tiles.
    mPixels->setTileSize(isPrediction() ? CanvasLayer::kOneTile : CanvasLayer::kTileSize);
    play();
    const int rowsAtOnce = std::max(static_cast<int>(kBandBytes / rowBytes()), 1);
    std::vector<std::uint8_t> band;
    for (int top = 0; top < mSize.height; top += rowsAtOnce) {
      band.resize(rowBytes() * static_cast<std::size_t>(std::min(rowsAtOnce, mSize.height - top)));
      do {
        if (wasEmptied()) play();
        const StageTimes::Watch watch(mTimes, Stage::Compose);
        mPixels->readRows(top, band);
      } while (wasEmptied());
      take(band);
    }
  }

 private:
  // Whatever the layer, every drawable is called, since pens keep what one call leaves for the next; on a
  // canvas without a layer they draw nothing.
  void play() {
    constexpr int kMostTries = 8;
    const auto canvasFor = [this](bool takesPart, DrawableKind drawable) -> PenCanvas* {
      if (!takesPart) return nullptr;
      return drawable == mLayer ? &mCanvas : &mUnseenCanvas;
    };
    const Canvases canvases{.stroke = canvasFor(mDrawables.stroke, DrawableKind::Stroke),
                            .outline = canvasFor(mDrawables.outline, DrawableKind::Outline),
                            .preview = canvasFor(mDrawables.preview, DrawableKind::Preview),
                            .prediction = canvasFor(mDrawables.prediction, DrawableKind::Prediction)};
    do {
      if (++mTries > kMostTries) throw std::runtime_error("the GL context is lost again and again");
      mTimesEmptied = mPixels->timesEmptied();
      // The drawable gets ready for a layer when it is given its canvas.
      showDrawable(true);
      const PenSet pens(mPlugin, mQueue, mPage, mOptions);
      PagePlayer(pens, mPage, mOptions, canvases).play(*this);
      // Reading waits until all is drawn.
      const StageTimes::Watch watch(mTimes, Stage::GL);
      std::vector<std::uint8_t> row(rowBytes());
      mPixels->readRows(0, row);
    } while (wasEmptied());
  }

  void passBegins() override {
    const StageTimes::Watch watch(mTimes, Stage::GL);
    if (!std::exchange(mIsNew, false)) mPixels->clear();
    // All but the last prediction, if the pen stays down after it, is gone again in the finished picture.
    if (isPrediction()) showDrawable(false);
  }

  void call(const DrawableCall& call, const std::function<bool(Qelt::RectF*)>& make) override {
    if (call.staysInSight && isPrediction()) {
      const StageTimes::Watch watch(mTimes, Stage::GL);
      showDrawable(true);
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

  // Each layer has all strokes, and together they count once.
  void strokeEnds() override {
    const StageTimes::Watch watch(mTimes, Stage::GL);
    letQueueCatchUp();
    if (++mStrokesEnded % mLayers.size() == 0) mProgress.step();
  }

  void showDrawable(bool shown) {
    letQueueCatchUp();
    mCanvas.setLayer(shown ? &*mPixels : nullptr);
  }

  void letQueueCatchUp() {
    mWatch.finish();
    mWaitingBytes = 0;
  }

  bool isPrediction() const { return mLayer == DrawableKind::Prediction; }
  bool wasEmptied() const { return mPixels->timesEmptied() != mTimesEmptied; }
  std::size_t rowBytes() const { return static_cast<std::size_t>(mSize.width) * 4; }

  const PluginLibrary& mPlugin;
  RenderQueue& mQueue;
  const Page& mPage;
  const Options& mOptions;
  const DrawableSet& mDrawables;
  Progress& mProgress;
  StageTimes& mTimes;
  const PixelSize mSize;
  const std::vector<DrawableKind> mLayers;
  DrawableKind mLayer = DrawableKind::Stroke;
  QueueWatch mWatch;
  std::optional<CanvasLayer> mPixels;
  PenCanvas mCanvas;        // of the layer's drawable
  PenCanvas mUnseenCanvas;  // of all others
  bool mIsNew = true;       // nothing has been drawn on the pixels
  int mTries = 0;           // of the layer
  int mTimesEmptied = 0;    // when the layer was begun
  std::uint64_t mWaitingBytes = 0;
  std::size_t mStrokesEnded = 0;
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
  Drawing drawing(mPlugin, mQueue, page, options, layout, drawables, progress, mTimes);
  const std::vector<DrawableKind>& layers = drawing.layers();
  std::vector<std::vector<PackedRows>> below(layers.size() - 1);  // of each layer but the highest, its bands
  for (std::size_t i = 0; i < below.size(); ++i) {
    drawing.draw(layers[i], [&](std::span<const std::uint8_t> band) {
      const StageTimes::Watch watch(mTimes, Stage::Compose);
      below[i].emplace_back(band);
    });
  }

  const auto background = backgroundOf(options);
  std::vector<std::vector<std::uint8_t>> unpacked(below.size());
  std::size_t number = 0;
  drawing.draw(layers.back(), [&](std::span<std::uint8_t> band) {
    {
      const StageTimes::Watch watch(mTimes, Stage::Compose);
      std::vector<std::span<const std::uint8_t>> views;
      for (std::size_t i = 0; i < below.size(); ++i) {
        unpacked[i].resize(band.size());
        below[i][number].unpack(unpacked[i]);
        views.emplace_back(unpacked[i]);
      }
      views.emplace_back(band);
      composeLayers(views, background, band);
    }
    const StageTimes::Watch watch(mTimes, Stage::Encode);
    if (number++ == 0) sink.begin(drawing.size().width, drawing.size().height);
    sink.takeRows(band);
  });
}

Picture drawPage(const PluginLibrary& plugin, RenderQueue& queue, const Page& page, const Options& options,
                 const PageLayout& layout, const DrawableSet& drawables, Progress& progress) {
  StageTimes times;
  PictureInMemory picture;
  PageDrawer(plugin, queue, times).draw(page, options, layout, drawables, progress, picture);
  return picture.take();
}

}  // namespace QeltDesktop
