#include "ink/Definitions.h"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <utility>

#include "engine/MotionEvent.h"
#include "ink/Lengths.h"
#include "text/NumberText.h"

namespace QeltDesktop {
namespace {

// Far above those that any pen has.
constexpr int kHighestVersion = 99;

// Reads one property of a brush into what is known of it.
class BrushPropertyReader {
 public:
  BrushPropertyReader(const SourceText& source, const XmlElement& element)
      : mSource(source),
        mOffset(element.offset()),
        mName(element.text("name")),
        mValue(element.text("value")),
        mUnits(element.text("units")) {}

  void readInto(Brush& brush, std::optional<bool>& ignoresPressure) const {
    if (mName == "width") {
      brush.width = length();
    } else if (mName == "color") {
      brush.rgb = color(parseRgb(mValue), "#RRGGBB");
    } else if (mName == "transparency") {
      const std::optional<float> transparency = parseFloat(mValue);
      if (!transparency || !(*transparency >= 0.0f && *transparency <= 255.0f))
        throw malformed("must be a number from 0 to 255");
      brush.transparency = static_cast<std::uint8_t>(std::lround(*transparency));
    } else if (mName == "ignorePressure") {
      ignoresPressure = choice();
    } else if (mName == "renderingVersion") {
      const std::optional<int> version = parseInt(mValue);
      // Each takes a pen of its own, so a page must not name any number of them.
      if (!version || *version < 1 || *version > kHighestVersion)
        throw malformed("must be a whole number from 1 to " + std::to_string(kHighestVersion));
      brush.renderingVersion = version;
    } else if (mName == "curve") {
      brush.curve = choice();
    } else if (mName == "outlineSize") {
      brush.outlineSize = length();
    } else if (mName == "outlineColor") {
      brush.outlineArgb = color(parseArgb(mValue), "#AARRGGBB");
    }
  }

 private:
  float length() const {
    const std::optional<double> unit = strokeUnitsIn(mUnits);
    if (!unit && !isUnitless(mUnits))
      throw mSource.refusalAt(mOffset, "unknown unit of brush " + mName, mUnits);
    const std::optional<float> number = parseFloat(mValue);
    if (!number || !std::isfinite(*number) || *number <= 0.0f) throw malformed("must be a number above 0");
    if (!unit || *unit == 1.0) return *number;
    const auto strokeUnits = static_cast<float>(*parseDouble(mValue) * *unit);
    if (!std::isfinite(strokeUnits) || strokeUnits <= 0.0f) throw malformed("is out of range");
    return strokeUnits;
  }

  bool choice() const {
    const bool on = mValue == "true" || mValue == "1";
    if (!on && mValue != "false" && mValue != "0") throw malformed("must be true or false");
    return on;
  }

  unsigned int color(std::optional<unsigned int> parsed, const char* form) const {
    if (!parsed) throw malformed(std::string("must be ") + form);
    return *parsed;
  }

  Refusal malformed(const std::string& what) const {
    return mSource.refusalAt(mOffset, "brush " + mName + " " + what, mValue.empty() ? "\"\"" : mValue);
  }

  const SourceText& mSource;
  std::size_t mOffset;
  std::string mName, mValue, mUnits;
};

// Fills in from `base` what `brush` leaves open.
void takeOver(Brush& brush, const Brush& base) {
  const auto fillIn = [&](auto property) {
    if (!(brush.*property)) brush.*property = base.*property;
  };
  fillIn(&Brush::width);
  fillIn(&Brush::rgb);
  fillIn(&Brush::transparency);
  fillIn(&Brush::renderingVersion);
  fillIn(&Brush::curve);
  fillIn(&Brush::outlineSize);
  fillIn(&Brush::outlineArgb);
}

// For groups, besides the tools themselves.
constexpr std::uint8_t kNoGroupTool = 255, kUnknownTool = 254;

std::string trimmedLower(std::string_view text) {
  std::string name = trimmed(text);
  for (char& c : name) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  return name;
}

std::optional<int> toolCalled(const std::string& name) {
  if (name == "stylus" || name == "pen") return Qelt::kToolStylus;
  if (name == "finger" || name == "touch") return Qelt::kToolFinger;
  if (name == "mouse") return Qelt::kToolMouse;
  return std::nullopt;
}

Refusal unknownTool(const SourceText& source, std::size_t offset, std::string_view text) {
  const std::string name = trimmedLower(text);
  return source.refusalAt(offset, "unknown tool", name.empty() ? "\"\"" : name);
}

}  // namespace

int toolNamed(const SourceText& source, std::size_t offset, std::string_view text) {
  const std::optional<int> tool = toolCalled(trimmedLower(text));
  if (!tool) throw unknownTool(source, offset, text);
  return *tool;
}

Reference referenceIn(const XmlElement& element, const char* attribute) {
  return {.attribute = attribute, .name = element.attribute(attribute), .offset = element.offset()};
}

// Collects the definitions while the document is walked through.
class Definitions::Collector final : public XmlVisitor {
 public:
  explicit Collector(Definitions& definitions) : mAll(definitions), mSource(definitions.mSource) {}

