#include "ink/InkmlReader.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <iterator>
#include <optional>
#include <string_view>
#include <utility>
#include <vector>

#include "ink/Definitions.h"
#include "ink/SampleReader.h"
#include "ink/TraceFormat.h"
#include "ink/TraceText.h"
#include "ink/XmlWalk.h"

namespace QeltDesktop {
namespace {

// Reads the traces, with all that they can refer to known beforehand.
class TraceCollector final : public XmlVisitor {
 public:
  TraceCollector(const SourceText& source, float farthest)
      : mSource(source), mFarthest(farthest), mDefinitions(source) {
    mPage.strokes.reserve(mDefinitions.traceCount());
  }

  Page takePage() {
    if (mPage.strokes.empty()) throw mSource.refusalAt(mInkOffset, "no trace in the page", "");
    mPage.strokes.setBrushes(mDefinitions.takeBrushes());
    mPage.name = mSource.name();
    return std::move(mPage);
  }

  void elementBegins(const XmlElement& element) override {
    const std::string_view name = element.name();
    if (mSkippedDepth > 0 || (name == "annotationXML" && !mScopes.empty())) {
      ++mSkippedDepth;
      return;
    }
    // Every definition is counted, so that the numbers agree with those of the definitions.
    const Numbers numbers = mNumbers;
    mNumbers.brush += name == "brush" ? 1 : 0;
    mNumbers.context += name == "context" ? 1 : 0;
    mNumbers.format += name == "traceFormat" ? 1 : 0;
    const bool isGroup = name == "traceGroup" || mScopes.empty();
    mNumbers.group += isGroup ? 1 : 0;
    if (mTrace) {
      beginWithinTrace(element, name);
    } else if (mOtherDepth > 0) {
      meet(name, numbers);
      ++mOtherDepth;
    } else if (isGroup) {
      beginGroup(element, numbers.group);
    } else if (name == "trace") {
      mTrace.emplace(mSource, element);
    } else {
      meet(name, numbers);
      if (name == "context") mEndingContext = numbers.context;
      mOtherDepth = 1;
    }
  }

  void elementEnds() override {
    if (mSkippedDepth > 0) {
      --mSkippedDepth;
    } else if (mTrace && mTrace->depth > 0) {
      --mTrace->depth;
    } else if (mTrace) {
      readTrace(*mTrace);
      mTrace.reset();
    } else if (mOtherDepth > 0) {
      --mOtherDepth;
      if (mOtherDepth == 0 && mEndingContext) mCurrentContext = std::exchange(mEndingContext, std::nullopt);
    } else {
      mScopes.pop_back();
    }
  }

  void textComes(const XmlText& text) override {
    if (mSkippedDepth > 0 || !mTrace) return;
    if (mTrace->depth == 0) mTrace->text.add(text);
    if (mTrace->depth == 1 && mTrace->inTool) mTrace->tool->text += text.value;
  }

 private:
  // How many of each kind have begun, which gives the numbers that the definitions know them by.
  struct Numbers {
    std::size_t brush = 0, context = 0, format = 0, group = 0;
  };

  // What a trace takes over from the groups around it.
  struct Scope {
    std::optional<std::size_t> brush;
    std::optional<std::size_t> context;
    std::optional<int> tool;
  };

  struct Annotation {
    std::size_t offset;
    std::string text;
  };

  struct Element {
    std::size_t offset;
    std::string name;
  };

  // A trace whose end tag has not come yet.
  struct OpenTrace {
    OpenTrace(const SourceText& source, const XmlElement& element)
        : offset(element.offset()),
          brush(referenceIn(element, "brushRef")),
          context(referenceIn(element, "contextRef")),
          penUp(element.text("type") == "penUp"),
          text(source) {}

    std::size_t offset;
    Reference brush, context;
    bool penUp;
    TraceText text;
    std::optional<Annotation> tool;   // the first one
    std::optional<Element> stranger;  // the first element that a trace cannot hold
    int depth = 0;
    bool inTool = false;
  };

  // Elements that InkML has elsewhere, so that something is wrong with the page. What it does not know at all
  // is passed over.
  static bool isOutOfPlace(std::string_view name) {
    static constexpr std::string_view kElsewhere[] = {"ink",
                                                      "definitions",
                                                      "context",
                                                      "trace",
                                                      "traceGroup",
                                                      "traceFormat",
                                                      "channel",
                                                      "inkSource",
                                                      "brush",
                                                      "brushProperty",
                                                      "intermittentChannels",
                                                      "canvas",
                                                      "canvasTransform",
                                                      "timestamp",
                                                      "mapping",
                                                      "channelProperties"};
    return std::find(std::begin(kElsewhere), std::end(kElsewhere), name) != std::end(kElsewhere);
  }

