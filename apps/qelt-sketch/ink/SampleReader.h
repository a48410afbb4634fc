#pragma once

#include "ink/Ink.h"
#include "ink/TraceFormat.h"
#include "ink/TraceText.h"

namespace QeltDesktop {

// Turns the points of a trace into samples: pressure as a share of its maximum, tilt from elevation or from
// the tilts along x and y, time from T or at 240 points a second. Where nothing is recorded, pressure is 1,
// tilt and orientation are 0; a brush that ignores pressure has none. The samples are added to `strokes`, for
// the stroke that is finished next. Throws Refusal when a point is malformed, or lies farther from the
// origin, along x or y, than `farthest` stroke units.
void readSamples(const TraceText& text, const TraceFormat& format, bool ignoresPressure, float farthest,
                 Strokes& strokes);

}  // namespace QeltDesktop
