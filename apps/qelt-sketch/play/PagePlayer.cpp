#include "play/PagePlayer.h"

#include <new>
#include <stdexcept>
#include <string>

#include "engine/MotionEvent.h"
#include "pencommon/Pen.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenStrokeDataManager.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

// What the cached drawings of a page may take together. A trace tells which calls took theirs from the cache;
// a picture is the same either way, and what is drawn once needs none.
std::size_t mostCachedBytes(const Options& options) {
  constexpr std::size_t kTraced = std::size_t{256} << 20, kDrawn = std::size_t{4} << 20;
  if (options.command == Command::Trace) return kTraced;
  return options.repeat > 1 ? kDrawn : 0;
}

// The pen's drawable of one kind, set to draw into the canvas; null when there is no canvas.
template <typename Drawable>
Drawable* drawableOn(Qelt::ISPPenCanvas* canvas, Qelt::Pen& pen, Drawable* (Qelt::Pen::*getter)(),
                     DrawableKind kind) {
  if (canvas == nullptr) return nullptr;
  Drawable* const drawable = (pen.*getter)();
  if (drawable == nullptr) {
    throw Refusal("the pen has no " + std::string(nameOf(kind)) + " drawable in rendering version " +
                  std::to_string(pen.getVersion()));
  }
  drawable->SetCanvas(canvas);
  return drawable;
}

}  // namespace

void QueueWatch::finish() {
  mQueue.finish();
  if (GlVertexObject::undrawnBatches() != mUndrawnBefore) throw std::bad_alloc();
  if (mQueue.droppedTasks() != mDroppedBefore) throw std::runtime_error("a render task failed (see --log)");
}

PagePlayer::PagePlayer(const PenSet& pens, const Page& page, const Options& options, const Canvases& canvases)
    : mPage(page), mOptions(options) {
  using Qelt::Pen;
  for (const auto& [kind, session] : pens.sessions()) {
    Pen& pen = session->pen();
    Drawables drawables{
        .renderingVersion = kind.renderingVersion,
        .session = session.get(),
        .stroke = drawableOn(canvases.stroke, pen, &Pen::GetStrokeDrawableGL, DrawableKind::Stroke),
        .outline = drawableOn(canvases.outline, pen, &Pen::GetOutlineDrawableGL, DrawableKind::Outline),
        .preview = drawableOn(canvases.preview, pen, &Pen::GetPreviewDrawableGL, DrawableKind::Preview),
        .prediction = drawableOn(canvases.prediction, pen, &Pen::GetPredictionStrokeDrawableGL,
                                 DrawableKind::Prediction),
        .ownOutline = {},
        .outlineNow = {}};
    if (drawables.outline != nullptr) {
      drawables.ownOutline = {drawables.outline->GetOutlineSize(),
                              static_cast<std::uint32_t>(drawables.outline->GetOutlineColor())};
    }
    if (drawables.prediction != nullptr) drawables.prediction->SetOpacity(options.opacity);
    mDrawables.emplace(kind, drawables);
  }
  if (options.mode == Mode::Stroke) {
    for (std::size_t i = 0; i < page.strokes.size(); ++i) {
      mStoredStrokes.push_back(storedStroke(page.strokes[i], pointerOf(i)));
      mCachedBytesOf.push_back(0);
      Qelt::PenStrokeDataManager::GetInstance()->CreateStrokeData(mStoredStrokes.back()->GetRuntimeHandle());
    }
  }
}

PagePlayer::~PagePlayer() {
  for (const auto& stroke : mStoredStrokes) {
    Qelt::PenStrokeDataManager::GetInstance()->DropStrokeData(stroke->GetRuntimeHandle());
  }
}

void PagePlayer::play(PlayObserver& observer) {
  for (int pass = 0; pass < mOptions.repeat; ++pass) {
    observer.passBegins();
    for (std::size_t i = 0; i < mPage.strokes.size(); ++i) {
      try {
        playStroke(i, observer);
        observer.strokeEnds();
      } catch (const std::bad_alloc&) {
        throw Refusal(mPage.name + ": trace " + std::to_string(i + 1) + ": out of memory while drawing it");
      }
    }
  }
}

void PagePlayer::playStroke(std::size_t index, PlayObserver& observer) {
  const Brush brush = mPage.strokes[index].brush;
  mNow = &mDrawables.at(penKindFor(brush, mOptions));
  mNow->session->setStyle(styleFor(brush, mNow->session->ownStyle(), mOptions));
  if (mOptions.mode == Mode::Stroke) {
    playStored(index, observer);
    return;
  }
  if (mOptions.mode == Mode::Live) playLive(index, observer);
  playRecorded(index, observer);
}

void PagePlayer::playLive(std::size_t index, PlayObserver& observer) {
  const bool penStaysDown = mOptions.points.has_value() && index + 1 == mPage.strokes.size();
  feedLive(mPage.strokes[index], pointerOf(index), mOptions.samplesPerMove, penStaysDown,
           [&](LiveEvent& live) {
             const Qelt::MotionEvent& event = live.event;
             const int action = event.GetAction();
             if (mNow->stroke != nullptr) {
               observer.call(call(DrawableKind::Stroke, index, "Draw", action),
                             [&](Qelt::RectF* rect) { return mNow->stroke->Draw(&event, rect); });
             }
             if (mNow->preview != nullptr) {
               observer.call(call(DrawableKind::Preview, index, "Draw", action),
                             [&](Qelt::RectF* rect) { return mNow->preview->Draw(&event, rect); });
             }
             if (mNow->prediction != nullptr && action == Qelt::kActionMove) {
               const bool isLast = live.sample + 1 == mPage.strokes[index].samples.size();
               predict(index, live.sample, penStaysDown && isLast, observer);
             }
           });
}

