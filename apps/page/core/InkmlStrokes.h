#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include "core/PageStroke.h"
#include "core/PageTypes.h"
#include "ink/Ink.h"

namespace QeltDesktop {

// How a stroke of a file is drawn: what the file leaves open is the pen's own, of the newest look, smooth.
// Throws Refusal when a page draws no such stroke.
PageStyle styleOf(const Stroke& stroke, const PenLimits& own);

// The strokes of an InkML file, numbered from `first`. Throws Refusal, "name:line: what is wrong", or with
// the number of the trace where that is not InkML's business.
std::vector<std::unique_ptr<PageStroke>> readStrokes(std::span<const std::uint8_t> bytes,
                                                     const std::string& name, StrokeId first,
                                                     const PenLimits& own);

}  // namespace QeltDesktop
