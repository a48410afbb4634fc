#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "SourceText.h"
#include "XmlWalk.h"

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

// A <channel> as it is written.
struct ChannelText {
  explicit ChannelText(const XmlElement& element);

  std::size_t offset;
  std::string name, type, units;
  std::optional<std::string> max;
};

// The format of a <traceFormat> at that offset, of the channels that stand in it and of those in its
// <intermittentChannels>; throws Refusal when it is malformed or lacks X or Y.
TraceFormat traceFormatOf(const SourceText& source, std::size_t offset,
                          const std::vector<ChannelText>& regular,
                          const std::vector<ChannelText>& intermittent);

}  // namespace QeltDesktop
