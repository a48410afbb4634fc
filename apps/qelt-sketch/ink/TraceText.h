#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "ink/SourceText.h"
#include "ink/XmlWalk.h"

namespace QeltDesktop {

// The characters of a <trace>, without comments, and the lines they come from. They are copied only when they
// do not stand in one piece in the source.
class TraceText {
 public:
  // The source outlives it.
  explicit TraceText(const SourceText& source) : mSource(source) {}

  void add(const XmlText& added);
  // True if there is nothing but white space.
  bool isBlank() const;

  std::string_view text() const;
  // The refusal of what stands at `at` in the text, naming its line in the source.
  Refusal refusalAt(std::size_t at, const std::string& what, const std::string& value) const;

 private:
  // A run of characters. Between them the source has no line end other than those among them.
  struct Piece {
    std::size_t start;   // in the text
    std::size_t offset;  // in the source
  };

  const SourceText& mSource;
  std::vector<Piece> mPieces;
  std::size_t mSourceEnd = 0;  // of the last piece
  std::string mCopy;           // the text, once it is not one piece of the source
  bool mCopied = false;
};

}  // namespace QeltDesktop
