#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <vector>

#include <pugixml.hpp>

#include "SourceText.h"
#include "TraceFormat.h"

namespace QeltDesktop {

// One channel's value at one point.
struct Reading {
  bool known = false;  // false until the channel has had a value, and where "?" says it has none
  double value = 0.0;
  float nearest = 0.0f;  // of a plain number the float nearest to the decimal, rounded once
};

// The characters of a <trace>, without comments, and the lines they come from.
class TraceText {
 public:
  TraceText(const SourceText& source, const pugi::xml_node& trace);

  // Hands over the points in order, one reading a channel. An omitted intermittent value and "?" leave the
  // channel's reading as it was; "*" repeats the number before it under the same prefix. Differences add up
  // from the channel's last value: ' is the change, " the change of the change; a prefix holds for its
  // channel until the next one. Throws Refusal at the first malformed value, at one that no float can
  // hold in a channel that we use, and at a point before X or Y has a value.
  void forEachPoint(const TraceFormat& format,
                    const std::function<void(const std::vector<Reading>&)>& take) const;

 private:
  class Scanner;
  struct Piece {
    std::size_t start;  // in mText
    int line;
  };

  int lineAt(std::size_t offset) const;

  const SourceText& mSource;
  std::string mText;
  std::vector<Piece> mPieces;
};

}  // namespace QeltDesktop
