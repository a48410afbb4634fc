#include "core/PagePens.h"

#include <new>
#include <optional>

#include "base/RectF.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/pencommon/BatchObserver.h"
#include "engine/MotionEvent.h"
#include "pen/RenderingVersions.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "play/PagePlayer.h"
#include "play/PenSession.h"
#include "play/SamplePanel.h"
#include "play/StrokeFeeder.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

const Qelt::RenderingVersion& versionOf(int look) {
  return Qelt::kRenderingVersions[static_cast<std::size_t>(look - 1)];
}

// Stamps with a smoothed rim are computed for one zoom.
bool followsZoom(int look) {
  return versionOf(look).floatsPerVertex > Qelt::kRenderingVersions.front().floatsPerVertex;
}

// Makes a call and runs what it posted, whatever it throws. Throws as well when something of it was lost.
template <typename Call>
void runWith(RenderQueue& queue, const Call& call) {
  QueueWatch watch(queue);
  try {
    call();
  } catch (...) {
    queue.runPending();
    throw;
  }
  watch.finish();
}

}  // namespace

Qelt::Matrix3<float> matrixOf(const PageView& view) {
  Qelt::Matrix3<float> matrix;
  matrix[0] = matrix[4] = static_cast<float>(view.zoom);
  matrix[6] = static_cast<float>(view.x);
  matrix[7] = static_cast<float>(view.y);
  return matrix;
}

// One pen and its drawable for stored strokes.
class PagePens::Pen {
 public:
  Pen(const PluginLibrary& plugin, RenderQueue& queue, const PageStyle& style)
      : mCanvas(&queue, nullptr),
        mSession(plugin, queue, {style.look, style.smooth}),
        mStroke(mSession.pen().GetStrokeDrawableGL()) {
    if (mStroke == nullptr) throw std::bad_alloc();
  }

  void draw(const PageStroke& stroke, const PageCanvas& canvas) {
    const PageStyle& style = stroke.style();
    mSession.setStyle({style.size, style.argb});
    mCanvas.setLayer(canvas.strokes);
    mCanvas.setMatrix(matrixOf(canvas.view));
    if (mStroke->GetCanvas() == nullptr) mStroke->SetCanvas(&mCanvas);
    Qelt::RectF rect;
    mStroke->RedrawPen(static_cast<const Qelt::ObjectStroke*>(&stroke), &rect);
  }

  PenSession& session() { return mSession; }

 private:
  PenCanvas mCanvas;  // outlives the pen's drawables
  PenSession mSession;
  Qelt::PenStrokeDrawableGL* mStroke;
};

// One pen and its drawable for outlines, with what is known of the width that its next outline begins with.
class PagePens::OutlinePen {
 public:
  OutlinePen(const PluginLibrary& plugin, RenderQueue& queue, const PageStyle& style)
      : mCanvas(&queue, nullptr),
        mSession(plugin, queue, {style.look, style.smooth}),
        mOutline(mSession.pen().GetOutlineDrawableGL()) {
    if (mOutline == nullptr) throw std::bad_alloc();
  }

  // Whether this is the last outline that was drawn, from the width that it begins with on this page.
  bool hasJustDrawn(const PageStroke& stroke, std::uint64_t version) const {
    return mBefore == stroke.id() && (stroke.settlesOutline() || mVersion == version);
  }
  bool isFresh() const { return mIsFresh; }

  void draw(const PageStroke& stroke, std::uint64_t version, const PageCanvas& canvas, bool isShown) {
    mIsFresh = false;
    mBefore = 0;
    const PageStyle& style = stroke.style();
    mSession.setStyle({style.size, style.argb});
    mOutline->SetOutlineSize(style.outline->size);
    mOutline->SetOutlineColor(static_cast<int>(style.outline->argb));
    // The canvas has a layer when the drawable is given it, and prepares to draw.
    mCanvas.setLayer(canvas.outlines);
    mCanvas.setMatrix(matrixOf(canvas.view));
    if (mOutline->GetCanvas() == nullptr) mOutline->SetCanvas(&mCanvas);
    if (!isShown) mCanvas.setLayer(nullptr);
    Qelt::RectF rect;
    mOutline->DrawOutline(static_cast<const Qelt::ObjectStroke*>(&stroke), &rect);
    mBefore = stroke.id();
    mVersion = version;
  }

 private:
  PenCanvas mCanvas;  // outlives the pen's drawables
  PenSession mSession;
  Qelt::PenOutlineDrawableGL* mOutline;
  bool mIsFresh = true;
  StrokeId mBefore = 0;  // 0: not known
  std::uint64_t mVersion = 0;
};

