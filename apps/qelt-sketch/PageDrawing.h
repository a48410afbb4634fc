#pragma once

#include "Ink.h"
#include "Options.h"
#include "PageLayout.h"
#include "Picture.h"

namespace QeltDesktop {

class PluginLibrary;
class Progress;
class RenderQueue;

// A picture's pixels: on a side, and in all, which is 256 MiB a layer.
constexpr int kLongestSide = 32'767;
constexpr int kMostPixels = 67'108'864;

// Which drawables take part in a picture, each on a layer of its own: outlines under strokes (or the
// preview), predictions on top.
struct DrawableSet {
  bool stroke = false;
  bool outline = false;
  bool preview = false;
  bool prediction = false;
};

// Strokes, and what the options add to them.
DrawableSet drawablesFor(const Options& options);

// The largest pen size on the page, as `styleFor` gives it; sizes that are no number are left out.
float largestPenSize(const PluginLibrary& plugin, RenderQueue& queue, const Page& page,
                     const Options& options);

// Plays the page to a new pen and puts its layers together on the background. Throws Refusal when the picture
// is too large to draw or the pen lacks a drawable.
Picture drawPage(const PluginLibrary& plugin, RenderQueue& queue, const Page& page, const Options& options,
                 const PageLayout& layout, const DrawableSet& drawables, Progress& progress);

}  // namespace QeltDesktop
