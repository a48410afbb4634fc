#pragma once

#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>
#include <optional>
#include <vector>

#include "core/PagePens.h"
#include "core/PageTypes.h"
#include "core/PixelArea.h"
#include "core/StrokeList.h"
#include "desktop/gl/GpuFence.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/LayerBackup.h"
#include "desktop/graphics/Presenter.h"

namespace QeltDesktop {

class RenderQueue;

// The pixels of an area of the page before, or after, a step.
struct PageBackup {
  PixelArea area;
  std::unique_ptr<LayerBackup> strokes;
  std::unique_ptr<LayerBackup> outlines;  // null where there was no such layer

  std::size_t bytes() const;
};

// The layers that show the stored strokes of a page, and how they are brought up to date.
//
// The front layers are shown. What of them is out of date is redrawn in slices into the back layers, which
// then take the front's place, or whose pixels are copied to it. Until then the front shows what it has;
// after a change of the view, moved and scaled. Main thread.
class PageLayers {
 public:
  // All outlive it. Throws std::runtime_error when OpenGL has no such layers.
  PageLayers(RenderQueue& queue, PagePens& pens, StrokeList& strokes, int width, int height,
             const PageView& view);
  ~PageLayers();
  PageLayers(const PageLayers&) = delete;
  PageLayers& operator=(const PageLayers&) = delete;

  // Nothing has changed when it throws, as the constructor does.
  void setShape(int width, int height, const PageView& view);
  int width() const { return mWidth; }
  int height() const { return mHeight; }
  const PageView& view() const { return mView; }
  PixelArea window() const { return {0, 0, mWidth, mHeight}; }

  // Whether the front layers belong to the view and the size of the window.
  bool frontFits() const;
  // Whether the front shows an area as it is to be at rest.
  bool isExact(const PixelArea& area) const { return frontFits() && !meet(area, stale()); }
  // What is to be redrawn, or being redrawn.
  PixelArea stale() const { return mJob ? united(mStale, mJob->area) : mStale; }

  // The pixels of the window that a stroke may touch.
  PixelArea areaOf(const PageStroke& stroke) const;
  // Those that change when it comes or goes: its own, and those of the outlines that begin where its ends.
  // Empty ones are left out.
  std::vector<PixelArea> areasOf(std::size_t index) const;

  // Draws a stroke, which is on top, to the front at once. Only where `frontFits`.
  void drawOnTop(std::size_t index);
  // Makes what `drawOnTop`, or a backup, of the stroke needs.
  void makeRoomFor(const PageStroke& stroke);
  // Has an area redrawn.
  void spoil(const PixelArea& area) { mStale = united(mStale, common(area, window())); }
  // Has everything redrawn: the layers came back empty.
  void spoilAll();
  // Has the areas redrawn that change with a stroke (`areasOf`), which was shown or hidden, or came.
  void redraw(std::size_t index, const std::vector<PixelArea>& areas);
  // The list has no stroke at this place any more.
  void removed(std::size_t index);
  // Begins a redraw that is under way anew.
  void restart();
  // Nothing is shown any more: the front is empty at once, and at rest.
  void showNothing();

  // Throws std::bad_alloc, std::runtime_error.
  PageBackup backUp(const PixelArea& area);
  void swap(PageBackup& backup);

  // Draws on until the deadline. `beforeDrawing` is told of each stroke before a redraw draws it into the
  // back layers, where a backup of the area is exact if the redraw covers it. True while there is more to do.
  using Clock = std::chrono::steady_clock;
  using BeforeDrawing = std::function<void(std::size_t index, const std::function<PageBackup()>& backUp)>;
  bool work(Clock::time_point deadline, const BeforeDrawing& beforeDrawing);
  bool isBusy() const { return mJob.has_value() || !frontFits() || !isEmpty(mStale); }

  // The layers to show, the lowest first, at their places.
  void addShown(std::vector<ShownLayer>& shown) const;
  // The front layers laid over each other; transparent. Throws std::runtime_error without a context.
  PagePicture frontPicture();
  std::size_t tiles() const;

 private:
  struct Pair {
    std::unique_ptr<CanvasLayer> strokes;
    std::unique_ptr<CanvasLayer> outlines;  // null until something has an outline
  };
  struct Job {
    PixelArea area;
    bool isWhole;          // else the area is copied to the front
    std::size_t next = 0;  // the stroke to draw
    PixelArea stale;       // what it has drawn and is out of date already
  };

  std::unique_ptr<CanvasLayer> newLayer(int width, int height);
  static PageBackup backUp(RenderQueue& queue, Pair& pair, const PixelArea& area);
  PageCanvas canvasOf(const Pair& pair, const PageView& view) const;
  bool isGpuDone();
  void begin();
  std::size_t drawNext(const BeforeDrawing& beforeDrawing);
  void finish();

  RenderQueue& mQueue;
  PagePens& mPens;
  StrokeList& mStrokes;
  int mWidth, mHeight;
  PageView mView;
  Pair mFront, mBack;  // the back has its layers, of the window's size
  PageView mFrontView;
  PixelArea mStale;  // of the front, where it fits
  std::optional<Job> mJob;
  StrokeId mFailed = 0;              // the last stroke that could not be drawn
  std::unique_ptr<GpuFence> mFence;  // after the last slice
  Clock::time_point mSliceEnd;
  bool mWasSlow = false;  // the GPU took too long over it
  std::size_t mSliceBytes = std::size_t{256} << 10;
};

}  // namespace QeltDesktop