  void elementBegins(const XmlElement& element) override {
    refusingInOrder([&] { begin(element); });
  }

  void elementEnds() override {
    if (mSkippedDepth > 0) {
      --mSkippedDepth;
      return;
    }
    const Open open = std::move(mOpen.back());
    mOpen.pop_back();
    if (open.what == What::Format) {
      refusingInOrder([&] {
        mAll.mFormats[open.index] = traceFormatOf(mSource, open.offset, open.regular, open.intermittent);
      });
    }
    if (open.what == What::Tool) takeTool(open);
  }

  void textComes(const XmlText& text) override {
    if (mSkippedDepth == 0 && mOpen.back().what == What::Tool) mOpen.back().text += text.value;
  }

 private:
  enum class What { Other, Group, Brush, Context, Format, Intermittent, Source, Properties, Tool };
  struct Open {
    What what = What::Other;
    std::size_t index = 0;  // among its kind; of a tool, the group's, of properties, the source's
    std::size_t offset = 0;
    std::vector<ChannelText> regular, intermittent;
    std::string text;
  };

  // Ids are compared only when all are known. If something is refused before that, an id that was given twice
  // up to there is refused first, as it stands earlier in the document.
  template <typename Read>
  void refusingInOrder(const Read& read) {
    try {
      read();
    } catch (const Refusal&) {
      mAll.sortIds();
      throw;
    }
  }

  void begin(const XmlElement& element) {
    const std::string_view name = element.name();
    if (mSkippedDepth > 0 || (name == "annotationXML" && !mOpen.empty())) {
      ++mSkippedDepth;
      return;
    }
    if (mOpen.empty() && name != "ink") {
      throw mSource.refusalAt(element.offset(), "not InkML, the root element is", element.qualifiedName());
    }
    if (mOpen.size() > kDeepestNesting) {
      throw mSource.refusalAt(element.offset(),
                              "elements nested too deep, more than " + std::to_string(kDeepestNesting),
                              element.qualifiedName());
    }
    mOpen.push_back(opened(element, name));
  }

  Open opened(const XmlElement& element, std::string_view name) {
    Open* const parent = mOpen.empty() ? nullptr : &mOpen.back();
    const What within = parent == nullptr ? What::Other : parent->what;
    Open open;
    open.offset = element.offset();
    if (name == "brush") {
      open.what = What::Brush;
      open.index = numberAfter(mAll.mBrushes.size());
      BrushEntry& brush = mAll.mBrushes.emplace_back();
      brush.base = mAll.keptReference(referenceIn(element, "brushRef"));
      remember(element, Kind::Brush, open.index);
      if (within == What::Context) addPart(parent->index, Part::OwnBrush, open.index);
    } else if (name == "context") {
      open.what = What::Context;
      open.index = numberAfter(mAll.mContexts.size());
      mAll.mContexts.emplace_back();
      addReference(element, open.index, Part::BrushRef, "brushRef");
      addReference(element, open.index, Part::FormatRef, "traceFormatRef");
      addReference(element, open.index, Part::SourceRef, "inkSourceRef");
      addReference(element, open.index, Part::Base, "contextRef");
      remember(element, Kind::Context, open.index);
    } else if (name == "traceFormat") {
      open.what = What::Format;
      open.index = numberAfter(mAll.mFormats.size());
      mAll.mFormats.emplace_back();
      mAll.mFormatSources.push_back(within == What::Source ? static_cast<std::uint32_t>(parent->index)
                                                           : kNoNumber);
      remember(element, Kind::Format, open.index);
      if (within == What::Context) addPart(parent->index, Part::OwnFormat, open.index);
      if (within == What::Source && mAll.mSources[parent->index].format == kNoNumber)
        mAll.mSources[parent->index].format = static_cast<std::uint32_t>(open.index);
    } else if (name == "inkSource") {
      open.what = What::Source;
      open.index = numberAfter(mAll.mSources.size());
      mAll.mSources.emplace_back();
      remember(element, Kind::Source, open.index);
      if (within == What::Context) addPart(parent->index, Part::OwnSource, open.index);
    } else if (name == "channelProperties" && within == What::Source) {
      open.what = What::Properties;
      open.index = parent->index;
    } else if (name == "channelProperty" && within == What::Properties) {
      addResolution(mAll.mSources[parent->index], resolutionOf(mSource, element));
    } else if (name == "brushProperty" && within == What::Brush) {
      readProperty(element, mAll.mBrushes[parent->index]);
    } else if (name == "channel" && within == What::Format) {
      parent->regular.emplace_back(element);
    } else if (name == "intermittentChannels" && within == What::Format) {
      open.what = What::Intermittent;
    } else if (name == "channel" && within == What::Intermittent) {
      mOpen[mOpen.size() - 2].intermittent.emplace_back(element);
    } else if (name == "trace") {
      ++mAll.mTraceCount;
    } else if (name == "traceGroup" || parent == nullptr) {
      open.what = What::Group;
      open.index = mAll.mGroupTools.size();
      mAll.mGroupTools.push_back(kNoGroupTool);
    } else if (name == "annotation" && within == What::Group && element.text("type") == "tool") {
      open.what = What::Tool;
      open.index = parent->index;
    }
    return open;
  }

