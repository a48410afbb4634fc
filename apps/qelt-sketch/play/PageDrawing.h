#pragma once

#include "ink/Ink.h"
#include "output/Picture.h"
#include "play/Options.h"
#include "play/PageLayout.h"

namespace QeltDesktop {

class PluginLibrary;
class Progress;
class RenderQueue;

// The most pixels that a picture has on a side and in all; the latter take 256 MiB per layer.
constexpr int kLongestSide = 32'767;
constexpr int kMostPixels = 67'108'864;

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

// Plays the page to new pens and composes the layers on the background. Throws Refusal when the picture is
// too large to draw or a pen lacks a drawable.
Picture drawPage(const PluginLibrary& plugin, RenderQueue& queue, const Page& page, const Options& options,
                 const PageLayout& layout, const DrawableSet& drawables, Progress& progress);

}  // namespace QeltDesktop
