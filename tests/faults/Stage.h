#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
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
#include "support/LiveStroke.h"
#include "support/StageCanvas.h"

namespace QeltTests {

// What a pen made of the same input: compared between a pen that went through a fault and a fresh one.
struct Drawn {
  std::vector<std::vector<float>> steps;    // each call's answer and the edges of its rectangle
  std::vector<std::vector<float>> batches;  // as they reached the render drawables
  std::vector<bool> cached;                 // of each, whether it came from the cache
  std::vector<std::uint8_t> pixels;         // only where there is a layer
};

// The first difference, for people; empty where there is none.
std::string difference(const Drawn& drawn, const Drawn& expected);

// A host's end of one pen: queue, canvas, data manager, page; and the things that a host does with them. None
// of it minds that the pen or a drawable could not be made. Main thread.
class Stage {
 public:
  // Without a layer the canvas is one without GL, see StageCanvas.
  Stage(QeltDesktop::RenderQueue& queue, QeltDesktop::CanvasLayer* layer, int version);
  ~Stage();
  Stage(const Stage&) = delete;
  Stage& operator=(const Stage&) = delete;

  static const QeltDesktop::PluginLibrary& library();
  // Called before every call that hands over a batch.
  static inline std::function<void(Stage&, Qelt::PenDrawableGL&)> beforeCall;
  // From here on every batch is looked at; answers what was wrong with any since the last call, if anything.
  static std::string watchBatches();
  static void watchNoBatches();

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
  // One of each kind of drawing, smooth and straight.
  void everyKind();
  // One batch of each render drawable, and one from the cache.
  void oneOfEach();
  // Draws the last stroke of another's page in this view, as the other pen would: as it comes, and as it
  // comes without the cache. Answers whether these are alike.
  bool redrawsLastOf(Stage& other);
  // Takes all stored strokes away, whatever the render thread still does with their drawings.
  void turnPage();
  void zoom(float factor);
  void loseAndRestoreContext();
  // Puts pen, drawable and view back to what a stage begins with.
  void setUsual(Qelt::PenDrawableGL& drawable);
  Qelt::ISPPenCanvas* canvas(Target target) { return &mCanvases[static_cast<std::size_t>(target)]; }

  // Draws one of everything, in a state that every stroke begins in, and tells what came of it. Pictures take
  // time: for one it is less.
  Drawn drawEverything(float zoomFactor = 1.0f);

  // Has the render thread keep up.
  void finish();

  // How many calls let a std::bad_alloc out: calls that may.
  int refusedBatches() const { return mRefusedBatches; }

 private:
  // Runs a call that hands over a batch: it may run out of memory while the batch grows.
  template <typename Call>
  void drawing(Qelt::PenDrawableGL& drawable, Call&& call);
  // Runs a call of the host's own, which may run out of memory.
  template <typename Call>
  void hostCall(Call&& call);
  void setUsualPen();
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
  void redrawTwice(Drawable& drawable, const Input& input);

  const int mVersion;
  QeltDesktop::RenderQueue& mQueue;
  QeltDesktop::CanvasLayer* mLayer;
  StageCanvas mCanvases[4];  // by their Target
  QeltDesktop::PenDataManager mData;
  std::unique_ptr<Qelt::Pen> mPen;
  std::vector<std::unique_ptr<QeltDesktop::StoredStroke>> mPage;
  int mRefusedBatches = 0;
  Drawn* mRecord = nullptr;  // where steps are noted, if anywhere
};

}  // namespace QeltTests
