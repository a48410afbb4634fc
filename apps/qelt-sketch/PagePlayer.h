#pragma once

#include <cstddef>
#include <functional>
#include <memory>
#include <optional>
#include <vector>

#include "Ink.h"
#include "Options.h"
#include "PenSession.h"
#include "StrokeFeeder.h"
#include "base/RectF.h"
#include "desktop/model/StoredStroke.h"

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
  std::size_t stroke;  // from 0 over the page's traces
  const char* operation;
  std::optional<int> action;  // of the event, when the call has one
};

// Who watches a page being played. Main thread.
class PlayObserver {
 public:
  virtual ~PlayObserver() = default;
  // The page is about to be played (again).
  virtual void passBegins() {}
  // What was predicted no longer holds.
  virtual void predictionEnds() {}
  // Makes the call, with a rectangle of zeros.
  virtual void call(const DrawableCall& call, const std::function<bool(Qelt::RectF*)>& make) = 0;
  virtual void strokeEnds() {}
};

// The drawables to play, by the canvas each draws into; null leaves one out.
struct Canvases {
  Qelt::ISPPenCanvas* stroke = nullptr;
  Qelt::ISPPenCanvas* outline = nullptr;
  Qelt::ISPPenCanvas* preview = nullptr;
  Qelt::ISPPenCanvas* prediction = nullptr;
};

// Plays a page to a pen as the options say: every trace as live events, as a recorded event or as a stored
// stroke, as often as asked. Main thread. Session, page, options and canvases outlive it.
class PagePlayer {
 public:
  // Throws Refusal when the pen has no drawable of a kind that is wanted.
  PagePlayer(PenSession& session, const Page& page, const Options& options, const Canvases& canvases);
  // Drops the stored strokes' cache entries.
  ~PagePlayer();
  PagePlayer(const PagePlayer&) = delete;
  PagePlayer& operator=(const PagePlayer&) = delete;

  // Throws Refusal, with the number of the trace, when there is no memory to draw one.
  void play(PlayObserver& observer);

 private:
  void playTrace(std::size_t index, PlayObserver& observer);
  void playLive(std::size_t index, PlayObserver& observer);
  void playRecorded(std::size_t index, PlayObserver& observer);
  void playStored(std::size_t index, PlayObserver& observer);
  void boundCache(std::size_t index);
  void predict(std::size_t index, std::size_t sample, PlayObserver& observer);
  Pointer pointerOf(std::size_t index) const;

  PenSession& mSession;
  const Page& mPage;
  const Options& mOptions;
  Qelt::PenStrokeDrawableGL* mStroke = nullptr;
  Qelt::PenOutlineDrawableGL* mOutline = nullptr;
  Qelt::PenPreviewDrawableGL* mPreview = nullptr;
  Qelt::IPenPredictionDrawableGL* mPrediction = nullptr;
  std::vector<std::unique_ptr<StoredStroke>> mStoredStrokes;  // one a trace, in stroke mode
  std::vector<std::size_t> mCachedBytesOf;                    // of each of them
  std::size_t mCachedBytes = 0;
};

}  // namespace QeltDesktop