  // Of each kind, only the first part counts.
  void addPart(std::size_t context, Part part, std::size_t number) {
    ContextEntry& entry = mAll.mContexts[context];
    if (mAll.partOf(entry, part)) return;
    const std::uint32_t added = numberAfter(mAll.mContextParts.size());
    ContextPart& made = mAll.mContextParts.emplace_back();
    made.part = part;
    made.number = number;
    made.before = entry.part;
    entry.part = added;
  }

  void addReference(const XmlElement& element, std::size_t context, Part part, const char* attribute) {
    const std::uint32_t kept = mAll.keptReference(referenceIn(element, attribute));
    if (kept != kNoNumber) addPart(context, part, kept);
  }

  // Of each quantity, only the first resolution counts.
  void addResolution(SourceEntry& source, const std::optional<Resolution>& stated) {
    if (!stated) return;
    for (std::uint32_t at = source.resolution; at != kNoNumber; at = mAll.mResolutions[at].before) {
      if (mAll.mResolutions[at].stated.quantity == stated->quantity) return;
    }
    const std::uint32_t added = numberAfter(mAll.mResolutions.size());
    mAll.mResolutions.push_back({.stated = *stated, .before = source.resolution});
    source.resolution = added;
  }

  void readProperty(const XmlElement& element, BrushEntry& brush) {
    if (brush.text == kNoNumber) {
      brush.text = numberAfter(mAll.mBrushTexts.size());
      mAll.mBrushTexts.emplace_back();
      mAll.mIgnoringPressure.emplace_back();
    }
    BrushPropertyReader(mSource, element)
        .readInto(mAll.mBrushTexts[brush.text], mAll.mIgnoringPressure[brush.text]);
  }

  void remember(const XmlElement& element, Kind kind, std::size_t index) {
    const std::string id = element.text("id");
    if (id.empty()) return;
    mAll.mIds.push_back({.name = mAll.keptText(id),
                         .offset = element.offset(),
                         .number = static_cast<std::uint32_t>(index),
                         .kind = static_cast<std::uint32_t>(kind)});
  }

  // Only a group's first annotation counts. An unknown tool matters only in a group whose traces are drawn,
  // and of those only the first, as nothing after it is read.
  void takeTool(const Open& open) {
    std::uint8_t& tool = mAll.mGroupTools[open.index];
    if (tool != kNoGroupTool) return;
    tool = kUnknownTool;
    if (const std::optional<int> known = toolCalled(trimmedLower(open.text))) {
      tool = static_cast<std::uint8_t>(*known);
      return;
    }
    const bool drawn = std::all_of(mOpen.begin(), mOpen.end(),
                                   [](const Open& around) { return around.what == What::Group; });
    if (!drawn || (mAll.mMalformedTool && mAll.mMalformedTool->first < open.index)) return;
    mAll.mMalformedTool.emplace(open.index, unknownTool(mSource, open.offset, open.text));
  }

