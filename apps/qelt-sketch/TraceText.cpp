#include "TraceText.h"

#include <algorithm>
#include <cmath>
#include <iterator>
#include <optional>
#include <string_view>

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
        mText(trace.text()),
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
    const std::string_view text = mText.substr(start, mAt - start);
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
    constexpr std::size_t kEnough = 4096;  // a refusal shows far less
    const std::string_view rest = mText.substr(start, kEnough);
    std::string found(rest.begin(), std::find_if(rest.begin(), rest.end(), isEnd));
    // XML counts "\r\n" as one.
    for (std::size_t at = 0; (at = found.find("\r\n", at)) != std::string::npos;) found.erase(at, 1);
    return found;
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
  std::string_view mText;
  const TraceFormat& mFormat;
  std::vector<ChannelState> mStates;
  std::vector<Reading> mPoint;
  std::size_t mAt = 0;
  std::size_t mPointStart = 0;
  std::size_t mValueStart = 0;
};

void TraceText::add(const XmlText& added) {
  const std::string_view source = mSource.text();
  const bool goesOn = !mPieces.empty() && added.offset == mSourceEnd;
  if (!mCopied && (added.replaced || (!goesOn && !mPieces.empty()))) {
    const std::string_view start = text();
    // Up to the next end tag, most likely the trace's own: a copy that grows piece by piece is held twice at
    // times.
    const std::size_t end = std::min(source.find("</", added.offset), source.size());
    mCopy.reserve(start.size() + (end - added.offset));
    mCopy = start;
    mCopied = true;
  }
  // What stands between two pieces only counts where it ends a line.
  if (mPieces.empty() || lineEndsIn(source.substr(mSourceEnd, added.offset - mSourceEnd)) > 0)
    mPieces.push_back({mCopied ? mCopy.size() : 0, added.offset});
  mSourceEnd = added.offset + added.length;
  if (!mCopied) return;
  if (!added.replaced) {
    mCopy += source.substr(added.offset, added.length);
  } else if (trimmed(added.value).empty()) {
    mCopy += ' ';  // a line end that is written as a reference ends no line of the source
  } else {
    mCopy += added.value;
  }
}

std::string_view TraceText::text() const {
  if (mCopied) return mCopy;
  if (mPieces.empty()) return {};
  const std::size_t start = mPieces.front().offset;
  return std::string_view(mSource.text()).substr(start, mSourceEnd - start);
}

bool TraceText::isBlank() const {
  const std::string_view all = text();
  return std::all_of(all.begin(), all.end(), isSpace);
}

void TraceText::forEachPoint(const TraceFormat& format,
                             const std::function<void(const std::vector<Reading>&)>& take) const {
  Scanner scanner(*this, format);
  while (!scanner.atEnd()) take(scanner.readPoint());
}

int TraceText::lineAt(std::size_t at) const {
  const auto next =
      std::upper_bound(mPieces.begin(), mPieces.end(), at,
                       [](std::size_t offset, const Piece& piece) { return offset < piece.start; });
  const Piece& piece = *std::prev(next);
  return mSource.lineAt(piece.offset) + lineEndsIn(text().substr(piece.start, at - piece.start));
}

}  // namespace QeltDesktop
