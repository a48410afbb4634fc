#pragma once

#include "ink/Ink.h"
#include "output/Picture.h"
#include "play/Options.h"
#include "play/PageLayout.h"

namespace QeltDesktop {

class PictureSink;
class PluginLibrary;
class Progress;
class RenderQueue;
class StageTimes;

// The drawables that take part in a picture, each on a layer of its own: outlines below, then strokes or the
// preview, predictions on top.
struct DrawableSet {
  bool stroke = false;
  bool outline = false;
  bool preview = false;
  bool prediction = false;
};

// Strokes, outlines where the options or a stroke ask for them, and predictions where the options do.
DrawableSet drawablesFor(const Page& page, const Options& options);

// The largest pen size on the page, as `styleFor` gives it; sizes that are NaN do not count.
float largestPenSize(const PluginLibrary& plugin, RenderQueue& queue, const Page& page,
                     const Options& options);
// The largest outline size on the page, as `outlineFor` gives it; 0 without outlines.
float largestOutlineSize(const Page& page, const Options& options);

// Draws pages, one after the other, with one plug-in and one GL context. A page takes its pixels once and
// little besides: its layers are drawn one after the other, those below are kept packed, and the picture is
// composed and handed on in bands. Main thread.
class PageDrawer {
 public:
  // All outlive it.
  PageDrawer(const PluginLibrary& plugin, RenderQueue& queue, StageTimes& times)
      : mPlugin(plugin), mQueue(queue), mTimes(times) {}

  // Plays the page to new pens, composes the layers on the background, and hands the picture to `sink`.
  // Throws Refusal when the picture is too large to draw or a pen lacks a drawable; until the page is drawn,
  // the sink has heard nothing.
  void draw(const Page& page, const Options& options, const PageLayout& layout, const DrawableSet& drawables,
            Progress& progress, PictureSink& sink);

 private:
  const PluginLibrary& mPlugin;
  RenderQueue& mQueue;
  StageTimes& mTimes;
};

// One page as a picture in memory.
Picture drawPage(const PluginLibrary& plugin, RenderQueue& queue, const Page& page, const Options& options,
                 const PageLayout& layout, const DrawableSet& drawables, Progress& progress);

}  // namespace QeltDesktop
