#pragma once

#include <string>

#include "ink/Ink.h"

namespace QeltDesktop {

// Strokes as a page of W3C InkML, in ASCII, one line a trace. `readInkml` makes the same strokes of it:
// samples bit for bit, brushes and tools. The page has a channel for each of pressure, tilt, orientation and
// time unless every sample has what is assumed where nothing is recorded.
//
// What InkML cannot say comes back as the nearest that it can:
// - Tilt is written as an elevation, from which only multiples of 2^-52 come back near upright. A tilt below
//   2^-29 radians (a ten-millionth of a degree) that is none comes back within 2^-53, and -0 as 0.
// - An orientation outside its range comes back within it, and the float below -pi as +pi.
// - What is not finite becomes the largest float of its sign; NaN, what is assumed where nothing is recorded,
//   and 0 for a place. Times beyond the range of a float end there.
// - A tool other than stylus, finger and mouse is left out, and so is a brush's length that is not above 0.
// Without strokes it is a page that the reader refuses.
std::string writeInkml(const Strokes& strokes);

}  // namespace QeltDesktop
