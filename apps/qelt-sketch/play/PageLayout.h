#pragma once

#include <optional>

#include "ink/Ink.h"
#include "math/Matrix3.h"
#include "play/Options.h"

namespace QeltDesktop {

// How the page lies in the picture.
struct PageLayout {
  Qelt::Matrix3<float> matrix;  // stroke units to pixels
  double width, height;         // pixels, not rounded
};

// A rectangle of the page, in stroke units.
struct PageArea {
  float left, top, width, height;
};

// The margin around a page's extent, enough for the widest stamps of a tilted pen at its edge: 16 stroke
// units, twice the largest pen size, and the outline's size, up to 512 in all.
float pageMargin(float largestPenSize, float outlineSize);

// A page of the given size from (0, 0), else the extent of all samples with the margin around it.
PageArea pageArea(const Page& page, const std::optional<PageSize>& size, float margin);

// Zooms the area and turns it clockwise about its centre; the picture grows to hold the turned area.
PageLayout layOut(const PageArea& area, float zoom, float degrees);

}  // namespace QeltDesktop
