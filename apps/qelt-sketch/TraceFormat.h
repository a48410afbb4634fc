#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include <pugixml.hpp>

#include "SourceText.h"

namespace QeltDesktop {

// What a channel's numbers mean to us.
enum class Quantity { Ignored, X, Y, Force, Elevation, Azimuth, TiltX, TiltY, Time };

struct Channel {
  Quantity quantity = Quantity::Ignored;
  bool boolean = false;  // holds T and F
  float max = 0.0f;      // of Force: what a full press reads; 0 when not given
  double unit = 1.0;     // of angles: radians a unit; of Time: milliseconds a unit
};

// The order of the values in a point. The last ones may be left out of a point (intermittent channels).
struct TraceFormat {
  std::vector<Channel> channels;
  std::size_t regularCount = 0;

  bool has(Quantity quantity) const;
};

// X, then Y: the format of traces that no traceFormat speaks of.
TraceFormat plainFormat();

// Reads a <traceFormat>; throws Refusal when it is malformed or lacks X or Y.
TraceFormat readTraceFormat(const SourceText& source, const pugi::xml_node& node);

}  // namespace QeltDesktop
