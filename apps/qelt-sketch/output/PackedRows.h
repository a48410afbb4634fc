#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

namespace QeltDesktop {

// Rows of a layer, of which most is bare or of one colour: pixels that are alike take next to no memory, all
// others what they took before.
class PackedRows {
 public:
  // 4 bytes a pixel.
  explicit PackedRows(std::span<const std::uint8_t> rows);

  // The same bytes again, for which `rows` has just the room.
  void unpack(std::span<std::uint8_t> rows) const;

 private:
  struct Run {
    std::uint32_t length;  // pixels
    bool isAlike;
  };

  std::vector<Run> mRuns;
  std::vector<std::uint32_t> mPixels;  // one for each run that is alike, all of the others
};

}  // namespace QeltDesktop
