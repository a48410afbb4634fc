#pragma once

#include <cstddef>
#include <deque>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "Ink.h"
#include "Refusal.h"
#include "SourceText.h"
#include "TraceFormat.h"
#include "XmlWalk.h"

namespace QeltDesktop {

// Far deeper than any real page.
constexpr int kDeepestNesting = 200;

// Qelt::ToolType of an <annotation type="tool"> at that offset; throws Refusal for an unknown tool.
int toolNamed(const SourceText& source, std::size_t offset, std::string_view text);

// A reference as it is written ("#id"), and the element it stands in.
struct Reference {
  const char* attribute = "";
  std::optional<std::string> name;
  std::size_t offset = 0;
};
Reference referenceIn(const XmlElement& element, const char* attribute);

// What the traces of a page can refer to, wherever it stands in the document. Brushes, contexts and formats
// are numbered from 0 in the order of their start tags, <ink> and the groups too; what an <annotationXML>
// holds does not count. Whatever is looked up more than once is worked out once.
class Definitions {
 public:
  // Reads the document through. Throws Refusal where it is not XML, not InkML, or a definition in it is
  // malformed, even when no trace uses it. The source outlives this.
  explicit Definitions(const SourceText& source);

  std::size_t traceCount() const { return mTraceCount; }
  // The tool that a group's own annotation names; throws Refusal for an unknown one.
  std::optional<int> toolOfGroup(std::size_t group) const;
  const TraceFormat& format(std::size_t format) const { return mFormats[format]; }

  // What is referred to; none without the attribute, and for the defaults that every document has
  // ("#DefaultBrush"). These throw Refusal for a reference to what is not there, or back to itself.
  std::optional<std::size_t> brushNamed(const Reference& reference) const;
  std::optional<std::size_t> contextNamed(const Reference& reference) const;
  // A brush with what it takes over from those it refers to.
  const Brush& brush(std::size_t brush);
  // A context's brush: its own, the one it refers to, or that of the context it builds on. Its format in the
  // same way; an ink source brings one too.
  std::optional<std::size_t> brushOfContext(std::size_t context);
  std::optional<std::size_t> formatOfContext(std::size_t context);

 private:
  class Collector;
  enum class Kind { Brush, Context, Format, Source };
  enum class State { Unknown, Asked, Known };

  struct BrushEntry {
    std::size_t offset;
    Reference base;
    Brush brush;  // its own properties; once known, those taken over too
    State state = State::Unknown;
  };
  // Found along a chain of contexts.
  struct Found {
    std::optional<std::size_t> index;
    State state = State::Unknown;
  };
  struct ContextEntry {
    std::size_t offset;
    Reference brushReference, formatReference, sourceReference, base;
    std::optional<std::size_t> ownBrush, ownFormat, ownSource;
    Found brush, format;
  };
  struct Named {
    Kind kind;
    std::size_t index;
  };

  std::optional<std::size_t> named(const Reference& reference, Kind kind) const;
  std::optional<std::size_t> brushIn(const ContextEntry& context) const;
  std::optional<std::size_t> formatIn(const ContextEntry& context) const;
  std::optional<std::size_t> alongContexts(std::size_t context, Found ContextEntry::*result,
                                           std::optional<std::size_t> (Definitions::*in)(const ContextEntry&)
                                               const);

  const SourceText& mSource;
  std::deque<BrushEntry> mBrushes;
  std::deque<ContextEntry> mContexts;
  std::vector<TraceFormat> mFormats;
  std::vector<std::optional<std::size_t>> mSources;  // the format of each
  std::map<std::string, Named> mById;
  std::vector<std::optional<int>> mGroupTools;
  std::map<std::size_t, Refusal> mMalformedTools;  // by group
  std::size_t mTraceCount = 0;
};

}  // namespace QeltDesktop
