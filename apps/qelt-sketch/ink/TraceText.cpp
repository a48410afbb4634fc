#include "ink/TraceText.h"

#include <algorithm>
#include <iterator>
#include <string_view>

namespace QeltDesktop {

void TraceText::add(const XmlText& added) {
  const std::string_view source = mSource.text();
  const bool goesOn = !mPieces.empty() && added.offset == mSourceEnd;
  if (!mCopied && (added.replaced || (!goesOn && !mPieces.empty()))) {
    const std::string_view start = text();
    // Room up to the next end tag, most likely the trace's own: a copy that has to grow exists twice for a
    // moment.
    const std::size_t end = std::min(source.find("</", added.offset), source.size());
    mCopy.reserve(start.size() + (end - added.offset));
    mCopy = start;
    mCopied = true;
  }
  // What lies between two pieces in the source, a comment say, matters only for the lines that it ends.
  if (mPieces.empty() || lineEndsIn(source.substr(mSourceEnd, added.offset - mSourceEnd)) > 0)
    mPieces.push_back({mCopied ? mCopy.size() : 0, added.offset});
  mSourceEnd = added.offset + added.length;
  if (!mCopied) return;
  if (!added.replaced) {
    mCopy += source.substr(added.offset, added.length);
  } else if (trimmed(added.value).empty()) {
    mCopy += ' ';  // "&#10;" does not end a line of the source
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
  return all.find_first_not_of(kXmlSpace) == std::string_view::npos;
}

Refusal TraceText::refusalAt(std::size_t at, const std::string& what, const std::string& value) const {
  const auto next =
      std::upper_bound(mPieces.begin(), mPieces.end(), at,
                       [](std::size_t offset, const Piece& piece) { return offset < piece.start; });
  const Piece& piece = *std::prev(next);
  const int line = mSource.lineAt(piece.offset) + lineEndsIn(text().substr(piece.start, at - piece.start));
  return mSource.refusal(line, what, value);
}

}  // namespace QeltDesktop