PagePens::PagePens(const PluginLibrary& plugin, RenderQueue& queue, std::size_t mostCachedBytes)
    : mPlugin(plugin), mQueue(queue), mCache(mostCachedBytes) {}

PagePens::~PagePens() = default;

PagePens::Pen& PagePens::penFor(const PageStyle& style) {
  std::unique_ptr<Pen>& pen = mPens[style];
  if (pen == nullptr) pen = std::make_unique<Pen>(mPlugin, mQueue, style);
  return *pen;
}

std::size_t PagePens::draw(StrokeList& strokes, std::size_t index, const PageCanvas& canvas) {
  PageStroke& stroke = strokes[index];
  const std::uint64_t before = writtenBytes(), hits = mCache.hits();
  const PageStyle& style = stroke.style();
  if (style.outline && canvas.outlines != nullptr) drawOutline(strokes, index, canvas);
  // A straight stroke from the cache would have another grain than a computed one.
  if (style.smooth) {
    mCache.prepare(stroke, static_cast<float>(canvas.view.zoom), followsZoom(style.look));
  } else {
    mCache.countMiss();
  }
  drawAlone(stroke, canvas);
  const std::size_t fromCache = mCache.hits() > hits ? stroke.cachedBytes() : 0;
  mCache.note(stroke);
  return static_cast<std::size_t>(writtenBytes() - before) + fromCache;
}

void PagePens::drawAlone(PageStroke& stroke, const PageCanvas& canvas) {
  Pen& pen = penFor(stroke.style());
  const std::uint64_t before = writtenBytes();
  runWith(mQueue, [&] { pen.draw(stroke, canvas); });
  const auto floats = static_cast<std::uint64_t>(versionOf(stroke.style().look).floatsPerVertex);
  mStamps += (writtenBytes() - before) / (6 * floats * sizeof(float));
}

// The width that an outline begins with is the pen's. Where the outline below was not the last that the pen
// drew, that one is computed again, on no layer, and with it those on which its own end hangs.
void PagePens::drawOutline(StrokeList& strokes, std::size_t index, const PageCanvas& canvas) {
  std::unique_ptr<OutlinePen>& pen = mOutlinePens[strokes[index].style()];
  std::vector<std::size_t> below;
  bool fromTheFirst = true;
  for (auto next = strokes.outlineBelow(index); next; next = strokes.outlineBelow(*next)) {
    fromTheFirst = false;
    if (pen != nullptr && pen->hasJustDrawn(strokes[*next], strokes.version())) break;
    below.push_back(*next);
    if (strokes[*next].settlesOutline()) break;
    fromTheFirst = true;
  }
  if (pen == nullptr || (fromTheFirst && !pen->isFresh())) {
    pen.reset();
    pen = std::make_unique<OutlinePen>(mPlugin, mQueue, strokes[index].style());
  }
  for (auto next = below.rbegin(); next != below.rend(); ++next) {
    runWith(mQueue, [&] { pen->draw(strokes[*next], strokes.version(), canvas, false); });
  }
  runWith(mQueue, [&] { pen->draw(strokes[index], strokes.version(), canvas, true); });
}

void PagePens::forget(PageStroke& stroke) {
  mCache.forget(stroke);
}

PenLimits PagePens::limits(int look) {
  PageStyle style;
  style.look = look;
  PenSession& session = penFor(style).session();
  return {session.pen().GetMinSize(), session.pen().GetMaxSize(), session.ownStyle().size,
          session.ownStyle().argb};
}

void PagePens::drawPreview(const PageStyle& style, CanvasLayer& layer, const PageView& view) {
  PenCanvas canvas(&mQueue, &layer);
  canvas.setMatrix(matrixOf(view));
  PenSession session(mPlugin, mQueue, {style.look, style.smooth});
  session.setStyle({style.size, style.argb});
  Qelt::PenPreviewDrawableGL* const preview = session.pen().GetPreviewDrawableGL();
  if (preview == nullptr) throw std::bad_alloc();
  preview->SetCanvas(&canvas);
  const Page page = samplePanel();
  const Stroke stroke = page.strokes.front();
  const Qelt::MotionEvent event = recordedEvent(stroke, pointerFor(stroke, std::nullopt, std::nullopt));
  runWith(mQueue, [&] {
    Qelt::RectF rect;
    preview->RedrawPen(&event, &rect);
  });
}

}  // namespace QeltDesktop
