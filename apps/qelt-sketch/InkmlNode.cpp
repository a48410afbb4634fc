#include "InkmlNode.h"

#include <algorithm>
#include <cstddef>

namespace QeltDesktop {
namespace {

std::string_view withoutPrefix(std::string_view name) {
  const std::size_t colon = name.rfind(':');
  return colon == std::string_view::npos ? name : name.substr(colon + 1);
}

}  // namespace

std::string_view localName(const pugi::xml_node& node) {
  return withoutPrefix(node.name());
}

bool isElement(const pugi::xml_node& node, std::string_view name) {
  return node.type() == pugi::node_element && localName(node) == name;
}

pugi::xml_node childElement(const pugi::xml_node& node, std::string_view name) {
  return node.find_child([&](const pugi::xml_node& child) { return isElement(child, name); });
}

pugi::xml_attribute attributeOf(const pugi::xml_node& node, std::string_view name) {
  return node.find_attribute(
      [&](const pugi::xml_attribute& attribute) { return withoutPrefix(attribute.name()) == name; });
}

std::string textOf(const pugi::xml_node& node, const char* attribute) {
  return trimmed(attributeOf(node, attribute).value());
}

int lineOf(const SourceText& source, const pugi::xml_node& node) {
  return source.lineAt(static_cast<std::size_t>(std::max<std::ptrdiff_t>(node.offset_debug(), 0)));
}

Refusal refusalAt(const SourceText& source, const pugi::xml_node& node, const std::string& what,
                  const std::string& value) {
  return source.refusal(lineOf(source, node), what, value);
}

std::string trimmed(std::string_view text) {
  constexpr std::string_view kSpace = " \t\r\n";
  const std::size_t first = text.find_first_not_of(kSpace);
  if (first == std::string_view::npos) return {};
  return std::string(text.substr(first, text.find_last_not_of(kSpace) - first + 1));
}

}  // namespace QeltDesktop
