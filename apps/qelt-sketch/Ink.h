#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "Samples.h"

namespace QeltDesktop {

// What a page says of the pen a trace was drawn with; what it leaves open is the pen's own.
struct Brush {
  std::optional<float> width;                // stroke units, above 0
  std::optional<std::uint32_t> rgb;          // 0xRRGGBB
  std::optional<std::uint8_t> transparency;  // 0 opaque, 255 invisible
};

// One stroke of the page.
struct Trace {
  Samples samples;  // never empty
  Brush brush;
  std::optional<int> tool;  // Qelt::ToolType
};

struct Page {
  std::vector<Trace> traces;  // never empty
};

}  // namespace QeltDesktop
