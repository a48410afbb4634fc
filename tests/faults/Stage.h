#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/model/StoredStroke.h"
#include "desktop/pencommon/PenDataManager.h"
#include "engine/MotionEvent.h"
#include "pencommon/Pen.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "support/BlindCanvas.h"
#include "support/LiveStroke.h"

namespace QeltTests {

// What a pen made of the same input: compared between a pen that went through a fault and a fresh one.
struct Drawn {
  std::vector<std::vector<float>> steps;    // each call's answer and the edges of its rectangle
  std::vector<std::vector<float>> batches;  // as they reached the render drawables
  std::vector<std::uint8_t> pixels;         // only where there is a layer
};

// The first difference, for people; empty where there is none.
std::string difference(const Drawn& drawn, const Drawn& expected);

// A host's end of one pen: queue, canvas, data manager, page; and the things that a host does with them. None
// of it minds that the pen or a drawable could not be made. Main thread. One at a time.
class Stage {
 public:
  // Without a layer the canvas has one tile without GL, enough for render messages to run through their
  // batch.
  Stage(QeltDesktop::RenderQueue& queue, QeltDesktop::CanvasLayer* layer, int version);
  ~Stage();
  Stage(const Stage&) = delete;
  Stage& operator=(const Stage&) = delete;

  static const QeltDesktop::PluginLibrary& library();

  void makePen();
  void deletePen();
  Qelt::Pen* pen() { return mPen.get(); }

  // A stroke, live: `finishes` has the render thread keep up, otherwise all of it stays queued.
  void live(bool finishes = true);
  // Part of one, the pen still down.
  void beginLive();
  // A live stroke, an outline and a preview, not smoothed.
  void straight();
  // Stored strokes and recorded events, smooth and straight, from the cache and not.
  void redraw(bool finishes = true);
  // Two outlines each of a stored stroke and of a recorded one.
  void outline(bool finishes = true);
  void preview(bool finishes = true);
  // A prediction from the middle of a live stroke.
  void predict(bool finishes = true);
  // Every drawable there is, on the canvas, nothing drawn.
  void prepareAll();
  // Takes all stored strokes away, whatever the render thread still does with their drawings.
  void turnPage();
  void zoom(float factor);
  void loseAndRestoreContext();

  // Draws one of everything, in a state that every stroke begins in, and tells what came of it.
  Drawn drawEverything();

  // How many calls let a std::bad_alloc out: calls that may.
  int refusedBatches() const { return mRefusedBatches; }

 private:
  // Runs a call that hands over a batch: it may run out of memory while the batch grows.
  template <typename Call>
  void drawing(Call&& call);
  // A drawable of the pen's on the canvas; null where there is no pen or it could not make one.
  template <typename Drawable>
  Drawable* onCanvas(Drawable* (Qelt::Pen::*getter)());
  Qelt::PenStrokeDrawableGL* strokeDrawable();
  // One event of some of the samples.
  template <typename Drawable>
  void send(Drawable* drawable, int action, const std::vector<Sample>& from, std::size_t begin,
            std::size_t end, bool finishes);
  QeltDesktop::StoredStroke& newStroke();
  void drawStroke(Qelt::PenStrokeDrawableGL* drawable, bool finishes, bool ends);
  template <typename Drawable, typename Input>
  void redrawTwice(Drawable* drawable, const Input& input);

  const int mVersion;
  QeltDesktop::RenderQueue& mQueue;
  QeltDesktop::CanvasLayer* mLayer;
  BlindCanvas mCanvas;
  QeltDesktop::PenDataManager mData;
  std::unique_ptr<Qelt::Pen> mPen;
  std::vector<std::unique_ptr<QeltDesktop::StoredStroke>> mPage;
  int mRefusedBatches = 0;
  Drawn* mRecord = nullptr;  // where steps are noted, if anywhere
};

}  // namespace QeltTests
