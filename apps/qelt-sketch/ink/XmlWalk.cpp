#include "ink/XmlWalk.h"

#include <expat.h>

#include <algorithm>
#include <exception>
#include <functional>
#include <map>
#include <memory>
#include <new>
#include <type_traits>
#include <vector>

#include "text/Utf8.h"

namespace QeltDesktop {
namespace {

constexpr std::string_view kInkmlNamespace = "http://www.w3.org/2003/InkML";

std::string_view withoutPrefix(std::string_view name) {
  const std::size_t colon = name.rfind(':');
  return colon == std::string_view::npos ? name : name.substr(colon + 1);
}

// Empty if the name has none.
std::string_view prefixOf(std::string_view name) {
  const std::size_t colon = name.rfind(':');
  return colon == std::string_view::npos ? std::string_view() : name.substr(0, colon);
}

// The prefix that an attribute declares a namespace for, empty for the default namespace; none for any other
// attribute.
std::optional<std::string_view> declaredPrefix(std::string_view attribute) {
  if (attribute == "xmlns") return std::string_view();
  if (!attribute.starts_with("xmlns:")) return std::nullopt;
  return attribute.substr(std::string_view("xmlns:").size());
}

// Tells the names of InkML from those of other namespaces. Pages without namespaces, with prefixes that are
// bound to none or with a namespace of their own for the root element are common, so everything counts as
// InkML unless it lies in another namespace than InkML's and the root's.
class Namespaces {
 public:
  // `attributes` are `count` pairs of name and value.
  void elementBegins(std::string_view element, const char* const* attributes, std::size_t count) {
    const bool isRoot = mDepth == 0;
    ++mDepth;
    if (isRoot) mRoot = declared(prefixOf(element), attributes, count);
    for (std::size_t i = 0; i < count; ++i) {
      const std::optional<std::string_view> prefix = declaredPrefix(attributes[2 * i]);
      if (!prefix) continue;
      const std::string_view name = attributes[2 * i + 1];
      const auto bindings = mBindings.try_emplace(std::string(*prefix)).first;
      bindings->second.push_back(!name.empty() && name != kInkmlNamespace && name != mRoot);
      mDeclared.push_back({mDepth, bindings});
    }
  }

  void elementEnds() {
    for (; !mDeclared.empty() && mDeclared.back().depth == mDepth; mDeclared.pop_back()) {
      const Bindings::iterator bindings = mDeclared.back().bindings;
      bindings->second.pop_back();
      if (bindings->second.empty()) mBindings.erase(bindings);
    }
    --mDepth;
  }

  // Elements without a prefix lie in the default namespace, attributes without one in none.
  bool isForeign(std::string_view prefix) const {
    const auto found = mBindings.find(prefix);
    return found != mBindings.end() && found->second.back();
  }

 private:
  // What each prefix stands for in the elements that are open, true for a foreign name; the last one holds.
  using Bindings = std::map<std::string, std::vector<bool>, std::less<>>;
  struct Declaration {
    int depth;
    Bindings::iterator bindings;
  };

  static std::string declared(std::string_view prefix, const char* const* attributes, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i) {
      if (declaredPrefix(attributes[2 * i]) == prefix) return attributes[2 * i + 1];
    }
    return {};
  }

