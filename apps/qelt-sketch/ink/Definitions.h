#pragma once

#include <cstddef>
#include <cstdint>
#include <deque>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "ink/Ink.h"
#include "ink/SourceText.h"
#include "ink/TraceFormat.h"
#include "ink/XmlWalk.h"
#include "text/Refusal.h"

namespace QeltDesktop {

// Far deeper than any real page.
constexpr int kDeepestNesting = 200;

// The Qelt::ToolType that an <annotation type="tool"> at `offset` names; throws Refusal for an unknown tool.
int toolNamed(const SourceText& source, std::size_t offset, std::string_view text);

// A reference as it is written ("#id"), and where its element begins.
struct Reference {
  const char* attribute = "";
  std::optional<std::string> name;
  std::size_t offset = 0;
};
Reference referenceIn(const XmlElement& element, const char* attribute);

// Everything in a document that its traces can refer to. Brushes, contexts and formats are numbered from 0 in
// the order of their start tags, and so are <ink> and the groups, as one kind; the contents of an
// <annotationXML> do not count. Each lookup is worked out only once.
class Definitions {
 public:
  // Reads the whole document. Throws Refusal where it is not XML or not InkML, or where a definition is
  // malformed, even when no trace uses it. The source outlives this.
  explicit Definitions(const SourceText& source);

  std::size_t traceCount() const { return mTraceCount; }
  // The tool that a group's own annotation names, if any; throws Refusal for an unknown tool. Only for groups
  // that are drawn: those that lie in nothing but groups.
  std::optional<int> toolOfGroup(std::size_t group) const;
  // A format as the ink source counts that is given, else the one that it stands in. Without a format, the
  // one that traces have by default. Valid until the next call.
  const TraceFormat& format(std::optional<std::size_t> format, std::optional<std::size_t> source);

  // The number that a reference leads to; none without the attribute, and for the defaults that every
  // document has ("#DefaultBrush"). These functions throw Refusal for a reference that leads nowhere or back
  // to itself.
  std::optional<std::size_t> brushNamed(const Reference& reference) const;
  std::optional<std::size_t> contextNamed(const Reference& reference) const;
  // A brush together with the properties of those it builds on, as an index into `takeBrushes`; kNoNumber if
  // it has no properties.
  std::uint32_t brush(std::size_t brush);
  // Whether strokes of a brush that `brush` returned are drawn as if without pressure.
  bool ignoresPressure(std::uint32_t brushText) const;
  // A context's brush: its own, else the one it refers to, else that of the context it builds on. Its ink
  // source in the same way, and its format, where an ink source may give one too.
  std::optional<std::size_t> brushOfContext(std::size_t context);
  std::optional<std::size_t> formatOfContext(std::size_t context);
  std::optional<std::size_t> sourceOfContext(std::size_t context);
  // The properties of the brushes, to be taken once all traces are read.
  std::deque<Brush> takeBrushes() { return std::move(mBrushTexts); }

 private:
  // A page may consist of definitions as short as "<brush/>". So that they take little more memory than their
  // text, each has a small record of numbers, and what only few definitions have is kept elsewhere.

  class Collector;
  enum class Kind { Brush, Context, Format, Source };
  enum State : std::uint32_t { kUnknown, kAsked, kKnown };

  struct BrushEntry {
    std::uint32_t text = kNoNumber;       // its properties; once it is known, with those taken over
    std::uint32_t base : 30 = kNoNumber;  // a reference
    std::uint32_t state : 2 = kUnknown;
  };
  // What was found along a chain of contexts.
  struct Found {
    std::uint32_t number : 30 = kNoNumber;
    std::uint32_t state : 2 = kUnknown;
  };
  struct ContextEntry {
    std::uint32_t part = kNoNumber;  // the last one that it has
    Found brush, format, source;
  };
  struct SourceEntry {
    std::uint32_t format = kNoNumber;
    std::uint32_t resolution = kNoNumber;  // the last one that it has
  };
  struct ResolutionEntry {
    Resolution stated;
    std::uint32_t before;  // the source's resolution before this one
  };
  // What a context refers to, or the first definition of a kind in it.
  enum class Part : std::uint64_t { BrushRef, FormatRef, SourceRef, Base, OwnBrush, OwnFormat, OwnSource };
  struct ContextPart {
    Part part : 4;
    std::uint64_t number : 30;
    std::uint64_t before : 30;  // the context's part before this one
  };
  static_assert(sizeof(ContextPart) == 8);
  // A reference as it is written, kept for later.
  struct KeptReference {
    std::size_t offset;
    const char* name;
  };
  struct Id {
    const char* name;
    std::size_t offset;
    std::uint32_t number : 30;
    std::uint32_t kind : 2;
  };

  const char* keptText(std::string_view text);
  std::uint32_t keptReference(const Reference& reference);
  Reference referenceOf(std::uint32_t kept, const char* attribute) const;
  void sortIds();
  std::optional<std::size_t> named(const Reference& reference, Kind kind) const;
  std::optional<std::uint32_t> partOf(const ContextEntry& context, Part part) const;
  std::optional<std::size_t> referredTo(const ContextEntry& context, Part part, const char* attribute,
                                        Kind kind) const;
  std::optional<std::size_t> brushIn(const ContextEntry& context) const;
  std::optional<std::size_t> formatIn(const ContextEntry& context) const;
  std::optional<std::size_t> sourceIn(const ContextEntry& context) const;
  std::optional<std::size_t> alongContexts(std::size_t context, Found ContextEntry::*result,
                                           std::optional<std::size_t> (Definitions::*in)(const ContextEntry&)
                                               const);

  const SourceText& mSource;
  std::deque<std::vector<char>> mTexts;  // blocks of ids and references, which never move
  std::deque<BrushEntry> mBrushes;
  std::deque<Brush> mBrushTexts;
  std::deque<std::optional<bool>> mIgnoringPressure;  // of each of the texts
  std::deque<ContextEntry> mContexts;
  std::deque<ContextPart> mContextParts;
  std::deque<TraceFormat> mFormats;
  std::deque<std::uint32_t> mFormatSources;  // the ink source that each format stands in
  std::deque<SourceEntry> mSources;
  std::deque<ResolutionEntry> mResolutions;
  // What `format` returned last, and from which format and ink source.
  TraceFormat mApplied;
  std::uint32_t mAppliedFormat = kNoNumber, mAppliedSource = kNoNumber;
  std::deque<KeptReference> mReferences;
  std::deque<Id> mIds;  // sorted by name, once the document is read
  std::deque<std::uint8_t> mGroupTools;
  // The first group that is drawn and names an unknown tool, with the refusal of that tool.
  std::optional<std::pair<std::size_t, Refusal>> mMalformedTool;
  std::size_t mTraceCount = 0;
};

}  // namespace QeltDesktop
