#pragma once

#include <limits>
#include <string>

#include "ink/Ink.h"
#include "ink/SourceText.h"

namespace QeltDesktop {

// Reads a page of W3C InkML. Every trace that leaves ink becomes one stroke, in document order; a trace
// within a <definitions> element is not drawn. Throws Refusal, "file:line: what: value", at the first thing
// that is malformed, or at a place farther from the origin, along x or y, than `farthest` stroke units.
Page readInkml(const SourceText& source, float farthest = std::numeric_limits<float>::max());
Page readInkmlFile(const std::string& path);

}  // namespace QeltDesktop
