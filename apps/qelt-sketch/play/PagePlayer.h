#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <vector>

#include "base/RectF.h"
#include "desktop/gl/GlVertexObject.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/model/StoredStroke.h"
#include "ink/Ink.h"
#include "play/Options.h"
#include "play/PenSession.h"
#include "play/StrokeFeeder.h"

namespace Qelt {
class IPenPredictionDrawableGL;
class ISPPenCanvas;
class PenOutlineDrawableGL;
class PenPreviewDrawableGL;
class PenStrokeDrawableGL;
}  // namespace Qelt

namespace QeltDesktop {

// One call of a drawable, about to be made.
struct DrawableCall {
  DrawableKind drawable;
  std::size_t stroke;  // index in the page
  int renderingVersion;
  const char* operation;
  std::optional<int> action;  // of the event; none when a stored stroke is drawn
  bool staysInSight = false;  // of a prediction: none follows it, nor does the pen go up
};

// Watches a page being played. Main thread.
class PlayObserver {
 public:
  virtual ~PlayObserver() = default;
  // The page is about to be played, for the first time or again.
  virtual void passBegins() {}
  // Makes the call by calling `make` once, with a rectangle of zeros.
  virtual void call(const DrawableCall& call, const std::function<bool(Qelt::RectF*)>& make) = 0;
  virtual void strokeEnds() {}
};

// Waits for a render queue on behalf of an output that must be complete. Main thread. The queue outlives it.
class QueueWatch {
 public:
  explicit QueueWatch(RenderQueue& queue) : mQueue(queue) {}

  // Waits until everything posted so far has run. Throws when something was lost since the watch began:
  // std::bad_alloc when there was no memory to draw a batch of vertices, std::runtime_error when a task
  // failed, with whatever it was to draw.
  void finish();

 private:
  RenderQueue& mQueue;
  const std::uint64_t mUndrawnBefore = GlVertexObject::undrawnBatches();
  const std::uint64_t mDroppedBefore = mQueue.droppedTasks();
};

// The canvas that each drawable draws into. Drawables without a canvas are not played.
struct Canvases {
  Qelt::ISPPenCanvas* stroke = nullptr;
  Qelt::ISPPenCanvas* outline = nullptr;
  Qelt::ISPPenCanvas* preview = nullptr;
  Qelt::ISPPenCanvas* prediction = nullptr;
};

// Plays a page to a pen as the options say: every stroke as live events, as one recorded event or as a stored
// stroke, as often as asked. Main thread. Pens, page, options and canvases outlive it.
class PagePlayer {
 public:
  // Throws Refusal when a pen has no drawable for one of the canvases.
  PagePlayer(const PenSet& pens, const Page& page, const Options& options, const Canvases& canvases);
  // Drops the cached drawings of the stored strokes.
  ~PagePlayer();
  PagePlayer(const PagePlayer&) = delete;
  PagePlayer& operator=(const PagePlayer&) = delete;

  // Throws Refusal, naming the stroke, when there is not enough memory to draw it.
  void play(PlayObserver& observer);

 private:
  void playStroke(std::size_t index, PlayObserver& observer);
  void playLive(std::size_t index, PlayObserver& observer);
  void playRecorded(std::size_t index, PlayObserver& observer);
  void playStored(std::size_t index, PlayObserver& observer);
  void boundCache(std::size_t index);
  void predict(std::size_t index, std::size_t sample, bool staysInSight, PlayObserver& observer);
  Pointer pointerOf(std::size_t index) const;
  bool outlinesNow(std::size_t index);
  DrawableCall call(DrawableKind drawable, std::size_t index, const char* operation,
                    std::optional<int> action) const;

  // A pen, and its drawables for the canvases that there are.
  struct Drawables {
    int renderingVersion;
    PenSession* session;
    Qelt::PenStrokeDrawableGL* stroke;
    Qelt::PenOutlineDrawableGL* outline;
    Qelt::PenPreviewDrawableGL* preview;
    Qelt::IPenPredictionDrawableGL* prediction;
    OutlineOptions ownOutline;
    std::optional<OutlineOptions> outlineNow;  // none: the pen's own
  };

  const Page& mPage;
  const Options& mOptions;
  std::map<PenKind, Drawables> mDrawables;
  Drawables* mNow = nullptr;                                  // those of the stroke that is being played
  std::vector<std::unique_ptr<StoredStroke>> mStoredStrokes;  // one per stroke, in stroke mode; else empty
  std::vector<std::size_t> mCachedBytesOf;                    // of each stored stroke
  std::size_t mCachedBytes = 0;
};

}  // namespace QeltDesktop
