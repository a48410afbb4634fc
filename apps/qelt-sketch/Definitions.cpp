#include "Definitions.h"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <cstdint>
#include <utility>

#include "NumberText.h"
#include "engine/MotionEvent.h"

namespace QeltDesktop {
namespace {

void readBrushProperty(const SourceText& source, const XmlElement& element, Brush& brush) {
  const std::string name = element.text("name");
  const std::string value = element.text("value");
  const auto malformed = [&](const std::string& what) {
    return source.refusalAt(element.offset(), what, value.empty() ? "\"\"" : value);
  };
  if (name == "width") {
    const std::optional<float> width = parseFloat(value);
    if (!width || !std::isfinite(*width) || *width <= 0.0f) {
      throw malformed("brush width must be a number above 0");
    }
    brush.width = width;
  } else if (name == "color") {
    const std::optional<unsigned int> rgb = parseRgb(value);
    if (!rgb) throw malformed("brush color must be #RRGGBB");
    brush.rgb = rgb;
  } else if (name == "transparency") {
    const std::optional<float> transparency = parseFloat(value);
    if (!transparency || !(*transparency >= 0.0f && *transparency <= 255.0f)) {
      throw malformed("brush transparency must be a number from 0 to 255");
    }
    brush.transparency = static_cast<std::uint8_t>(std::lround(*transparency));
  }
}

// What `brush` leaves open it takes over from `base`.
void takeOver(Brush& brush, const Brush& base) {
  if (!brush.width) brush.width = base.width;
  if (!brush.rgb) brush.rgb = base.rgb;
  if (!brush.transparency) brush.transparency = base.transparency;
}

}  // namespace

int toolNamed(const SourceText& source, std::size_t offset, std::string_view text) {
  std::string name = trimmed(text);
  for (char& c : name) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  if (name == "stylus" || name == "pen") return Qelt::kToolStylus;
  if (name == "finger" || name == "touch") return Qelt::kToolFinger;
  if (name == "mouse") return Qelt::kToolMouse;
  throw source.refusalAt(offset, "unknown tool", name.empty() ? "\"\"" : name);
}

Reference referenceIn(const XmlElement& element, const char* attribute) {
  return {.attribute = attribute, .name = element.attribute(attribute), .offset = element.offset()};
}

// Fills the definitions while the document is walked through.
class Definitions::Collector final : public XmlVisitor {
 public:
  explicit Collector(Definitions& definitions) : mAll(definitions), mSource(definitions.mSource) {}

