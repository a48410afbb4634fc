#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <typeinfo>
#include <vector>

#include "FuzzInput.h"
#include "base/RectF.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/pencommon/BatchObserver.h"
#include "desktop/pencommon/PenDataManager.h"
#include "engine/MotionEvent.h"
#include "model/ObjectStroke.h"
#include "pencommon/Pen.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "support/FaultyCanvas.h"

namespace QeltTests {

// A host that does what its input says, in any order: two pens, three canvases whose views differ and whose
// layers come and go, a few stored strokes, one queue that may refuse, calls that fail, a context that is
// lost for a while. It keeps to what a host owes a pen, and to nothing more: what it lends outlives its use.
// Aborts the process where a pen breaks its word. One at a time; the caller's thread is main and render
// thread.
class PenWorld {
 public:
  // A queue with GL has a layer to draw into and may lose its context.
  PenWorld(const QeltDesktop::PluginLibrary& library, QeltDesktop::RenderQueue& queue,
           QeltDesktop::CanvasLayer* layer);
  ~PenWorld();
  PenWorld(const PenWorld&) = delete;
  PenWorld& operator=(const PenWorld&) = delete;

  // Plays the input to its end; answers a number that depends on every batch, rectangle and answer.
  std::uint64_t play(FuzzInput input);

 private:
  class Stroke;

  void step(FuzzInput& input);
  void change(FuzzInput& input, Qelt::Pen& pen);
  void ask(FuzzInput& input, Qelt::Pen& pen);
  void draw(FuzzInput& input, Qelt::Pen& pen, int which);
  void changeView(FuzzInput& input);
  void changeQueue(FuzzInput& input);

  Qelt::ISPPenCanvas* pickCanvas(FuzzInput& input);
  // The drawable, which must be there, on a canvas more often than not.
  template <typename Drawable>
  Drawable* onCanvas(FuzzInput& input, Drawable* drawable);
  float coordinate(FuzzInput& input);
  Qelt::MotionEvent event(FuzzInput& input, int mostHistory);
  Stroke& stroke(FuzzInput& input);
  bool mayDraw(const Qelt::Pen& pen);
  void keepCacheFitting(const Stroke& stroke, const Qelt::PenStrokeDrawableGL& drawable);
  void note(bool answer, const Qelt::RectF& rect);
  void note(const QeltDesktop::Batch& batch);
  void mix(const void* bytes, std::size_t count);

  const QeltDesktop::PluginLibrary& mLibrary;
  QeltDesktop::RenderQueue& mQueue;
  FaultyCanvas mCanvas, mOther;
  QeltDesktop::PenCanvas mBlank;  // has no layer at all
  QeltDesktop::PenDataManager mData, mQueueless;
  std::unique_ptr<Qelt::Pen> mPens[2];
  float mSizes[2] = {};
  std::vector<std::unique_ptr<Stroke>> mStrokes;
  std::map<int, const std::type_info*> mDrawnBy;  // of what handles stand for, the drawable
  std::uint32_t mRefusals = 0;                    // one bit a post, the lowest next
  int mFarPoints = 0;                             // still allowed
  int mHeavyCalls = 0;      // still allowed, of pens that place a great many stamps everywhere
  std::size_t mFloats = 0;  // of all batches
  std::uint64_t mHash = 14695981039346656037u;
};

}  // namespace QeltTests
