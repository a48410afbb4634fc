#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <utility>
#include <vector>

#include "core/PageStroke.h"
#include "core/PageTypes.h"
#include "core/StrokeCache.h"
#include "core/StrokeList.h"
#include "math/Matrix3.h"

namespace QeltDesktop {

class CanvasLayer;
class PluginLibrary;
class RenderQueue;

Qelt::Matrix3<float> matrixOf(const PageView& view);

// One pen for each look and smoothing, made when it is first needed.
template <typename Pen>
class PensByLook {
 public:
  // Null at first.
  std::unique_ptr<Pen>& operator[](const PageStyle& style) {
    return mPens[static_cast<std::size_t>(style.look - 1)][style.smooth ? 1 : 0];
  }

 private:
  std::array<std::array<std::unique_ptr<Pen>, 2>, 8> mPens;
};

// Where stored strokes are drawn. Without a layer for outlines none are.
struct PageCanvas {
  CanvasLayer* strokes = nullptr;
  CanvasLayer* outlines = nullptr;
  PageView view;
};

// The pens that draw stored strokes: one for each look and smoothing, made when it is first needed. They are
// apart from those that draw live, whose strokes must not be disturbed, and from each other, because a
// straight stroke keeps the grain of the stroke that its pen drew before: these pens leave it at the corner
// of the window. Main thread.
class PagePens {
 public:
  // Both outlive it.
  PagePens(const PluginLibrary& plugin, RenderQueue& queue, std::size_t mostCachedBytes);
  ~PagePens();
  PagePens(const PagePens&) = delete;
  PagePens& operator=(const PagePens&) = delete;

  // Draws a stroke of the list above what is there, and runs the queue. Returns how many bytes of vertices
  // went to the GPU. What it throws leaves an incomplete drawing: std::bad_alloc, std::runtime_error when a
  // render task failed, Refusal where the plug-in makes no pen.
  std::size_t draw(StrokeList& strokes, std::size_t index, const PageCanvas& canvas);
  // The same for a stroke that is on no page, without its outline.
  void drawAlone(PageStroke& stroke, const PageCanvas& canvas);
  // Before a stroke goes.
  void forget(PageStroke& stroke);

  PenLimits limits(int look);
  // The sample stroke of a settings panel, through the preview drawable.
  void drawPreview(const PageStyle& style, CanvasLayer& layer, const PageView& view);

  StrokeCache& cache() { return mCache; }
  const StrokeCache& cache() const { return mCache; }
  // How many stamps these pens have computed.
  std::uint64_t stamps() const { return mStamps; }

 private:
  class Pen;
  class OutlinePen;

  Pen& penFor(const PageStyle& style);
  void drawOutline(StrokeList& strokes, std::size_t index, const PageCanvas& canvas);
  void drawStroke(Pen& pen, PageStroke& stroke, const PageCanvas& canvas);

  const PluginLibrary& mPlugin;
  RenderQueue& mQueue;
  StrokeCache mCache;
  std::uint64_t mStamps = 0;
  PensByLook<Pen> mPens;
  PensByLook<OutlinePen> mOutlinePens;
};

}  // namespace QeltDesktop
