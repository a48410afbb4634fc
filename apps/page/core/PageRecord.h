#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "core/PageTypes.h"
#include "ink/Samples.h"

namespace QeltDesktop {

// A stroke as a page is stored, in bytes that no later version of the page changes the meaning of:
//
//   offset  bytes
//        0      4   "QPst"
//        4      2   version of this layout, 1
//        6      2   bit 0: smooth, bit 1: outline
//        8      1   look
//        9      1   tool, as Qelt::ToolType
//       10      2   0
//       12      4   pen size, float
//       16      4   colour, 0xAARRGGBB
//       20      4   outline size, float; 0 without an outline
//       24      4   outline colour, 0xAARRGGBB; 0 without an outline
//       28      4   number of samples, at least 1
//       32     28   of each sample: x, y, pressure, tilt, orientation, floats; time, double
//
// Numbers are little-endian, units those of Sample and PageStyle.
struct StrokeRecord {
  PageStyle style;
  std::vector<Sample> samples;
};

std::vector<std::uint8_t> writeRecord(const PageStyle& style, std::span<const Sample> samples);

// Throws Refusal when the bytes are not the whole of a stroke that a page can hold, or of a newer version.
StrokeRecord readRecord(std::span<const std::uint8_t> bytes);

}  // namespace QeltDesktop