  Definitions& mAll;
  const SourceText& mSource;
  std::vector<Open> mOpen;
  std::size_t mSkippedDepth = 0;
};

Definitions::Definitions(const SourceText& source) : mSource(source) {
  Collector collector(*this);
  walkXml(source, collector);
  sortIds();
}

const char* Definitions::keptText(std::string_view text) {
  constexpr std::size_t kFirst = 1 << 10, kLargest = 1 << 20;
  const std::size_t size = text.size() + 1;
  if (mTexts.empty() || mTexts.back().capacity() - mTexts.back().size() < size) {
    const std::size_t usual = mTexts.empty() ? kFirst : std::min(2 * mTexts.back().capacity(), kLargest);
    mTexts.emplace_back().reserve(std::max(usual, size));
  }
  std::vector<char>& block = mTexts.back();
  const std::size_t at = block.size();
  block.resize(at + size);
  text.copy(block.data() + at, text.size());  // the rest is 0 already
  return block.data() + at;
}

std::uint32_t Definitions::keptReference(const Reference& reference) {
  if (!reference.name) return kNoNumber;
  mReferences.push_back({.offset = reference.offset, .name = keptText(*reference.name)});
  return numberAfter(mReferences.size() - 1);
}

Reference Definitions::referenceOf(std::uint32_t kept, const char* attribute) const {
  if (kept == kNoNumber) return {};
  const KeptReference& reference = mReferences[kept];
  return {.attribute = attribute, .name = reference.name, .offset = reference.offset};
}

// Throws Refusal for the first id of the document that is given a second time.
void Definitions::sortIds() {
  std::sort(mIds.begin(), mIds.end(), [](const Id& one, const Id& other) {
    const int order = std::strcmp(one.name, other.name);
    return order != 0 ? order < 0 : one.offset < other.offset;
  });
  const Id* again = nullptr;
  for (std::size_t i = 1; i < mIds.size(); ++i) {
    const Id& id = mIds[i];
    if (std::strcmp(mIds[i - 1].name, id.name) == 0 && (again == nullptr || id.offset < again->offset))
      again = &id;
  }
  if (again != nullptr) throw mSource.refusalAt(again->offset, "id given twice", again->name);
}

std::optional<int> Definitions::toolOfGroup(std::size_t group) const {
  if (mMalformedTool && mMalformedTool->first == group) throw mMalformedTool->second;
  const std::uint8_t tool = mGroupTools[group];
  return tool < kUnknownTool ? std::optional<int>(tool) : std::nullopt;
}

std::optional<std::size_t> Definitions::named(const Reference& reference, Kind kind) const {
  if (!reference.name) return std::nullopt;
  const char* id = reference.name->c_str();
  if (*id == '#') ++id;
  const auto found = std::lower_bound(mIds.begin(), mIds.end(), id, [](const Id& one, const char* name) {
    return std::strcmp(one.name, name) < 0;
  });
  const bool there = found != mIds.end() && std::strcmp(found->name, id) == 0;
  if (!there && std::string_view(id).starts_with("Default")) return std::nullopt;
  if (!there || found->kind != static_cast<std::uint32_t>(kind)) {
    throw mSource.refusalAt(reference.offset, std::string("unknown ") + reference.attribute, *reference.name);
  }
  return found->number;
}

std::optional<std::size_t> Definitions::brushNamed(const Reference& reference) const {
  return named(reference, Kind::Brush);
}

std::optional<std::size_t> Definitions::contextNamed(const Reference& reference) const {
  return named(reference, Kind::Context);
}

std::uint32_t Definitions::brush(std::size_t brush) {
  // Down the chain to a brush that is known or builds on no other, then back up.
  std::deque<std::uint32_t> chain;
  const auto baseOf = [&](const BrushEntry& entry) {
    return brushNamed(referenceOf(entry.base, "brushRef"));
  };
  for (std::optional<std::size_t> at = brush; at && mBrushes[*at].state != kKnown;) {
    BrushEntry& entry = mBrushes[*at];
    if (entry.state == kAsked) {
      const BrushEntry& last = mBrushes[chain.back()];
      throw mSource.refusalAt(mReferences[last.base].offset, "brushRef leads back to itself", "");
    }
    entry.state = kAsked;
    chain.push_back(static_cast<std::uint32_t>(*at));
    at = baseOf(entry);
  }
  for (; !chain.empty(); chain.pop_back()) {
    BrushEntry& entry = mBrushes[chain.back()];
    if (const std::optional<std::size_t> base = baseOf(entry)) {
      const std::uint32_t text = mBrushes[*base].text;
      if (entry.text == kNoNumber) {
        entry.text = text;
      } else if (text != kNoNumber) {
        takeOver(mBrushTexts[entry.text], mBrushTexts[text]);
        std::optional<bool>& ignoring = mIgnoringPressure[entry.text];
        if (!ignoring) ignoring = mIgnoringPressure[text];
      }
    }
    entry.state = kKnown;
  }
  return mBrushes[brush].text;
}

bool Definitions::ignoresPressure(std::uint32_t brushText) const {
  return brushText != kNoNumber && mIgnoringPressure[brushText].value_or(false);
}

const TraceFormat& Definitions::format(std::optional<std::size_t> format, std::optional<std::size_t> source) {
  const std::uint32_t asked = format ? static_cast<std::uint32_t>(*format) : kNoNumber;
  std::uint32_t counting = kNoNumber;
  if (source) {
    counting = static_cast<std::uint32_t>(*source);
  } else if (format) {
    counting = mFormatSources[asked];
  }
  if (!mApplied.channels.empty() && mAppliedFormat == asked && mAppliedSource == counting) return mApplied;
  mApplied = asked == kNoNumber ? plainFormat() : mFormats[asked];
  mAppliedFormat = asked;
  mAppliedSource = counting;
  if (counting == kNoNumber) return mApplied;
  for (std::uint32_t at = mSources[counting].resolution; at != kNoNumber; at = mResolutions[at].before) {
    applyResolution(mApplied, mResolutions[at].stated);
  }
  return mApplied;
}

std::optional<std::uint32_t> Definitions::partOf(const ContextEntry& context, Part part) const {
  for (std::uint32_t at = context.part; at != kNoNumber; at = mContextParts[at].before) {
    if (mContextParts[at].part == part) return mContextParts[at].number;
  }
  return std::nullopt;
}

std::optional<std::size_t> Definitions::referredTo(const ContextEntry& context, Part part,
                                                   const char* attribute, Kind kind) const {
  return named(referenceOf(partOf(context, part).value_or(kNoNumber), attribute), kind);
}

std::optional<std::size_t> Definitions::brushIn(const ContextEntry& context) const {
  if (const auto own = partOf(context, Part::OwnBrush)) return *own;
  return referredTo(context, Part::BrushRef, "brushRef", Kind::Brush);
}

std::optional<std::size_t> Definitions::formatIn(const ContextEntry& context) const {
  if (const auto own = partOf(context, Part::OwnFormat)) return *own;
  if (const auto format = referredTo(context, Part::FormatRef, "traceFormatRef", Kind::Format)) return format;
  const auto source = referredTo(context, Part::SourceRef, "inkSourceRef", Kind::Source);
  const std::optional<std::size_t> ownSource = partOf(context, Part::OwnSource);
  for (const std::optional<std::size_t>& ink : {ownSource, source}) {
    if (ink && mSources[*ink].format != kNoNumber) return mSources[*ink].format;
  }
  return std::nullopt;
}

std::optional<std::size_t> Definitions::sourceIn(const ContextEntry& context) const {
  if (const auto own = partOf(context, Part::OwnSource)) return *own;
  return referredTo(context, Part::SourceRef, "inkSourceRef", Kind::Source);
}

std::optional<std::size_t> Definitions::alongContexts(
    std::size_t context, Found ContextEntry::*result,
    std::optional<std::size_t> (Definitions::*in)(const ContextEntry&) const) {
  std::deque<std::uint32_t> chain;
  std::optional<std::size_t> found;
  for (std::optional<std::size_t> at = context; at;) {
    ContextEntry& entry = mContexts[*at];
    Found& known = entry.*result;
    if (known.state == kKnown) {
      if (known.number != kNoNumber) found = std::size_t{known.number};
      break;
    }
    if (known.state == kAsked) {
      const ContextEntry& last = mContexts[chain.back()];
      const std::size_t offset = mReferences[*partOf(last, Part::Base)].offset;
      throw mSource.refusalAt(offset, "contextRef leads back to itself", "");
    }
    known.state = kAsked;
    chain.push_back(static_cast<std::uint32_t>(*at));
    found = (this->*in)(entry);
    if (found) break;
    at = referredTo(entry, Part::Base, "contextRef", Kind::Context);
  }
  for (const std::uint32_t link : chain) {
    Found& known = mContexts[link].*result;
    known.number = found ? static_cast<std::uint32_t>(*found) : kNoNumber;
    known.state = kKnown;
  }
  return found;
}

std::optional<std::size_t> Definitions::brushOfContext(std::size_t context) {
  return alongContexts(context, &ContextEntry::brush, &Definitions::brushIn);
}

std::optional<std::size_t> Definitions::sourceOfContext(std::size_t context) {
  return alongContexts(context, &ContextEntry::source, &Definitions::sourceIn);
}

std::optional<std::size_t> Definitions::formatOfContext(std::size_t context) {
  return alongContexts(context, &ContextEntry::format, &Definitions::formatIn);
}

}  // namespace QeltDesktop
