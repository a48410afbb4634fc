#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <vector>

#include "base/RectF.h"
#include "core/PagePens.h"
#include "core/PageStroke.h"
#include "core/PageTypes.h"
#include "core/PixelArea.h"
#include "core/StrokeList.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/Presenter.h"

namespace QeltDesktop {

class PluginLibrary;
class RenderQueue;

// What lies above the stored strokes: the stroke under way, drawn event by event; its predicted continuation;
// and strokes that have ended while the layers below are of another view, until those catch up. Main thread.
class WetInk {
 public:
  // All outlive it. Throws std::runtime_error when OpenGL has no such layers.
  WetInk(const PluginLibrary& plugin, RenderQueue& queue, PagePens& pens, int width, int height,
         const PageView& view);
  ~WetInk();
  WetInk(const WetInk&) = delete;
  WetInk& operator=(const WetInk&) = delete;

  // Draws everything again for a new view or size. Nothing has changed when it throws, as the constructor
  // does.
  void setShape(int width, int height, const PageView& view, StrokeList& strokes);
  // Draws everything again: the layers came back empty, or hold what has gone. What there is no memory for is
  // missing until the stroke ends.
  void redraw(StrokeList& strokes);

  bool isDrawing() const { return !mSamples.empty(); }
  const PageStyle& style() const { return mStyle; }
  const std::vector<Sample>& samples() const { return mSamples; }

  // A usable sample, in range. Nothing is under way when it throws.
  void begin(const PageStyle& style, const Sample& sample);
  void move(std::span<const Sample> samples, std::span<const Sample> predicted);
  // Takes in samples without drawing them. Throws std::bad_alloc.
  void add(std::span<const Sample> samples);
  // The stroke has ended: it is stored and drawn below, or goes without a mark.
  void remove(StrokeList& strokes);
  // The stroke has ended and is stored; its ink stays until `dry`.
  void hold(StrokeId id);
  bool isHolding() const { return !mHeld.empty(); }
  // The layers below show the held strokes.
  void dry(StrokeList& strokes);

  void addShown(std::vector<ShownLayer>& shown) const;
  std::uint64_t stamps() const { return mStamps; }
  std::size_t tiles() const;

 private:
  class Pen;

  Pen& penFor(const PageStyle& style);
  // True when the event left ink.
  bool draw(std::span<const Sample> samples, int action);
  void drawFirstDot();
  void drawPrediction(std::span<const Sample> predicted);
  void clearPrediction();
  void feedAgain();
  PixelArea areaOf(std::span<const Sample> predicted) const;

  const PluginLibrary& mPlugin;
  RenderQueue& mQueue;
  PagePens& mPens;
  PageView mView;
  std::unique_ptr<CanvasLayer> mInk;
  std::unique_ptr<CanvasLayer> mPrediction;  // null where OpenGL draws no layer in one tile
  PensByLook<Pen> mWetPens;

  PageStyle mStyle;
  std::vector<Sample> mSamples;  // of the stroke under way; empty when there is none
  Qelt::RectF mLine;             // of the samples
  bool mHasInk = false;          // the stroke has placed stamps
  PixelArea mPredicted;          // where the prediction's layer has ink
  std::vector<StrokeId> mHeld;
  std::uint64_t mStamps = 0;
};

}  // namespace QeltDesktop
