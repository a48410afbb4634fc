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
inline bool isPlace(Quantity quantity) {
  return quantity == Quantity::X || quantity == Quantity::Y;
}

struct Channel {
  Quantity quantity = Quantity::Ignored;
  bool boolean = false;      // its values are T and F
  bool inFullUnits = false;  // of angles: their range fits a turn in degrees, so they are no device steps
  float min = 0.0f;          // of Force: the value without pressure
  float max = 0.0f;          // of Force: the value at full pressure, above min; not above it when not given
  // What one step of the channel's values is: of X and Y stroke units, below 0 where they grow to the left or
  // upwards; of angles radians; of Time milliseconds.
  double unit = 1.0;
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
  std::string name, type, units, orientation;
  std::optional<std::string> min, max;
};

// The format of a <traceFormat> at `offset`, from the channels in it and those in its <intermittentChannels>.
// Throws Refusal when it is malformed or lacks X or Y.
TraceFormat traceFormatOf(const SourceText& source, std::size_t offset,
                          const std::vector<ChannelText>& regular,
                          const std::vector<ChannelText>& intermittent);

// How many steps of a place or an angle an ink source counts to a unit.
struct Resolution {
  Quantity quantity;
  double steps;                // above 0
  std::optional<double> unit;  // as Channel has it; none, of angles alone: the channel's own
};

// The resolution that a <channelProperty> states; none if it is another property, or says nothing that
// matters here. Throws Refusal when it is malformed.
std::optional<Resolution> resolutionOf(const SourceText& source, const XmlElement& element);

// Has the channels of the quantity count in such steps.
void applyResolution(TraceFormat& format, const Resolution& resolution);

}  // namespace QeltDesktop
