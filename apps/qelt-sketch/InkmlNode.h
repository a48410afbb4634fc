#pragma once

#include <string>
#include <string_view>

#include <pugixml.hpp>

#include "Refusal.h"
#include "SourceText.h"

namespace QeltDesktop {

// Elements of an InkML document, named without their namespace prefix. pugixml knows no namespaces.

std::string_view localName(const pugi::xml_node& node);
bool isElement(const pugi::xml_node& node, std::string_view name);
// The first child element of that name; a null node when there is none.
pugi::xml_node childElement(const pugi::xml_node& node, std::string_view name);
// An attribute by its name without prefix ("id" finds xml:id); null when there is none.
pugi::xml_attribute attributeOf(const pugi::xml_node& node, std::string_view name);
std::string textOf(const pugi::xml_node& node, const char* attribute);

// The line an element, or the text in it, starts on.
int lineOf(const SourceText& source, const pugi::xml_node& node);

// Refuses what stands in an element.
Refusal refusalAt(const SourceText& source, const pugi::xml_node& node, const std::string& what,
                  const std::string& value);

std::string trimmed(std::string_view text);

}  // namespace QeltDesktop