  void elementBegins(const XmlElement& element) override {
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

  void elementEnds() override {
    if (mSkippedDepth > 0) {
      --mSkippedDepth;
      return;
    }
    const Open open = std::move(mOpen.back());
    mOpen.pop_back();
    if (open.what == What::Format) {
      mAll.mFormats[open.index] = traceFormatOf(mSource, open.offset, open.regular, open.intermittent);
    }
    if (open.what == What::Tool) takeTool(open);
  }

  void textComes(const XmlText& text) override {
    if (mSkippedDepth == 0 && mOpen.back().what == What::Tool) mOpen.back().text += text.value;
  }

 private:
  enum class What { Other, Group, Brush, Context, Format, Intermittent, Source, Tool };
  struct Open {
    What what = What::Other;
    std::size_t index = 0;  // among its kind; of a tool, the group's
    std::size_t offset = 0;
    std::vector<ChannelText> regular, intermittent;
    std::string text;
  };

  Open opened(const XmlElement& element, std::string_view name) {
    Open* const parent = mOpen.empty() ? nullptr : &mOpen.back();
    const What within = parent == nullptr ? What::Other : parent->what;
    Open open;
    open.offset = element.offset();
    if (name == "brush") {
      open.what = What::Brush;
      open.index = mAll.mBrushes.size();
      mAll.mBrushes.push_back(
          {.offset = element.offset(), .base = referenceIn(element, "brushRef"), .brush = {}});
      remember(element, Kind::Brush, open.index);
      if (within == What::Context) setFirst(mAll.mContexts[parent->index].ownBrush, open.index);
    } else if (name == "context") {
      open.what = What::Context;
      open.index = mAll.mContexts.size();
      ContextEntry context{};
      context.offset = element.offset();
      context.brushReference = referenceIn(element, "brushRef");
      context.formatReference = referenceIn(element, "traceFormatRef");
      context.sourceReference = referenceIn(element, "inkSourceRef");
      context.base = referenceIn(element, "contextRef");
      mAll.mContexts.push_back(std::move(context));
      remember(element, Kind::Context, open.index);
    } else if (name == "traceFormat") {
      open.what = What::Format;
      open.index = mAll.mFormats.size();
      mAll.mFormats.emplace_back();
      remember(element, Kind::Format, open.index);
      if (within == What::Context) setFirst(mAll.mContexts[parent->index].ownFormat, open.index);
      if (within == What::Source) setFirst(mAll.mSources[parent->index], open.index);
    } else if (name == "inkSource") {
      open.what = What::Source;
      open.index = mAll.mSources.size();
      mAll.mSources.emplace_back();
      remember(element, Kind::Source, open.index);
      if (within == What::Context) setFirst(mAll.mContexts[parent->index].ownSource, open.index);
    } else if (name == "brushProperty" && within == What::Brush) {
      readBrushProperty(mSource, element, mAll.mBrushes[parent->index].brush);
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
      mAll.mGroupTools.emplace_back();
    } else if (name == "annotation" && within == What::Group && element.text("type") == "tool") {
      open.what = What::Tool;
      open.index = parent->index;
    }
    return open;
  }

  static void setFirst(std::optional<std::size_t>& place, std::size_t index) {
    if (!place) place = index;
  }

  void remember(const XmlElement& element, Kind kind, std::size_t index) {
    const std::string id = element.text("id");
    if (!id.empty() && !mAll.mById.emplace(id, Named{kind, index}).second) {
      throw mSource.refusalAt(element.offset(), "id given twice", id);
    }
  }

  // The first annotation counts. An unknown tool only matters in a group whose traces are drawn.
  void takeTool(const Open& open) {
    std::optional<int>& tool = mAll.mGroupTools[open.index];
    if (tool || mAll.mMalformedTools.contains(open.index)) return;
    try {
      tool = toolNamed(mSource, open.offset, open.text);
    } catch (const Refusal& refusal) {
      mAll.mMalformedTools.emplace(open.index, refusal);
    }
  }

  Definitions& mAll;
  const SourceText& mSource;
  std::vector<Open> mOpen;
  std::size_t mSkippedDepth = 0;
};

Definitions::Definitions(const SourceText& source) : mSource(source) {
  Collector collector(*this);
  walkXml(source, collector);
}

std::optional<int> Definitions::toolOfGroup(std::size_t group) const {
  if (const auto malformed = mMalformedTools.find(group); malformed != mMalformedTools.end())
    throw malformed->second;
  return mGroupTools[group];
}

std::optional<std::size_t> Definitions::named(const Reference& reference, Kind kind) const {
  if (!reference.name) return std::nullopt;
  std::string id = *reference.name;
  if (id.starts_with('#')) id.erase(0, 1);
  const auto found = mById.find(id);
  if (found == mById.end() && id.starts_with("Default")) return std::nullopt;
  if (found == mById.end() || found->second.kind != kind) {
    throw mSource.refusalAt(reference.offset, std::string("unknown ") + reference.attribute, *reference.name);
  }
  return found->second.index;
}

std::optional<std::size_t> Definitions::brushNamed(const Reference& reference) const {
  return named(reference, Kind::Brush);
}

std::optional<std::size_t> Definitions::contextNamed(const Reference& reference) const {
  return named(reference, Kind::Context);
}

const Brush& Definitions::brush(std::size_t brush) {
  // Down the chain to what is known or builds on nothing, then back up.
  std::vector<std::size_t> chain;
  for (std::optional<std::size_t> at = brush; at && mBrushes[*at].state != State::Known;) {
    BrushEntry& entry = mBrushes[*at];
    if (entry.state == State::Asked) {
      throw mSource.refusalAt(mBrushes[chain.back()].offset, "brushRef leads back to itself", "");
    }
    entry.state = State::Asked;
    chain.push_back(*at);
    at = brushNamed(entry.base);
  }
  for (; !chain.empty(); chain.pop_back()) {
    BrushEntry& entry = mBrushes[chain.back()];
    if (const std::optional<std::size_t> base = brushNamed(entry.base)) {
      takeOver(entry.brush, mBrushes[*base].brush);
    }
    entry.state = State::Known;
  }
  return mBrushes[brush].brush;
}

std::optional<std::size_t> Definitions::brushIn(const ContextEntry& context) const {
  return context.ownBrush ? context.ownBrush : brushNamed(context.brushReference);
}

std::optional<std::size_t> Definitions::formatIn(const ContextEntry& context) const {
  if (context.ownFormat) return context.ownFormat;
  if (const auto format = named(context.formatReference, Kind::Format)) return format;
  const auto source = named(context.sourceReference, Kind::Source);
  for (const std::optional<std::size_t>& ink : {context.ownSource, source}) {
    if (ink && mSources[*ink]) return mSources[*ink];
  }
  return std::nullopt;
}

std::optional<std::size_t> Definitions::alongContexts(
    std::size_t context, Found ContextEntry::*result,
    std::optional<std::size_t> (Definitions::*in)(const ContextEntry&) const) {
  std::vector<std::size_t> chain;
  std::optional<std::size_t> found;
  for (std::optional<std::size_t> at = context; at;) {
    ContextEntry& entry = mContexts[*at];
    Found& known = entry.*result;
    if (known.state == State::Known) {
      found = known.index;
      break;
    }
    if (known.state == State::Asked) {
      throw mSource.refusalAt(mContexts[chain.back()].offset, "contextRef leads back to itself", "");
    }
    known.state = State::Asked;
    chain.push_back(*at);
    found = (this->*in)(entry);
    if (found) break;
    at = contextNamed(entry.base);
  }
  for (const std::size_t link : chain) mContexts[link].*result = {.index = found, .state = State::Known};
  return found;
}

std::optional<std::size_t> Definitions::brushOfContext(std::size_t context) {
  return alongContexts(context, &ContextEntry::brush, &Definitions::brushIn);
}

std::optional<std::size_t> Definitions::formatOfContext(std::size_t context) {
  return alongContexts(context, &ContextEntry::format, &Definitions::formatIn);
}

}  // namespace QeltDesktop
