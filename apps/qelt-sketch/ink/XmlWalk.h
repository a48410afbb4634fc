#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "ink/SourceText.h"

namespace QeltDesktop {

// What XML takes for white space.
constexpr std::string_view kXmlSpace = " \t\r\n";
// The text without the white space around it.
std::string trimmed(std::string_view text);

// An element's start tag, valid while it is visited. Elements and attributes are known by their names without
// a namespace prefix: "id" finds xml:id.
class XmlElement {
 public:
  // `attributes` are `count` pairs of name and value.
  XmlElement(const char* name, const char* const* attributes, std::size_t count, std::size_t offset)
      : mName(name), mAttributes(attributes), mCount(count), mOffset(offset) {}

  std::string qualifiedName() const { return std::string(mName); }
  std::string_view name() const;
  // Where the element begins in the source.
  std::size_t offset() const { return mOffset; }
  // The attribute's value without the white space around it; none if the element does not have it.
  std::optional<std::string> attribute(std::string_view name) const;
  // The same, but empty if the element does not have it.
  std::string text(std::string_view attributeName) const;

 private:
  std::string_view mName;
  const char* const* mAttributes;
  std::size_t mCount;
  std::size_t mOffset;
};

// A stretch of an element's characters.
struct XmlText {
  std::size_t offset;      // in the source
  std::size_t length;      // bytes in the source
  std::string_view value;  // the characters they stand for
  bool replaced;           // they stand in the source as a reference, such as "&#39;"
};

// A processing instruction: "<?target data?>".
struct XmlInstruction {
  std::size_t offset;  // in the source
  std::string_view target, data;
};

class XmlVisitor {
 public:
  virtual ~XmlVisitor() = default;
  virtual void elementBegins(const XmlElement& element) = 0;
  virtual void elementEnds() = 0;
  virtual void textComes(const XmlText& text) = 0;
  virtual void instructionComes(const XmlInstruction&) {}
};

// Walks through a document from its first tag to its last, keeping only the tags that are open. Elements of
// other namespaces than InkML's are passed over with all that is in them, and so are such attributes; the
// root's namespace counts as InkML's, whatever it is called, and a name that lies in none counts as well.
// Throws Refusal where the text is not XML, else what the visitor threw first, after which it is not called
// again.
void walkXml(const SourceText& source, XmlVisitor& visitor);

}  // namespace QeltDesktop
