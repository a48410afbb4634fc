#pragma once

#include "ink/Ink.h"
#include "play/Options.h"
#include "play/PageLayout.h"

namespace QeltDesktop {

// What a cell of a sheet takes at most, at a zoom of at most 1, unless it is asked to fit another size.
constexpr PixelSize kUsualCell{800, 600};

// The largest zoom at which the area, turned clockwise by so many degrees, fits into so many pixels. Above 0
// and finite; an area that is not finite does not fit at any.
float zoomToFit(const PageArea& area, float degrees, const PixelSize& size);

// Whether all places of the page lie from -1 to 1 in both axes, but not all in one point. Such ink counts in
// shares of a page or a line: a pen, which places a stamp every 0.4 stroke units, leaves nothing but a dot.
bool isBelowStrokeUnits(const Page& page);

// Makes such a page, and the page size that was asked for, as large as it will be in the picture that
// `options.fit` asks for; unless there is a page size, less a margin of so many stroke units on every side.
// Pen sizes stay: they count in the picture's pixels then.
void enlargeToFit(Page& page, Options& options, float margin);

}  // namespace QeltDesktop
