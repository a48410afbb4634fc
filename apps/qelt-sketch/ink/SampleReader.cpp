#include "ink/SampleReader.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "ink/Angles.h"
#include "ink/XmlWalk.h"
#include "text/NumberText.h"

namespace QeltDesktop {
namespace {

// A channel's value at one point.
struct Reading {
  bool known = false;  // false until the channel has had a value
  double value = 0.0;
  float nearest = 0.0f;  // the float nearest to a plain number's decimal, rounded once
};

// A place in stroke units; not finite where a float cannot hold it.
float placeOf(const Channel& channel, const Reading& reading) {
  return channel.unit == 1.0 ? reading.nearest : static_cast<float>(reading.value * channel.unit);
}

// A force as a share of the channel's range. Without a range it is taken as it is.
float pressureOf(const Channel& channel, const Reading& reading) {
  if (channel.max <= channel.min) return reading.nearest;
  const double min = static_cast<double>(channel.min);
  const double share =
      (static_cast<double>(reading.nearest) - min) / (static_cast<double>(channel.max) - min);
  return static_cast<float>(share);
}

enum class Order { Value, Change, ChangeOfChange };

// What a channel keeps from point to point.
struct ChannelState {
  Order order = Order::Value;
  Reading reading;
  Reading written;      // the last number before it was added up, for "*"
  double change = 0.0;  // between the last two values
};

bool isSpace(char c) {
  return c == ' ' || c == '\t' || c == '\n' || c == '\r';
}
bool isDigit(char c) {
  return c >= '0' && c <= '9';
}
bool isHexDigit(char c) {
  return isDigit(c) || (c >= 'A' && c <= 'F') || (c >= 'a' && c <= 'f');
}
// True for a character that may follow a number without a space between them.
bool startsValue(char c) {
  return std::string_view("!'\"+-#*?TF").find(c) != std::string_view::npos;
}

// Reads the points in order. An omitted intermittent value and "?" leave the channel's reading as it was; "*"
// repeats the number before it under the same prefix. Differences add up from the channel's last value: ' is
// the change, " the change of the change. A prefix holds for its channel until the next one. Throws Refusal
// at the first malformed value, at a value too large for a float in a channel that is used, and at a point
// before X or Y has a value.
class PointScanner {
 public:
  PointScanner(const TraceText& trace, const TraceFormat& format, float farthest)
      : mFarthest(farthest),
        mTrace(trace),
        mText(trace.text()),
        mFormat(format),
        mStates(format.channels.size()),
        mPoint(format.channels.size()) {}

  bool atEnd() const { return mAt == mText.size(); }

  // Reads one point and the comma after it; one reading for each channel.
  const std::vector<Reading>& readPoint() {
    skipSpace();
    mPointStart = mAt;
    std::size_t count = 0;
    for (; !atEnd() && mText[mAt] != ','; skipSpace()) {
      if (count == mStates.size()) throw wrongCount();
      readValue(mFormat.channels[count], mStates[count]);
      ++count;
    }
    if (count < mFormat.regularCount) throw wrongCount();
    for (std::size_t i = 0; i < mStates.size(); ++i) {
      if (isPlace(mFormat.channels[i].quantity) && !mStates[i].reading.known)
        throw badPoint("point without a place");
    }
    if (!atEnd()) {
      ++mAt;
      skipSpace();
      if (atEnd()) throw mTrace.refusalAt(mAt, "nothing follows the last comma", "");
    }
    std::transform(mStates.begin(), mStates.end(), mPoint.begin(),
                   [](const ChannelState& state) { return state.reading; });
    return mPoint;
  }

 private:
  void skipSpace() {
    while (!atEnd() && isSpace(mText[mAt])) ++mAt;
  }

  char peek() const { return atEnd() ? '\0' : mText[mAt]; }

