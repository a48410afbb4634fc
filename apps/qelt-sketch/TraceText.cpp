#include "TraceText.h"

#include <algorithm>
#include <cmath>
#include <iterator>
#include <optional>
#include <string_view>

#include "InkmlNode.h"
#include "NumberText.h"

namespace QeltDesktop {
namespace {

enum class Order { Value, Change, ChangeOfChange };

// What a channel remembers from point to point.
struct ChannelState {
  Order order = Order::Value;
  Reading reading;
  Reading written;      // the last number as it stood there, for "*"
  double change = 0.0;  // from the value before the last to the last
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
// What may follow a number without a space between.
bool startsValue(char c) {
  return std::string_view("!'\"+-#*?TF").find(c) != std::string_view::npos;
}

}  // namespace

// Walks the text value by value.
class TraceText::Scanner {
 public:
  Scanner(const TraceText& trace, const TraceFormat& format)
      : mTrace(trace),
        mText(trace.mText),
        mFormat(format),
        mStates(format.channels.size()),
        mPoint(format.channels.size()) {}

  bool atEnd() const { return mAt == mText.size(); }

  // Reads one point and the comma after it.
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
      const Quantity quantity = mFormat.channels[i].quantity;
      const bool isPlace = quantity == Quantity::X || quantity == Quantity::Y;
      if (isPlace && !mStates[i].reading.known) throw badPoint("point without a place");
    }
    if (!atEnd()) {
      ++mAt;
      skipSpace();
      // A comma promises another point.
      if (atEnd()) throw mTrace.mSource.refusal(mTrace.lineAt(mAt), "nothing follows the last comma", "");
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
    if (channel.quantity != Quantity::Ignored && !std::isfinite(state.reading.nearest)) {
      throw badValue("number out of range");
    }
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
    const std::string_view text = std::string_view(mText).substr(start, mAt - start);
    const std::optional<double> value = parseDouble(text);
    const std::optional<float> nearest = parseFloat(text);
    if (!value || !nearest) throw badValue("not a number");
    return {.known = true, .value = *value, .nearest = *nearest};
  }

  // "#1F", an integer.
  Reading readHex(bool negative) {
    constexpr std::size_t kMostDigits = 12;  // exact in a double
    ++mAt;
    const std::size_t start = mAt;
    double value = 0.0;
    for (; isHexDigit(peek()); ++mAt) {
      const char c = peek();
      value = value * 16.0 + (isDigit(c) ? c - '0' : (c | 0x20) - 'a' + 10);
    }
    if (mAt == start || mAt - start > kMostDigits) throw badValue("not a number");
    checkNumberEnds();
    if (negative) value = -value;
    return {.known = true, .value = value, .nearest = static_cast<float>(value)};
  }

  void checkNumberEnds() const {
    const char next = peek();
    if (!atEnd() && !isSpace(next) && next != ',' && !startsValue(next)) throw badValue("not a number");
  }

  std::string textUntil(std::size_t start, bool (*isEnd)(char)) const {
    const auto first = mText.begin() + static_cast<std::ptrdiff_t>(start);
    return std::string(first, std::find_if(first, mText.end(), isEnd));
  }

  Refusal badValue(const std::string& what) const {
    return mTrace.mSource.refusal(mTrace.lineAt(mValueStart), what,
                                  textUntil(mValueStart, [](char c) { return isSpace(c) || c == ','; }));
  }

  Refusal wrongCount() const {
    return badPoint("point does not have the " + std::to_string(mFormat.regularCount) +
                    " values of its format");
  }

  Refusal badPoint(const std::string& what) const {
    const std::string point = trimmed(textUntil(mPointStart, [](char c) { return c == ','; }));
    return mTrace.mSource.refusal(mTrace.lineAt(mPointStart), what, point.empty() ? "\"\"" : point);
  }

  const TraceText& mTrace;
  const std::string& mText;
  const TraceFormat& mFormat;
  std::vector<ChannelState> mStates;
  std::vector<Reading> mPoint;
  std::size_t mAt = 0;
  std::size_t mPointStart = 0;
  std::size_t mValueStart = 0;
};

TraceText::TraceText(const SourceText& source, const pugi::xml_node& trace) : mSource(source) {
  for (const pugi::xml_node& child : trace) {
    if (child.type() == pugi::node_pcdata || child.type() == pugi::node_cdata) {
      mPieces.push_back({mText.size(), lineOf(source, child)});
      mText += child.value();
    } else if (child.type() == pugi::node_element && localName(child) != "annotation" &&
               localName(child) != "annotationXML") {
      throw refusalAt(source, child, "element that a trace cannot hold", child.name());
    }
  }
  if (trimmed(mText).empty()) throw refusalAt(source, trace, "trace without points", "");
}

void TraceText::forEachPoint(const TraceFormat& format,
                             const std::function<void(const std::vector<Reading>&)>& take) const {
  Scanner scanner(*this, format);
  while (!scanner.atEnd()) take(scanner.readPoint());
}

int TraceText::lineAt(std::size_t offset) const {
  const auto next = std::upper_bound(mPieces.begin(), mPieces.end(), offset,
                                     [](std::size_t at, const Piece& piece) { return at < piece.start; });
  const Piece& piece = *std::prev(next);
  const auto first = mText.begin() + static_cast<std::ptrdiff_t>(piece.start);
  const auto last = mText.begin() + static_cast<std::ptrdiff_t>(std::min(offset, mText.size()));
  return piece.line + static_cast<int>(std::count(first, last, '\n'));
}

}  // namespace QeltDesktop