void PagePlayer::predict(std::size_t index, std::size_t sample, bool staysInSight, PlayObserver& observer) {
  const Samples samples = mPage.strokes[index].samples;
  const Qelt::MotionEvent event =
      predictedEvent(samples[sample - 1], samples[sample], pointerOf(index), mOptions.predict);
  DrawableCall prediction = call(DrawableKind::Prediction, index, "Draw", event.GetAction());
  prediction.staysInSight = staysInSight;
  observer.call(prediction, [&](Qelt::RectF* rect) { return mNow->prediction->Draw(&event, rect); });
}

// The stroke as one recorded event. In live mode that is the outline's alone, as it has no live input.
void PagePlayer::playRecorded(std::size_t index, PlayObserver& observer) {
  const bool live = mOptions.mode == Mode::Live;
  const bool outlines = outlinesNow(index);
  if (live && !outlines) return;
  const Stroke stroke = mPage.strokes[index];
  const auto play = [&](DrawableKind drawable, const char* operation, const auto& draw) {
    // The pen corrects the event that it is given, so every drawable gets its own copy.
    Qelt::MotionEvent event = recordedEvent(stroke, pointerOf(index));
    observer.call(call(drawable, index, operation, event.GetAction()),
                  [&](Qelt::RectF* rect) { return draw(&event, rect); });
  };
  using Event = const Qelt::MotionEvent*;
  if (outlines) {
    play(DrawableKind::Outline, "DrawOutline",
         [&](Event event, Qelt::RectF* rect) { return mNow->outline->DrawOutline(event, rect); });
  }
  if (live) return;
  if (mNow->stroke != nullptr) {
    play(DrawableKind::Stroke, "RedrawPen",
         [&](Event event, Qelt::RectF* rect) { return mNow->stroke->RedrawPen(event, rect); });
  }
  if (mNow->preview != nullptr) {
    play(DrawableKind::Preview, "RedrawPen",
         [&](Event event, Qelt::RectF* rect) { return mNow->preview->RedrawPen(event, rect); });
  }
}

void PagePlayer::playStored(std::size_t index, PlayObserver& observer) {
  const Qelt::ObjectStroke* const stroke = mStoredStrokes[index].get();
  if (outlinesNow(index)) {
    observer.call(call(DrawableKind::Outline, index, "DrawOutline", std::nullopt),
                  [&](Qelt::RectF* rect) { return mNow->outline->DrawOutline(stroke, rect); });
  }
  if (mNow->stroke != nullptr) {
    observer.call(call(DrawableKind::Stroke, index, "RedrawPen", std::nullopt), [&](Qelt::RectF* rect) {
      const bool drawn = mNow->stroke->RedrawPen(stroke, rect);
      // Before the observer waits for the render thread, which takes as much memory again.
      boundCache(index);
      return drawn;
    });
  }
}

// Drops the stroke's cached drawing when those of the page take too much; each pass then computes it anew.
void PagePlayer::boundCache(std::size_t index) {
  const int handle = mStoredStrokes[index]->GetRuntimeHandle();
  auto* const manager = Qelt::PenStrokeDataManager::GetInstance();
  Qelt::PenStrokeData* const data = manager->GetStrokeData(handle);
  if (data == nullptr) return;
  std::size_t bytes = 0;
  if (Qelt::PenStrokePointData* const points = data->GetPointData(); points != nullptr) {
    bytes = points->mBuffer->size() * sizeof(float);
    points->Unref();
  }
  mCachedBytes += bytes - mCachedBytesOf[index];
  mCachedBytesOf[index] = bytes;
  if (mCachedBytes > mostCachedBytes(mOptions)) {
    data->SetPointData(nullptr);
    mCachedBytes -= bytes;
    mCachedBytesOf[index] = 0;
  }
  manager->ReleaseStrokeData(handle);
}

// Whether the stroke has an outline now, which is then set to its size and colour. Where outlines alone are
// asked for, every stroke has one: without settings, the pen's own.
bool PagePlayer::outlinesNow(std::size_t index) {
  if (mNow->outline == nullptr) return false;
  const std::optional<OutlineOptions> asked = outlineFor(mPage.strokes[index].brush, mOptions);
  if (!asked && mOptions.drawable != DrawableKind::Outline) return false;
  if (asked == mNow->outlineNow) return true;
  mNow->outlineNow = asked;
  const OutlineOptions outline = asked.value_or(mNow->ownOutline);
  mNow->outline->SetOutlineSize(outline.size);
  mNow->outline->SetOutlineColor(static_cast<int>(outline.argb));
  return true;
}

DrawableCall PagePlayer::call(DrawableKind drawable, std::size_t index, const char* operation,
                              std::optional<int> action) const {
  return {drawable, index, mNow->renderingVersion, operation, action};
}

Pointer PagePlayer::pointerOf(std::size_t index) const {
  return pointerFor(mPage.strokes[index], mOptions.tool, mOptions.source);
}

}  // namespace QeltDesktop
