#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "SourceText.h"
#include "TraceFormat.h"
#include "XmlWalk.h"

namespace QeltDesktop {

// One channel's value at one point.
struct Reading {
  bool known = false;  // false until the channel has had a value, and where "?" says it has none
  double value = 0.0;
  float nearest = 0.0f;  // of a plain number the float nearest to the decimal, rounded once
};

// The characters of a <trace>, without comments, and the lines they come from. As long as they stand in one
// piece in the source they are not copied.
class TraceText {
 public:
  // The source outlives it.
  explicit TraceText(const SourceText& source) : mSource(source) {}

  void add(const XmlText& added);
  // Nothing but space.
  bool isBlank() const;

  // Hands over the points in order, one reading a channel. An omitted intermittent value and "?" leave the
  // channel's reading as it was; "*" repeats the number before it under the same prefix. Differences add up
  // from the channel's last value: ' is the change, " the change of the change; a prefix holds for its
  // channel until the next one. Throws Refusal at the first malformed value, at one that no float can
  // hold in a channel that we use, and at a point before X or Y has a value.
  void forEachPoint(const TraceFormat& format,
                    const std::function<void(const std::vector<Reading>&)>& take) const;

 private:
  class Scanner;
  // Characters with no line end between them in the source that is not one of them.
  struct Piece {
    std::size_t start;   // in the text
    std::size_t offset;  // in the source
  };

  std::string_view text() const;
  int lineAt(std::size_t at) const;

  const SourceText& mSource;
  std::vector<Piece> mPieces;
  std::size_t mSourceEnd = 0;  // of the last piece
  std::string mCopy;           // empty while the text is the one piece
  bool mCopied = false;
};

}  // namespace QeltDesktop
