#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

#include "SourceText.h"

namespace QeltDesktop {

std::string trimmed(std::string_view text);

// An element's start tag, as long as it is being visited. Elements and attributes go by their names without
// namespace prefix: "id" finds xml:id.
class XmlElement {
 public:
  // `attributes` is `count` pairs of name and value.
  XmlElement(const char* name, const char* const* attributes, std::size_t count, std::size_t offset)
      : mName(name), mAttributes(attributes), mCount(count), mOffset(offset) {}

  std::string qualifiedName() const { return std::string(mName); }
  std::string_view name() const;
  // Where it begins in the source.
  std::size_t offset() const { return mOffset; }
  // The value less the space around it; none without the attribute.
  std::optional<std::string> attribute(std::string_view name) const;
  // The same, empty without the attribute.
  std::string text(std::string_view attributeName) const;

 private:
  std::string_view mName;
  const char* const* mAttributes;
  std::size_t mCount;
  std::size_t mOffset;
};

// A stretch of an element's characters.
struct XmlText {
  std::size_t offset;  // in the source, and how many bytes there
  std::size_t length;
  std::string_view value;  // as characters
  bool replaced;           // the source has a reference ("&#39;") in its place
};

class XmlVisitor {
 public:
  virtual ~XmlVisitor() = default;
  virtual void elementBegins(const XmlElement& element) = 0;
  virtual void elementEnds() = 0;
  virtual void textComes(const XmlText& text) = 0;
};

// Walks through a document from its first tag to its last, holding no more than the tags that are open.
// Throws Refusal where the text is not XML, else what the visitor threw first; after that the visitor is left
// alone.
void walkXml(const SourceText& source, XmlVisitor& visitor);

}  // namespace QeltDesktop
