#include "InkmlReader.h"

#include <cctype>
#include <cmath>
#include <cstddef>
#include <map>
#include <optional>
#include <string_view>
#include <utility>

#include <pugixml.hpp>

#include "InkmlNode.h"
#include "NumberText.h"
#include "SampleReader.h"
#include "TraceFormat.h"
#include "TraceText.h"
#include "engine/MotionEvent.h"

namespace QeltDesktop {
namespace {

// Far deeper than any real page, and shallow enough for the stack.
constexpr int kDeepestNesting = 200;

int toolNamed(const SourceText& source, const pugi::xml_node& annotation) {
  std::string name = trimmed(annotation.child_value());
  for (char& c : name) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  if (name == "stylus" || name == "pen") return Qelt::kToolStylus;
  if (name == "finger" || name == "touch") return Qelt::kToolFinger;
  if (name == "mouse") return Qelt::kToolMouse;
  throw refusalAt(source, annotation, "unknown tool", name.empty() ? "\"\"" : name);
}

// The tool that an element's own annotation names.
std::optional<int> toolOf(const SourceText& source, const pugi::xml_node& node) {
  for (const pugi::xml_node& child : node) {
    if (isElement(child, "annotation") && textOf(child, "type") == "tool") return toolNamed(source, child);
  }
  return std::nullopt;
}

void readBrushProperty(const SourceText& source, const pugi::xml_node& node, Brush& brush) {
  const std::string name = textOf(node, "name");
  const std::string value = textOf(node, "value");
  const auto malformed = [&](const std::string& what) {
    return refusalAt(source, node, what, value.empty() ? "\"\"" : value);
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

class PageReader {
 public:
  explicit PageReader(const SourceText& source) : mSource(source) {
    const std::string& text = source.text();
    if (const std::size_t nul = text.find('\0'); nul != std::string::npos) {
      throw source.refusal(source.lineAt(nul), "not XML", "a NUL byte");
    }
    const pugi::xml_parse_result result =
        mDocument.load_buffer(text.data(), text.size(), pugi::parse_default, pugi::encoding_utf8);
    if (!result) {
      throw source.refusal(source.lineAt(static_cast<std::size_t>(result.offset)), "not XML",
                           result.description());
    }
  }

  Page read() {
    pugi::xml_node ink;
    for (const pugi::xml_node& node : mDocument) {
      if (node.type() != pugi::node_element) continue;
      if (ink) throw refusalAt(mSource, node, "not XML", "a second root element");
      ink = node;
    }
    if (!isElement(ink, "ink")) throw refusalAt(mSource, ink, "not InkML, the root element is", ink.name());
    readDefinitions(ink, 0);
    mLastFormat = mPlainFormat;
    readGroup(ink, {}, 0);
    if (mPage.traces.empty()) throw refusalAt(mSource, ink, "no trace in the page", "");
    return std::move(mPage);
  }

 private:
  // What a trace takes over from the groups around it.
  struct Scope {
    pugi::xml_node brush;
    pugi::xml_node context;
    std::optional<int> tool;
  };

  // Reads every format and brush wherever it stands, so that a malformed one is refused even when no trace
  // uses it, and remembers what can be referred to.
  void readDefinitions(const pugi::xml_node& parent, int depth) {
    if (depth > kDeepestNesting) throw refusalAt(mSource, parent, "elements nested too deep", parent.name());
    for (const pugi::xml_node& node : parent) {
      if (node.type() != pugi::node_element) continue;
      const std::string_view name = localName(node);
      if (name == "brush" || name == "context" || name == "traceFormat" || name == "inkSource") {
        const std::string id = textOf(node, "id");
        if (!id.empty() && !mById.emplace(id, node).second) {
          throw refusalAt(mSource, node, "id given twice", id);
        }
      }
      if (name == "traceFormat") mFormats.emplace(node.hash_value(), readTraceFormat(mSource, node));
      if (name == "brush") {
        Brush brush;
        readBrushProperties(node, brush);
      }
      // Annotations may hold any XML.
      if (name != "annotationXML") readDefinitions(node, depth + 1);
    }
  }

  void readBrushProperties(const pugi::xml_node& node, Brush& brush) const {
    for (const pugi::xml_node& child : node) {
      if (isElement(child, "brushProperty")) readBrushProperty(mSource, child, brush);
    }
  }

  // The element that an attribute refers to ("#id"); null without the attribute, and for the defaults that
  // every document has ("#DefaultBrush").
  pugi::xml_node referred(const pugi::xml_node& node, const char* attribute, std::string_view element) const {
    std::string id = textOf(node, attribute);
    if (!attributeOf(node, attribute)) return {};
    if (id.starts_with('#')) id.erase(0, 1);
    if (id.starts_with("Default") && !mById.contains(id)) return {};
    const auto found = mById.find(id);
    if (found == mById.end() || !isElement(found->second, element)) {
      throw refusalAt(mSource, node, std::string("unknown ") + attribute, textOf(node, attribute));
    }
    return found->second;
  }

  Brush brushAt(const pugi::xml_node& node, int depth = 0) const {
    if (depth > kDeepestNesting) throw refusalAt(mSource, node, "brushRef leads back to itself", "");
    Brush brush;
    if (const pugi::xml_node base = referred(node, "brushRef", "brush")) brush = brushAt(base, depth + 1);
    readBrushProperties(node, brush);
    return brush;
  }

  // A context's brush: its own, the one it refers to, or that of the context it builds on.
  pugi::xml_node brushOfContext(const pugi::xml_node& context, int depth = 0) const {
    if (!context) return {};
    if (depth > kDeepestNesting) throw refusalAt(mSource, context, "contextRef leads back to itself", "");
    if (const pugi::xml_node own = childElement(context, "brush")) return own;
    if (const pugi::xml_node named = referred(context, "brushRef", "brush")) return named;
    return brushOfContext(referred(context, "contextRef", "context"), depth + 1);
  }

  // A context's format, in the same way; an ink source brings one too.
  pugi::xml_node formatOfContext(const pugi::xml_node& context, int depth = 0) const {
    if (!context) return {};
    if (depth > kDeepestNesting) throw refusalAt(mSource, context, "contextRef leads back to itself", "");
    if (const pugi::xml_node own = childElement(context, "traceFormat")) return own;
    if (const pugi::xml_node named = referred(context, "traceFormatRef", "traceFormat")) return named;
    for (const pugi::xml_node& ink :
         {childElement(context, "inkSource"), referred(context, "inkSourceRef", "inkSource")}) {
      if (const pugi::xml_node format = childElement(ink, "traceFormat")) return format;
    }
    return formatOfContext(referred(context, "contextRef", "context"), depth + 1);
  }

  const TraceFormat& formatFor(const Scope& scope) const {
    const pugi::xml_node format = formatOfContext(scope.context ? scope.context : mCurrentContext);
    return format ? mFormats.at(format.hash_value()) : mLastFormat;
  }

  Brush brushFor(const Scope& scope) const {
    if (scope.brush) return brushAt(scope.brush);
    const pugi::xml_node brush = brushOfContext(scope.context ? scope.context : mCurrentContext);
    if (brush) return brushAt(brush);
    return mLastBrush ? brushAt(mLastBrush) : Brush{};
  }

  // `scope` with what a trace or a group says of itself.
  Scope narrowed(const Scope& scope, const pugi::xml_node& node) const {
    Scope own = scope;
    if (const pugi::xml_node brush = referred(node, "brushRef", "brush")) own.brush = brush;
    if (const pugi::xml_node context = referred(node, "contextRef", "context")) own.context = context;
    if (const std::optional<int> tool = toolOf(mSource, node)) own.tool = tool;
    return own;
  }

  void readGroup(const pugi::xml_node& group, const Scope& outer, int depth) {
    const Scope scope = narrowed(outer, group);
    for (const pugi::xml_node& node : group) {
      if (isElement(node, "trace")) {
        readTrace(node, scope);
      } else if (isElement(node, "traceGroup")) {
        readGroup(node, scope, depth + 1);
      } else {
        meetDefinitions(node);
        if (isElement(node, "context")) mCurrentContext = node;
      }
    }
  }

  // Later traces that name none use the brush and the format defined last.
  void meetDefinitions(const pugi::xml_node& node) {
    if (isElement(node, "annotationXML")) return;
    if (isElement(node, "traceFormat")) mLastFormat = mFormats.at(node.hash_value());
    if (isElement(node, "brush")) mLastBrush = node;
    for (const pugi::xml_node& child : node) meetDefinitions(child);
  }

  void readTrace(const pugi::xml_node& node, const Scope& outer) {
    const Scope scope = narrowed(outer, node);
    Trace trace;
    trace.samples = readSamples(TraceText(mSource, node), formatFor(scope));
    trace.brush = brushFor(scope);
    trace.tool = scope.tool;
    // A pen in the air leaves nothing on the paper.
    if (textOf(node, "type") != "penUp") mPage.traces.push_back(std::move(trace));
  }

  const SourceText& mSource;
  pugi::xml_document mDocument;
  std::map<std::string, pugi::xml_node> mById;
  std::map<std::size_t, TraceFormat> mFormats;  // by their element
  const TraceFormat mPlainFormat = plainFormat();
  TraceFormat mLastFormat;
  pugi::xml_node mLastBrush;
  pugi::xml_node mCurrentContext;
  Page mPage;
};

}  // namespace

Page readInkml(const SourceText& source) {
  return PageReader(source).read();
}

Page readInkmlFile(const std::string& path) {
  return readInkml(SourceText::fromFile(path));
}

}  // namespace QeltDesktop
