#pragma once

#include "Ink.h"
#include "TraceFormat.h"
#include "TraceText.h"

namespace QeltDesktop {

// Turns the points of a trace into samples: pressure as a share of its maximum, tilt from elevation or from
// the tilts along x and y, times from T or 240 points a second. What is not recorded reads as pressure 1,
// tilt 0, orientation 0. They are added to `traces`, where they belong to the trace that is finished next.
// Throws Refusal when a point is malformed.
void readSamples(const TraceText& text, const TraceFormat& format, Traces& traces);

}  // namespace QeltDesktop