  void readValue(const Channel& channel, ChannelState& state) {
    mValueStart = mAt;
    const char prefix = peek();
    if (prefix == '!' || prefix == '\'' || prefix == '"') {
      state.order = prefix == '!' ? Order::Value : prefix == '\'' ? Order::Change : Order::ChangeOfChange;
      ++mAt;
      skipSpace();
    }
    switch (peek()) {
      case '?':
        ++mAt;
        return;
      case '*':
        ++mAt;
        if (!state.reading.known) throw badValue("nothing before it to repeat");
        break;
      case 'T':
      case 'F':
        if (!channel.boolean) throw badValue("not a number");
        state.written = {.known = true, .value = peek() == 'T' ? 1.0 : 0.0, .nearest = 0.0f};
        ++mAt;
        break;
      default:
        state.written = readNumber();
    }
    add(state);
    if (channel.quantity == Quantity::Ignored) return;
    const float place = isPlace(channel.quantity) ? placeOf(channel, state.reading) : 0.0f;
    if (!std::isfinite(place) || !std::isfinite(state.reading.nearest)) throw badValue("number out of range");
    if (std::abs(place) > mFarthest) throw badValue("farther away than a page reaches");
  }

  void add(ChannelState& state) const {
    const double before = state.reading.value;
    if (state.order == Order::Value) {
      if (state.reading.known) state.change = state.written.value - before;
      state.reading = state.written;
      return;
    }
    if (!state.reading.known) throw badValue("a difference needs a value before it");
    state.change = state.order == Order::Change ? state.written.value : state.change + state.written.value;
    state.reading.value = before + state.change;
    state.reading.nearest = static_cast<float>(state.reading.value);
  }

  Reading readNumber() {
    const std::size_t start = mAt;
    if (peek() == '+' || peek() == '-') ++mAt;
    if (peek() == '#') return readHex(mText[start] == '-');
    const std::size_t digitsStart = mAt;
    while (isDigit(peek())) ++mAt;
    std::size_t digits = mAt - digitsStart;
    if (peek() == '.') {
      ++mAt;
      const std::size_t fractionStart = mAt;
      while (isDigit(peek())) ++mAt;
      digits += mAt - fractionStart;
    }
    if (digits == 0) throw badValue("not a number");
    if (peek() == 'e' || peek() == 'E') {
      ++mAt;
      if (peek() == '+' || peek() == '-') ++mAt;
      if (!isDigit(peek())) throw badValue("not a number");
      while (isDigit(peek())) ++mAt;
    }
    checkNumberEnds();
    const std::string_view text = mText.substr(start, mAt - start);
    const std::optional<double> value = parseDouble(text);
    const std::optional<float> nearest = parseFloat(text);
    if (!value || !nearest) throw badValue("not a number");
    return {.known = true, .value = *value, .nearest = *nearest};
  }

  // An integer such as "#1F".
  Reading readHex(bool negative) {
    constexpr std::size_t kMostDigits = 12;  // exact in a double
    ++mAt;
    const std::size_t start = mAt;
    double value = 0.0;
    for (; isHexDigit(peek()); ++mAt) {
      const char c = peek();
      value = value * 16.0 + (isDigit(c) ? c - '0' : (c | 0x20) - 'a' + 10);
    }
    if (mAt == start) throw badValue("not a number");
    if (mAt - start > kMostDigits) {
      throw badValue("more than " + std::to_string(kMostDigits) + " hexadecimal digits");
    }
    checkNumberEnds();
    if (negative) value = -value;
    return {.known = true, .value = value, .nearest = static_cast<float>(value)};
  }

  void checkNumberEnds() const {
    const char next = peek();
    if (!atEnd() && !isSpace(next) && next != ',' && !startsValue(next)) throw badValue("not a number");
  }

