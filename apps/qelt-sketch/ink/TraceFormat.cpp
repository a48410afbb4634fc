#include "ink/TraceFormat.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <numbers>
#include <optional>
#include <set>
#include <string_view>
#include <utility>

#include "ink/Lengths.h"
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

// What a unit is in the quantity's own: stroke units, radians or milliseconds. None for a name that is no
// unit of the quantity.
std::optional<double> unitNamed(Quantity quantity, std::string_view unit) {
  if (isPlace(quantity)) return strokeUnitsIn(unit);
  if (isAngle(quantity)) {
    if (unit == "deg") return std::numbers::pi / 180.0;
    if (unit == "rad") return 1.0;
  }
  if (quantity == Quantity::Time) {
    if (unit == "ms") return 1.0;
    if (unit == "s") return 1000.0;
  }
  return std::nullopt;
}

// The unit of a channel that names none, or the device's own.
double usualUnit(Quantity quantity) {
  return isAngle(quantity) ? std::numbers::pi / 180.0 : 1.0;
}

// Force is a share of its maximum, in any unit.
bool hasUnits(Quantity quantity) {
  return quantity != Quantity::Ignored && quantity != Quantity::Force;
}

class ChannelReader {
 public:
  ChannelReader(const SourceText& source, const ChannelText& text, bool intermittent)
      : mSource(source), mText(text), mIntermittent(intermittent) {}

  Channel read() {
    if (mText.name.empty()) throw malformed("channel without a name", "");
    mChannel.quantity = quantityNamed(mText.name);
    mChannel.boolean = mText.type == "boolean";
    // A switch, or what is known at some points only, says nothing of how a stroke is drawn; but no stroke is
    // drawn without places.
    if (isPlace(mChannel.quantity)) {
      if (mChannel.boolean) throw malformed("channel " + mText.name + " cannot be", "boolean");
    } else if (mChannel.boolean || mIntermittent) {
      mChannel.quantity = Quantity::Ignored;
    }
    const Quantity quantity = mChannel.quantity;
    if (hasUnits(quantity)) readUnit();
    if (isPlace(quantity) && mText.orientation == "-ve") mChannel.unit = -mChannel.unit;
    if (isAngle(quantity)) readRange();
    if (quantity == Quantity::Force) readForce();
    return mChannel;
  }

 private:
  void readUnit() {
    const std::optional<double> known = unitNamed(mChannel.quantity, mText.units);
    if (!known && !isUnitless(mText.units))
      throw malformed("unknown unit of channel " + mText.name, mText.units);
    mChannel.unit = known.value_or(usualUnit(mChannel.quantity));
  }

  // A turn in radians is written with few digits.
  void readRange() {
    constexpr double kTurn = 2.0 * std::numbers::pi, kRounded = 1.0001;
    const std::optional<float> max = limit("max", mText.max, "must be a number");
    mChannel.inFullUnits = max && static_cast<double>(*max) * mChannel.unit <= kTurn * kRounded;
  }

  void readForce() {
    const std::optional<float> min = limit("min", mText.min, "must be a number");
    const std::string wanted = mText.min ? "must be a number above its min" : "must be a number above 0";
    const std::optional<float> max = limit("max", mText.max, wanted);
    mChannel.min = min.value_or(0.0f);
    mChannel.max = max.value_or(mChannel.min);
    if (max && *max <= mChannel.min) throw malformed("max of channel F " + wanted, *mText.max);
  }

  std::optional<float> limit(const std::string& which, const std::optional<std::string>& value,
                             const std::string& wanted) const {
    if (!value) return std::nullopt;
    const std::optional<float> number = parseFloat(*value);
    if (!number || !std::isfinite(*number)) {
      throw malformed(which + " of channel " + mText.name + " " + wanted, value->empty() ? "\"\"" : *value);
    }
    return number;
  }

  Refusal malformed(const std::string& what, const std::string& value) const {
    return mSource.refusalAt(mText.offset, what, value);
  }

  const SourceText& mSource;
  const ChannelText& mText;
  bool mIntermittent;
  Channel mChannel;
};

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
      orientation(element.text("orientation")),
      min(element.attribute("min")),
      max(element.attribute("max")) {}

TraceFormat traceFormatOf(const SourceText& source, std::size_t offset,
                          const std::vector<ChannelText>& regular,
                          const std::vector<ChannelText>& intermittent) {
  TraceFormat format;
  format.channels.reserve(regular.size() + intermittent.size());
  std::set<std::string> names;
  const auto take = [&](const std::vector<ChannelText>& channels, bool areIntermittent) {
    for (const ChannelText& channel : channels) {
      format.channels.push_back(ChannelReader(source, channel, areIntermittent).read());
      if (!names.insert(channel.name).second) {
        throw source.refusalAt(channel.offset, "channel named twice", channel.name);
      }
    }
  };
  take(regular, false);
  format.regularCount = format.channels.size();
  take(intermittent, true);
  for (const auto& [quantity, name] : {std::pair{Quantity::X, "X"}, std::pair{Quantity::Y, "Y"}}) {
    if (!format.has(quantity)) throw source.refusalAt(offset, "traceFormat without channel", name);
  }
  return format;
}

std::optional<Resolution> resolutionOf(const SourceText& source, const XmlElement& element) {
  if (element.text("name") != "resolution") return std::nullopt;
  const std::string channel = element.text("channel");
  const Quantity quantity = quantityNamed(channel);
  if (!isPlace(quantity) && !isAngle(quantity)) return std::nullopt;
  const auto malformed = [&](const std::string& what, const std::string& value) {
    return source.refusalAt(element.offset(), what + " of channel " + channel,
                            value.empty() ? "\"\"" : value);
  };
  const std::string value = element.text("value");
  const std::optional<double> steps = parseDouble(value);
  if (!steps || !std::isfinite(*steps)) throw malformed("no number as the resolution", value);
  if (*steps <= 0.0) return std::nullopt;  // devices that do not know their resolution say 0
  const std::string units = element.text("units");
  const bool isInverse = units.starts_with("1/");
  const std::string_view unit = std::string_view(units).substr(isInverse ? 2 : 0);
  std::optional<double> known;
  if (isInverse) known = unitNamed(quantity, unit);
  if (isPlace(quantity) && !known) {
    // A unit that is no inverse means as little as one that is unknown. Steps of no length are stroke units.
    if (!isUnitless(unit)) throw malformed("unknown unit of the resolution", units);
    return std::nullopt;
  }
  return Resolution{.quantity = quantity, .steps = *steps, .unit = known};
}

void applyResolution(TraceFormat& format, const Resolution& resolution) {
  for (Channel& channel : format.channels) {
    if (channel.quantity != resolution.quantity || channel.inFullUnits) continue;
    const double unit = resolution.unit ? std::copysign(*resolution.unit, channel.unit) : channel.unit;
    channel.unit = unit / resolution.steps;
  }
}

}  // namespace QeltDesktop