  static void beginWithin(OpenTrace& trace, const XmlElement& element, std::string_view name) {
    trace.inTool = name == "annotation" && !trace.tool && element.text("type") == "tool";
    if (trace.inTool) trace.tool = {element.offset(), {}};
    if (isOutOfPlace(name) && !trace.stranger) trace.stranger = {element.offset(), element.qualifiedName()};
  }

  void beginWithinTrace(const XmlElement& element, std::string_view name) {
    if (mTrace->depth == 0) beginWithin(*mTrace, element, name);
    ++mTrace->depth;
  }

  void beginGroup(const XmlElement& element, std::size_t number) {
    if (mScopes.empty()) mInkOffset = element.offset();
    Scope scope = narrowed(referenceIn(element, "brushRef"), referenceIn(element, "contextRef"));
    if (const std::optional<int> tool = mDefinitions.toolOfGroup(number)) scope.tool = tool;
    mScopes.push_back(scope);
  }

  // The scope around a trace or group, with what it refers to itself.
  Scope narrowed(const Reference& brush, const Reference& context) const {
    Scope own = mScopes.empty() ? Scope{} : mScopes.back();
    if (const auto named = mDefinitions.brushNamed(brush)) own.brush = named;
    if (const auto named = mDefinitions.contextNamed(context)) own.context = named;
    return own;
  }

  // Traces that refer to none use the brush and the format that were defined last.
  void meet(std::string_view name, const Numbers& numbers) {
    if (name == "traceFormat") mLastFormat = numbers.format;
    if (name == "brush") mLastBrush = numbers.brush;
  }

  const TraceFormat& formatFor(const Scope& scope) {
    const std::optional<std::size_t> context = scope.context ? scope.context : mCurrentContext;
    if (!context) return mDefinitions.format(mLastFormat, std::nullopt);
    const std::optional<std::size_t> format = mDefinitions.formatOfContext(*context);
    return mDefinitions.format(format ? format : mLastFormat, mDefinitions.sourceOfContext(*context));
  }

  // The index among the brushes of the page.
  std::uint32_t brushFor(const Scope& scope) {
    std::optional<std::size_t> brush = scope.brush;
    const std::optional<std::size_t> context = scope.context ? scope.context : mCurrentContext;
    if (!brush && context) brush = mDefinitions.brushOfContext(*context);
    if (!brush) brush = mLastBrush;
    return brush ? mDefinitions.brush(*brush) : kNoNumber;
  }

  void readTrace(const OpenTrace& open) {
    Scope scope = narrowed(open.brush, open.context);
    if (open.tool) scope.tool = toolNamed(mSource, open.tool->offset, open.tool->text);
    if (open.stranger) {
      throw mSource.refusalAt(open.stranger->offset, "element that a trace cannot hold", open.stranger->name);
    }
    if (open.text.isBlank()) throw mSource.refusalAt(open.offset, "trace without points", "");
    const TraceFormat& format = formatFor(scope);
    const std::uint32_t brush = brushFor(scope);
    readSamples(open.text, format, mDefinitions.ignoresPressure(brush), mFarthest, mPage.strokes);
    if (open.penUp) {
      mPage.strokes.dropStroke();  // a pen in the air leaves nothing on the paper
    } else {
      mPage.strokes.finishStroke(brush, scope.tool);
    }
  }

  const SourceText& mSource;
  const float mFarthest;
  Definitions mDefinitions;
  Numbers mNumbers;
  std::vector<Scope> mScopes;  // of <ink> and the groups that are open
  std::optional<OpenTrace> mTrace;
  std::size_t mOtherDepth = 0;    // how deep within any other element
  std::size_t mSkippedDepth = 0;  // how deep within an annotationXML, which may hold any XML
  std::optional<std::size_t> mEndingContext;
  std::size_t mInkOffset = 0;
  std::optional<std::size_t> mLastFormat;
  std::optional<std::size_t> mLastBrush;
  std::optional<std::size_t> mCurrentContext;
  Page mPage;
};

}  // namespace

Page readInkml(const SourceText& source, float farthest) {
  TraceCollector collector(source, farthest);
  walkXml(source, collector);
  return collector.takePage();
}

Page readInkmlFile(const std::string& path) {
  return readInkml(SourceText::fromFile(path));
}

}  // namespace QeltDesktop
