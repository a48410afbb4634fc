#include "ink/InkmlWriter.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <limits>
#include <map>
#include <numbers>
#include <optional>
#include <tuple>
#include <utility>
#include <vector>

#include "engine/MotionEvent.h"
#include "ink/Angles.h"
#include "text/NumberText.h"

namespace QeltDesktop {
namespace {

// What the reader takes for a number.
template <typename Number>
Number writable(Number value, Number otherwise) {
  constexpr Number kMost = std::numeric_limits<float>::max();
  return std::isnan(value) ? otherwise : std::clamp(value, -kMost, kMost);
}

Sample writable(const Sample& sample, std::size_t index) {
  const Sample plain;
  return {.x = writable(sample.x, plain.x),
          .y = writable(sample.y, plain.y),
          .pressure = writable(sample.pressure, plain.pressure),
          .tilt = writable(sample.tilt, plain.tilt),
          .orientation = writable(sample.orientation, plain.orientation),
          .time = writable(sample.time, usualTime(index))};
}

// Without lengths that the reader refuses.
Brush writable(const Brush& brush) {
  Brush kept = brush;
  for (std::optional<float>* const length : {&kept.width, &kept.outlineSize}) {
    if (*length && !(**length > 0.0f && std::isfinite(**length))) length->reset();
  }
  return kept;
}

struct BrushOrder {
  static auto properties(const Brush& brush) {
    return std::tie(brush.width, brush.rgb, brush.transparency, brush.renderingVersion, brush.curve,
                    brush.outlineSize, brush.outlineArgb);
  }
  bool operator()(const Brush& one, const Brush& other) const { return properties(one) < properties(other); }
};

bool differ(float one, float other) {
  return one != other || std::signbit(one) != std::signbit(other);
}
bool differ(double one, double other) {
  return one != other || std::signbit(one) != std::signbit(other);
}

// The channels besides X and Y that the samples need.
struct Recorded {
  bool pressure = false, tilt = false, orientation = false, time = false;

  void add(const Sample& sample, std::size_t index) {
    const Sample plain;
    pressure = pressure || differ(sample.pressure, plain.pressure);
    tilt = tilt || differ(sample.tilt, plain.tilt);
    orientation = orientation || differ(sample.orientation, plain.orientation);
    time = time || differ(sample.time, usualTime(index));
  }
};

void appendElevation(std::string& out, float tilt) {
  appendDecimal(out, std::numbers::pi / 2.0 - tilt,
                [tilt](double elevation) { return !differ(tiltOf(elevation), tilt); });
}

void appendAzimuth(std::string& out, float orientation) {
  // Half a turn as a float lies beyond half a turn, and what is beyond it comes back from the other side.
  const bool halfTurn = std::fabs(orientation) == std::numbers::pi_v<float>;
  const double inRange = halfTurn ? std::copysign(std::numbers::pi, orientation) : orientation;
  appendDecimal(out, inRange,
                [orientation](double azimuth) { return !differ(orientationOf(azimuth), orientation); });
}

class Writer {
 public:
  explicit Writer(const Strokes& strokes) : mStrokes(strokes) {}

  std::string text() {
    std::map<Brush, std::size_t, BrushOrder> numbers;
    for (const Stroke& stroke : mStrokes) {
      std::size_t index = 0;
      for (const Sample& sample : stroke.samples) mRecorded.add(writable(sample, index), index), ++index;
      mBrushes.push_back(numbers.emplace(writable(stroke.brush), numbers.size()).first->second);
    }
    // A trace without a brushRef would get the brush defined last.
    mNamesBrushes = numbers.size() > 1 || numbers.count(Brush{}) == 0;
    mText =
        "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
        "<ink xmlns=\"http://www.w3.org/2003/InkML\">\n";
    appendFormat();
    for (const auto& [brush, number] : numbers) {
      if (mNamesBrushes) appendBrush(brush, number);
    }
    for (std::size_t i = 0; i < mStrokes.size(); ++i) appendTrace(i);
    mText += "</ink>\n";
    return std::move(mText);
  }

 private:
  void appendFormat() {
    mText += "  <traceFormat>\n";
    const auto channel = [&](bool recorded, const char* name, const char* rest = "") {
      if (recorded)
        mText += std::string("    <channel name=\"") + name + "\" type=\"decimal\"" + rest + "/>\n";
    };
    channel(true, "X");
    channel(true, "Y");
    channel(mRecorded.pressure, "F");
    channel(mRecorded.tilt, "OE", " units=\"rad\"");
    channel(mRecorded.orientation, "OA", " units=\"rad\"");
    channel(mRecorded.time, "T", " units=\"ms\"");
    mText += "  </traceFormat>\n";
  }

  void appendBrush(const Brush& brush, std::size_t number) {
    mText += "  <brush xml:id=\"b" + std::to_string(number) + "\">\n";
    const auto property = [&](const char* name, const std::string& value) {
      mText += std::string("    <brushProperty name=\"") + name + "\" value=\"" + value + "\"/>\n";
    };
    const auto length = [](float value) {
      std::string digits;
      appendNumber(digits, value);
      return digits;
    };
    if (brush.width) property("width", length(*brush.width));
    if (brush.rgb) property("color", formatArgb(*brush.rgb).erase(1, 2));
    if (brush.transparency) property("transparency", std::to_string(int{*brush.transparency}));
    if (brush.renderingVersion) property("renderingVersion", std::to_string(*brush.renderingVersion));
    if (brush.curve) property("curve", *brush.curve ? "true" : "false");
    if (brush.outlineSize) property("outlineSize", length(*brush.outlineSize));
    if (brush.outlineArgb) property("outlineColor", formatArgb(*brush.outlineArgb));
    mText += "  </brush>\n";
  }

  void appendTrace(std::size_t number) {
    const Stroke stroke = mStrokes[number];
    mText += "  <trace";
    if (mNamesBrushes) mText += " brushRef=\"#b" + std::to_string(mBrushes[number]) + "\"";
    mText += ">";
    if (const char* const tool = toolName(stroke.tool))
      mText += std::string("<annotation type=\"tool\">") + tool + "</annotation>";
    std::size_t index = 0;
    for (const Sample& sample : stroke.samples) {
      if (index > 0) mText += ", ";
      appendPoint(writable(sample, index));
      ++index;
    }
    mText += "</trace>\n";
  }

  static const char* toolName(std::optional<int> tool) {
    if (tool == Qelt::kToolStylus) return "stylus";
    if (tool == Qelt::kToolFinger) return "finger";
    if (tool == Qelt::kToolMouse) return "mouse";
    return nullptr;
  }

  void appendPoint(const Sample& sample) {
    appendNumber(mText, sample.x);
    mText += ' ';
    appendNumber(mText, sample.y);
    if (mRecorded.pressure) mText += ' ', appendNumber(mText, sample.pressure);
    if (mRecorded.tilt) mText += ' ', appendElevation(mText, sample.tilt);
    if (mRecorded.orientation) mText += ' ', appendAzimuth(mText, sample.orientation);
    if (mRecorded.time) mText += ' ', appendNumber(mText, sample.time);
  }

  const Strokes& mStrokes;
  Recorded mRecorded;
  std::vector<std::size_t> mBrushes;  // the number of each stroke's
  bool mNamesBrushes = false;
  std::string mText;
};

}  // namespace

std::string writeInkml(const Strokes& strokes) {
  return Writer(strokes).text();
}

}  // namespace QeltDesktop
