#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "ink/SourceText.h"
#include "ink/XmlWalk.h"

namespace QeltDesktop {

// What the numbers of a channel mean.
enum class Quantity { Ignored, X, Y, Force, Elevation, Azimuth, TiltX, TiltY, Time };

struct Channel {
  Quantity quantity = Quantity::Ignored;
  bool boolean = false;  // its values are T and F
  float max = 0.0f;      // of Force: the value at full pressure; 0 when not given
  double unit = 1.0;     // of angles: radians per unit; of Time: milliseconds per unit
};

// The order of the values in a point. Those after the regular ones may be missing in a point (intermittent
// channels).
struct TraceFormat {
  std::vector<Channel> channels;
  std::size_t regularCount = 0;

  bool has(Quantity quantity) const;
};

// X, then Y: the format of traces without a traceFormat.
TraceFormat plainFormat();

// The attributes of a <channel>, as they are written.
struct ChannelText {
  explicit ChannelText(const XmlElement& element);

  std::size_t offset;
  std::string name, type, units;
  std::optional<std::string> max;
};

// The format of a <traceFormat> at `offset`, from the channels in it and those in its <intermittentChannels>.
// Throws Refusal when it is malformed or lacks X or Y.
TraceFormat traceFormatOf(const SourceText& source, std::size_t offset,
                          const std::vector<ChannelText>& regular,
                          const std::vector<ChannelText>& intermittent);

}  // namespace QeltDesktop
