#pragma once

#include <cstdint>

// For each rendering version: the version of the stroke drawable, then that of the outline drawable.
// Exported. Row 0 is never selected, see Qelt::versionRow.
extern "C" __attribute__((visibility("default"))) const std::int32_t versionTable[9][2];

namespace Qelt {

// The row of a pen's rendering version: 1 to 8 have their own. Kept: all others, 0 among them, take row 1.
inline int versionRow(std::int32_t renderingVersion) {
  return static_cast<std::uint32_t>(renderingVersion) - 1u <= 7u ? renderingVersion : 1;
}

}  // namespace Qelt
