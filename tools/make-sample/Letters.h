#pragma once

#include <string_view>
#include <vector>

#include "Curve.h"

// One pass of the pen over the paper.
using PenPass = std::vector<Waypoint>;

// How a line of writing lies on the page.
struct Lettering {
  Point origin;          // left end of the base line
  double height = 20.0;  // of an x
  double width = 0.92;   // of a letter against its design
  double slant = 0.30;   // sideways, a unit of height
  double climb = 0.0;    // of the base line, a unit of length
};

// The pen passes of a text in joined handwriting, in the order a hand would make them: a word in one go, then
// its dots and crossbars. Only the letters that the page needs exist; another one is an
// std::invalid_argument.
std::vector<PenPass> write(std::string_view text, const Lettering& lettering);