  Bindings mBindings;
  std::vector<Declaration> mDeclared;
  std::string mRoot;
  int mDepth = 0;
};

struct FreeParser {
  void operator()(XML_Parser parser) const { XML_ParserFree(parser); }
};

// For a text in an encoding that the parser does not know. Only its ASCII characters matter here, and those
// are the same in most encodings.
int asSingleBytes(void*, const XML_Char*, XML_Encoding* encoding) {
  for (int i = 0; i < 256; ++i) encoding->map[i] = i;
  encoding->data = nullptr;
  encoding->convert = nullptr;
  encoding->release = nullptr;
  return XML_STATUS_OK;
}

class Walk {
 public:
  Walk(const SourceText& source, XmlVisitor& visitor) : mSource(source), mVisitor(visitor) {
    // Some programs put an empty line before the XML declaration.
    mStart = std::min(source.text().find_first_not_of(kXmlSpace), source.text().size());
    // A text that is valid UTF-8 is read as UTF-8, whatever its declaration says.
    mParser.reset(XML_ParserCreate(isUtf8(source.text()) ? "UTF-8" : nullptr));
    if (!mParser) throw std::bad_alloc();
    XML_Parser parser = mParser.get();
    XML_SetUserData(parser, this);
    XML_SetElementHandler(parser, begins, ends);
    XML_SetCharacterDataHandler(parser, comes);
    XML_SetProcessingInstructionHandler(parser, instructs);
    // With these two, references to unknown entities come as they are written.
    XML_SetDefaultHandler(parser, comesAsWritten);
    XML_UseForeignDTD(parser, XML_TRUE);
    XML_SetUnknownEncodingHandler(parser, asSingleBytes, nullptr);
  }

  void run() {
    constexpr std::size_t kBlock = 65536, kLargestBlock = std::size_t{1} << 30;
    const std::string_view text = std::string_view(mSource.text()).substr(mStart);
    XML_Index before = -1;
    std::size_t block = kBlock;
    for (std::size_t at = 0; at < text.size() || at == 0;) {
      const std::size_t size = std::min(block, text.size() - at);
      const bool last = at + size == text.size();
      if (XML_Parse(mParser.get(), text.data() + at, static_cast<int>(size), last) != XML_STATUS_OK)
        throw refusal();
      if (last) break;
      at += size;
      // The parser scans a token from its start again for each block that does not end it. Blocks that grow
      // keep this from taking a time that grows with the square of the token.
      const XML_Index now = XML_GetCurrentByteIndex(mParser.get());
      block = now == before ? std::min(block * 2, kLargestBlock) : kBlock;
      before = now;
    }
    if (mThrown) std::rethrow_exception(mThrown);
  }

 private:
  // Nothing may be thrown through the parser, which is written in C. It goes on, because a text that is not
  // XML is refused for that before anything else.
  template <typename Visit>
  void visit(const Visit& call) noexcept {
    if (mThrown) return;
    try {
      call();
    } catch (...) {
      mThrown = std::current_exception();
    }
  }

  static Walk& of(void* user) { return *static_cast<Walk*>(user); }

  static void begins(void* user, const XML_Char* name, const XML_Char** attributes) {
    Walk& walk = of(user);
    ++walk.mDepth;
    const int given = XML_GetSpecifiedAttributeCount(walk.mParser.get());
    walk.visit([&] { walk.begin(name, attributes, static_cast<std::size_t>(given) / 2); });
  }

  void begin(const XML_Char* name, const XML_Char** attributes, std::size_t count) {
    if (mForeignDepth > 0) {
      ++mForeignDepth;
      return;
    }
    mNamespaces.elementBegins(name, attributes, count);
    if (mNamespaces.isForeign(prefixOf(name))) {
      mForeignDepth = 1;
      return;
    }
    mAttributes.clear();
    for (std::size_t i = 0; i < count; ++i) {
      const std::string_view attribute = attributes[2 * i];
      const std::string_view prefix = prefixOf(attribute);
      if (declaredPrefix(attribute) || (!prefix.empty() && mNamespaces.isForeign(prefix))) continue;
      mAttributes.insert(mAttributes.end(), {attributes[2 * i], attributes[2 * i + 1]});
    }
    mVisitor.elementBegins({name, mAttributes.data(), mAttributes.size() / 2, offset()});
  }

  static void ends(void* user, const XML_Char*) {
    Walk& walk = of(user);
    --walk.mDepth;
    walk.visit([&] { walk.end(); });
  }

  void end() {
    const bool isForeign = mForeignDepth > 0;
    if (isForeign && --mForeignDepth > 0) return;
    if (!isForeign) mVisitor.elementEnds();
    mNamespaces.elementEnds();
  }

