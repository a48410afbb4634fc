#pragma once

#include <cstdint>
#include <optional>
#include <vector>

namespace QeltDesktop {

// One point of recorded pen input.
struct Sample {
  float x = 0.0f, y = 0.0f;  // stroke units, y down; always finite
  float pressure = 1.0f;     // 0 to 1, not checked
  float tilt = 0.0f;         // radians from upright
  float orientation = 0.0f;  // radians, clockwise from up, above -pi to pi
  double time = 0.0;         // milliseconds
};

// What a page says of the pen a trace was drawn with; what it leaves open is the pen's own.
struct Brush {
  std::optional<float> width;                // stroke units, above 0
  std::optional<std::uint32_t> rgb;          // 0xRRGGBB
  std::optional<std::uint8_t> transparency;  // 0 opaque, 255 invisible
};

// One stroke of the page.
struct Trace {
  std::vector<Sample> samples;  // never empty
  Brush brush;
  std::optional<int> tool;  // Qelt::ToolType
};

struct Page {
  std::vector<Trace> traces;  // never empty
};

}  // namespace QeltDesktop
