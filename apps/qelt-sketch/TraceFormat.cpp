#include "TraceFormat.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <numbers>
#include <optional>
#include <set>
#include <string_view>
#include <utility>

#include "InkmlNode.h"
#include "NumberText.h"

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

// Null for a unit that says nothing of the quantity.
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
  return 1.0;  // positions are stroke units and pressure is a share of its maximum, whatever they were
}

Channel readChannel(const SourceText& source, const pugi::xml_node& node) {
  const std::string name = textOf(node, "name");
  if (name.empty()) throw refusalAt(source, node, "channel without a name", "");
  Channel channel;
  channel.quantity = quantityNamed(name);
  channel.boolean = textOf(node, "type") == "boolean";
  if (channel.boolean && channel.quantity != Quantity::Ignored) {
    throw refusalAt(source, node, "channel " + name + " cannot be", "boolean");
  }
  const std::string unit = textOf(node, "units");
  const std::optional<double> known = unitNamed(channel.quantity, unit);
  if (!known) throw refusalAt(source, node, "unknown unit of channel " + name, unit);
  channel.unit = *known;
  if (channel.quantity == Quantity::Force && attributeOf(node, "max")) {
    const std::string text = textOf(node, "max");
    const std::optional<float> max = parseFloat(text);
    if (!max || !std::isfinite(*max) || *max <= 0.0f) {
      throw refusalAt(source, node, "max of channel F must be a number above 0",
                      text.empty() ? "\"\"" : text);
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

TraceFormat readTraceFormat(const SourceText& source, const pugi::xml_node& node) {
  TraceFormat format;
  std::set<std::string> names;
  const auto take = [&](const pugi::xml_node& channel) {
    format.channels.push_back(readChannel(source, channel));
    const std::string name = textOf(channel, "name");
    if (!names.insert(name).second) throw refusalAt(source, channel, "channel named twice", name);
  };
  for (const pugi::xml_node& child : node) {
    if (isElement(child, "channel")) take(child);
  }
  format.regularCount = format.channels.size();
  for (const pugi::xml_node& child : node) {
    if (!isElement(child, "intermittentChannels")) continue;
    for (const pugi::xml_node& channel : child) {
      if (isElement(channel, "channel")) take(channel);
    }
  }
  for (const auto& [quantity, name] : {std::pair{Quantity::X, "X"}, std::pair{Quantity::Y, "Y"}}) {
    if (!format.has(quantity)) throw refusalAt(source, node, "traceFormat without channel", name);
  }
  return format;
}

}  // namespace QeltDesktop