  std::string textUntil(std::size_t start, bool (*isEnd)(char)) const {
    constexpr std::size_t kEnough = 4096;  // a message shows far less
    const std::string_view rest = mText.substr(start, kEnough);
    std::string found(rest.begin(), std::find_if(rest.begin(), rest.end(), isEnd));
    // XML takes "\r\n" for one line end.
    for (std::size_t at = 0; (at = found.find("\r\n", at)) != std::string::npos;) found.erase(at, 1);
    return found;
  }

  Refusal badValue(const std::string& what) const {
    return mTrace.refusalAt(mValueStart, what,
                            textUntil(mValueStart, [](char c) { return isSpace(c) || c == ','; }));
  }

  Refusal wrongCount() const {
    return badPoint("point does not have the " + std::to_string(mFormat.regularCount) +
                    " values of its format");
  }

  Refusal badPoint(const std::string& what) const {
    const std::string point = trimmed(textUntil(mPointStart, [](char c) { return c == ','; }));
    return mTrace.refusalAt(mPointStart, what, point.empty() ? "\"\"" : point);
  }

  const float mFarthest;
  const TraceText& mTrace;
  std::string_view mText;
  const TraceFormat& mFormat;
  std::vector<ChannelState> mStates;
  std::vector<Reading> mPoint;
  std::size_t mAt = 0;
  std::size_t mPointStart = 0;
  std::size_t mValueStart = 0;
};

// A point's values by their meaning; not known where there is no such channel, or no value yet.
using Readings = std::array<Reading, static_cast<std::size_t>(Quantity::Time) + 1>;

const Reading& of(const Readings& readings, Quantity quantity) {
  return readings[static_cast<std::size_t>(quantity)];
}

// Sets tilt and orientation from elevation and azimuth, independently of each other; where neither is
// recorded, from the tilts along the axes.
void setAttitude(Sample& sample, const Readings& readings, bool hasSphericalAngles) {
  if (hasSphericalAngles) {
    const Reading& elevation = of(readings, Quantity::Elevation);
    const Reading& azimuth = of(readings, Quantity::Azimuth);
    if (elevation.known) sample.tilt = tiltOf(elevation.value);
    if (azimuth.known) sample.orientation = orientationOf(azimuth.value);
    return;
  }
  const Reading& tiltX = of(readings, Quantity::TiltX);
  const Reading& tiltY = of(readings, Quantity::TiltY);
  if (!tiltX.known && !tiltY.known) return;
  const double alongX = std::tan(tiltX.value);
  const double alongY = std::tan(tiltY.value);
  sample.tilt = static_cast<float>(std::atan(std::hypot(alongX, alongY)));
  // For an upright pen this is half a turn: atan2(0, -0) is pi.
  sample.orientation = orientationOf(std::atan2(alongX, -alongY));
}

}  // namespace

void readSamples(const TraceText& text, const TraceFormat& format, bool ignoresPressure, float farthest,
                 Strokes& strokes) {
  const bool hasSphericalAngles = format.has(Quantity::Elevation) || format.has(Quantity::Azimuth);
  std::size_t count = 0;
  for (PointScanner scanner(text, format, farthest); !scanner.atEnd(); ++count) {
    const std::vector<Reading>& point = scanner.readPoint();
    Sample sample;
    Readings readings;
    for (std::size_t i = 0; i < point.size(); ++i) {
      const Channel& channel = format.channels[i];
      if (channel.quantity == Quantity::X) sample.x = placeOf(channel, point[i]);
      if (channel.quantity == Quantity::Y) sample.y = placeOf(channel, point[i]);
      if (channel.quantity == Quantity::Force && point[i].known && !ignoresPressure)
        sample.pressure = pressureOf(channel, point[i]);
      Reading& reading = readings[static_cast<std::size_t>(channel.quantity)];
      reading = point[i];
      reading.value *= channel.unit;
    }
    setAttitude(sample, readings, hasSphericalAngles);
    const Reading& time = of(readings, Quantity::Time);
    sample.time = time.known ? time.value : usualTime(count);
    strokes.addSample(sample);
  }
}

}  // namespace QeltDesktop
