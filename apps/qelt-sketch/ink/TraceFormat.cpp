#include "ink/TraceFormat.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <numbers>
#include <optional>
#include <set>
#include <string_view>
#include <utility>

#include "text/NumberText.h"

namespace QeltDesktop {
namespace {

Quantity quantityNamed(std::string_view name) {
  static constexpr std::array<std::pair<std::string_view, Quantity>, 8> kNames{{
      {"X", Quantity::X},
      {"Y", Quantity::Y},
      {"F", Quantity::Force},
      {"OE", Quantity::Elevation},
      {"OA", Quantity::Azimuth},
      {"OTx", Quantity::TiltX},
      {"OTy", Quantity::TiltY},
      {"T", Quantity::Time},
  }};
  for (const auto& [known, quantity] : kNames) {
    if (known == name) return quantity;
  }
  return Quantity::Ignored;
}

bool isAngle(Quantity quantity) {
  return quantity == Quantity::Elevation || quantity == Quantity::Azimuth || quantity == Quantity::TiltX ||
         quantity == Quantity::TiltY;
}

// None for a unit that does not fit the quantity.
std::optional<double> unitNamed(Quantity quantity, const std::string& unit) {
  if (isAngle(quantity)) {
    if (unit.empty() || unit == "deg") return std::numbers::pi / 180.0;
    if (unit == "rad") return 1.0;
    return std::nullopt;
  }
  if (quantity == Quantity::Time) {
    if (unit.empty() || unit == "ms") return 1.0;
    if (unit == "s") return 1000.0;
    return std::nullopt;
  }
  return 1.0;  // positions are taken as stroke units and pressure as a share of its maximum, in any unit
}

Channel readChannel(const SourceText& source, const ChannelText& text) {
  const auto malformed = [&](const std::string& what, const std::string& value) {
    return source.refusalAt(text.offset, what, value);
  };
  if (text.name.empty()) throw malformed("channel without a name", "");
  Channel channel;
  channel.quantity = quantityNamed(text.name);
  channel.boolean = text.type == "boolean";
  if (channel.boolean && channel.quantity != Quantity::Ignored) {
    throw malformed("channel " + text.name + " cannot be", "boolean");
  }
  const std::optional<double> known = unitNamed(channel.quantity, text.units);
  if (!known) throw malformed("unknown unit of channel " + text.name, text.units);
  channel.unit = *known;
  if (channel.quantity == Quantity::Force && text.max) {
    const std::optional<float> max = parseFloat(*text.max);
    if (!max || !std::isfinite(*max) || *max <= 0.0f) {
      throw malformed("max of channel F must be a number above 0", text.max->empty() ? "\"\"" : *text.max);
    }
    channel.max = *max;
  }
  return channel;
}

}  // namespace

bool TraceFormat::has(Quantity quantity) const {
  return std::any_of(channels.begin(), channels.end(),
                     [&](const Channel& channel) { return channel.quantity == quantity; });
}

TraceFormat plainFormat() {
  return {.channels = {Channel{.quantity = Quantity::X}, Channel{.quantity = Quantity::Y}},
          .regularCount = 2};
}

ChannelText::ChannelText(const XmlElement& element)
    : offset(element.offset()),
      name(element.text("name")),
      type(element.text("type")),
      units(element.text("units")),
      max(element.attribute("max")) {}

TraceFormat traceFormatOf(const SourceText& source, std::size_t offset,
                          const std::vector<ChannelText>& regular,
                          const std::vector<ChannelText>& intermittent) {
  TraceFormat format;
  format.channels.reserve(regular.size() + intermittent.size());
  std::set<std::string> names;
  const auto take = [&](const std::vector<ChannelText>& channels) {
    for (const ChannelText& channel : channels) {
      format.channels.push_back(readChannel(source, channel));
      if (!names.insert(channel.name).second) {
        throw source.refusalAt(channel.offset, "channel named twice", channel.name);
      }
    }
  };
  take(regular);
  format.regularCount = format.channels.size();
  take(intermittent);
  for (const auto& [quantity, name] : {std::pair{Quantity::X, "X"}, std::pair{Quantity::Y, "Y"}}) {
    if (!format.has(quantity)) throw source.refusalAt(offset, "traceFormat without channel", name);
  }
  return format;
}

}  // namespace QeltDesktop
