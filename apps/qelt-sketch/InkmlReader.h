#pragma once

#include <string>

#include "Ink.h"
#include "SourceText.h"

namespace QeltDesktop {

// Reads a page of W3C InkML. Every trace that lays down ink becomes one stroke, in document order; what a
// <definitions> element holds is only drawn by what refers to it. Throws Refusal, "file:line: what: value",
// at the first thing that is malformed.
Page readInkml(const SourceText& source);
Page readInkmlFile(const std::string& path);

}  // namespace QeltDesktop
