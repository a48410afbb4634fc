#pragma once

#include <array>
#include <functional>
#include <memory>
#include <ostream>
#include <string>
#include <vector>

#include "desktop/engine/PluginLibrary.h"
#include "pencommon/IPenMorphable.h"
#include "pencommon/Pen.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "support/Board.h"

namespace QeltTests {

// What a pen draws. A prediction goes back the way of a live stroke, which it leaves open; a redraw is of a
// recorded event and of a stored stroke: without an entry in the cache, with one that is empty, full, and
// dirty.
enum class Kind { Live, Redraw, Outline, Preview, Prediction };
inline constexpr std::array kAllKinds = {Kind::Live, Kind::Redraw, Kind::Outline, Kind::Preview,
                                         Kind::Prediction};
std::ostream& operator<<(std::ostream& out, Kind kind);

struct Drawing {
  Kind kind;
  int version;
};
// Every kind in each of the versions that bring a drawable of that kind; of the preview, which has no
// version, one.
std::vector<Drawing> drawings(const std::vector<int>& versions);
std::string drawingName(const testing::TestParamInfo<Drawing>& test);

// What a pen made of the same input: compared between a pen that went through a fault and a fresh one.
struct Drawn {
  std::vector<std::vector<float>> steps;    // each call's answer and the edges of its rectangle
  std::vector<std::vector<float>> batches;  // as they reached the render drawables
  std::vector<bool> cached;                 // of each, whether it came from the cache
  std::vector<std::uint8_t> pixels;         // only where there is a layer
};

void expectAlike(const Drawn& drawn, const Drawn& expected);

// A whole pen of the built library and everything it draws, call by call as a host makes them. None of it
// minds that the pen or a drawable could not be made. Events of the board itself go to the pen's stroke
// drawable.
class PenBoard : public Board {
 public:
  using MakePen = std::function<Qelt::Pen*()>;
  using Call = std::function<bool(Qelt::RectF*)>;

  // With a pen, watched.
  explicit PenBoard(const BoardOptions& wanted = {});
  // On a host's queue and layer, as the pens of a process are; not watched. The pen is made by the first call
  // that needs it. Without a layer the canvas has a tile without GL.
  PenBoard(
      const BoardOptions& wanted, QeltDesktop::RenderQueue& itsQueue, QeltDesktop::CanvasLayer* itsLayer,
      MakePen makesPen = [] { return library().createPen(); });
  ~PenBoard() override;

  static const QeltDesktop::PluginLibrary& library();

  void makePen();
  // As a host that closes its document: what the pen has queued still runs.
  void deletePen();
  // Puts pen, drawable and view back to what a board begins with.
  void setUsual(Qelt::PenDrawableGL& drawable);
  void setCurve(bool curve);
  void zoom(float factor) { canvas.setMatrix(viewOf(factor)); }

  // A stroke of nine samples, some 60 x 24 units.
  static std::vector<Sample> usualStroke();
  // Makes the calls of a kind that the pen's version has; leaves it to `around` to make each of them.
  void draw(Kind kind, const std::vector<Sample>& samples, const std::function<void(const Call&)>& around);
  void draw(Kind kind, const std::vector<Sample>& samples = usualStroke());
  void drawAll() {
    for (const Kind kind : kAllKinds) draw(kind);
  }
  // One batch of each render drawable, and one from the cache.
  void drawOneOfEach();
  // Every drawable there is, on the canvas, nothing drawn.
  void prepareAll();
  // Draws all kinds, or with a layer one of each, beginning as every stroke does, and tells what came of it.
  Drawn drawEverything(float zoomFactor = 1.0f);
  // Takes all stored strokes away, whatever the render thread still does with their drawings.
  void turnPage();
  void loseAndRestoreContext();
  void finish();
  // How many calls let a std::bad_alloc out: calls that hand over a batch, which may not grow.
  int refusedBatches() const { return mRefusedBatches; }

  std::unique_ptr<Qelt::Pen> pen;
  // Whether the render thread is waited for after each call.
  bool keepsUp = false;
  // Called before every call that hands over a batch.
  std::function<void(Qelt::PenDrawableGL&)> beforeCall;

 protected:
  bool draw(const Qelt::MotionEvent& event) override;

 private:
  void setUsualPen();
  // A drawable of the pen's on the canvas; null where there is no pen or it could not make one.
  template <typename Drawable>
  Drawable* onCanvas(Drawable* (Qelt::Pen::*getter)());
  template <typename Drawable>
  void drawLive(Drawable* drawable, const std::vector<Sample>& samples, bool ends,
                const std::function<void(const Call&)>& around);
  QeltDesktop::StoredStroke& newStroke(const std::vector<Sample>& samples);
  // Has `around` make a call, which may fail; none where there is no drawable.
  template <typename Drawable, typename Made>
  void call(Drawable* drawable, const std::function<void(const Call&)>& around, Made&& made);

  const MakePen mMakePen;
  std::vector<std::unique_ptr<QeltDesktop::StoredStroke>> mPage;
  int mRefusedBatches = 0;
  std::vector<std::vector<float>>* mSteps = nullptr;  // where steps are noted, if anywhere
};

}  // namespace QeltTests