  static void comes(void* user, const XML_Char* characters, int count) {
    Walk& walk = of(user);
    if (walk.mForeignDepth > 0) return;
    const auto size = static_cast<std::size_t>(count);
    const auto written = static_cast<std::size_t>(XML_GetCurrentByteCount(walk.mParser.get()));
    // A reference is longer than the character it stands for; an "&" in a CDATA section stands for itself.
    const bool replaced = walk.mSource.text()[walk.offset()] == '&' && written > size;
    walk.visit([&] {
      walk.mVisitor.textComes({walk.offset(), written, std::string_view(characters, size), replaced});
    });
  }

  static void instructs(void* user, const XML_Char* target, const XML_Char* data) {
    Walk& walk = of(user);
    walk.visit([&] { walk.mVisitor.instructionComes({walk.offset(), target, data}); });
  }

  // Gets everything else: comments and the like, which are skipped, and references to unknown entities.
  static void comesAsWritten(void* user, const XML_Char* characters, int count) {
    if (count > 0 && characters[0] == '&' && of(user).mDepth > 0) comes(user, characters, count);
  }

  std::size_t offset() const {
    const XML_Index index = XML_GetCurrentByteIndex(mParser.get());
    return mStart + static_cast<std::size_t>(std::max<XML_Index>(index, 0));
  }

  Refusal refusal() const {
    const XML_Error error = XML_GetErrorCode(mParser.get());
    const std::string_view rest = std::string_view(mSource.text()).substr(offset());
    std::string what = XML_ErrorString(error);
    if (error == XML_ERROR_NO_MEMORY) throw std::bad_alloc();
    if (error == XML_ERROR_NO_ELEMENTS) {
      what = mDepth == 0 ? "No document element found" : "Start-end tags mismatch";
    } else if (error == XML_ERROR_TAG_MISMATCH) {
      what = "Start-end tags mismatch";
    } else if (error == XML_ERROR_JUNK_AFTER_DOC_ELEMENT && rest.starts_with('<')) {
      what = rest.starts_with("</") ? "Start-end tags mismatch" : "a second root element";
    } else if (error == XML_ERROR_BAD_CHAR_REF) {
      what += ": " + std::string(rest.substr(0, rest.find(';') + 1));
    }
    return mSource.refusalAt(offset(), "not XML", what);
  }

  const SourceText& mSource;
  XmlVisitor& mVisitor;
  std::size_t mStart = 0;
  std::unique_ptr<std::remove_pointer_t<XML_Parser>, FreeParser> mParser;
  int mDepth = 0;
  Namespaces mNamespaces;
  int mForeignDepth = 0;                 // how deep within an element of another namespace
  std::vector<const char*> mAttributes;  // of the element that begins, without those of other namespaces
  std::exception_ptr mThrown;
};

}  // namespace

std::string trimmed(std::string_view text) {
  const std::size_t first = text.find_first_not_of(kXmlSpace);
  if (first == std::string_view::npos) return {};
  return std::string(text.substr(first, text.find_last_not_of(kXmlSpace) - first + 1));
}

std::string_view XmlElement::name() const {
  return withoutPrefix(mName);
}

std::optional<std::string> XmlElement::attribute(std::string_view name) const {
  for (std::size_t i = 0; i < mCount; ++i) {
    if (withoutPrefix(mAttributes[2 * i]) == name) return trimmed(mAttributes[2 * i + 1]);
  }
  return std::nullopt;
}

std::string XmlElement::text(std::string_view attributeName) const {
  return attribute(attributeName).value_or(std::string());
}

void walkXml(const SourceText& source, XmlVisitor& visitor) {
  if (const std::size_t nul = source.text().find('\0'); nul != std::string::npos)
    throw source.refusalAt(nul, "not XML", "a NUL byte");
  Walk(source, visitor).run();
}

}  // namespace QeltDesktop
