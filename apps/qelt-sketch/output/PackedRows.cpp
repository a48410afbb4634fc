#include "output/PackedRows.h"

#include <algorithm>
#include <cstring>

namespace QeltDesktop {
namespace {

// Fewer pixels are not worth a run of their own: whatever the rows, packing then makes them no larger.
constexpr std::size_t kShortestAlike = 8;

}  // namespace

PackedRows::PackedRows(std::span<const std::uint8_t> rows) {
  const std::size_t count = rows.size() / sizeof(std::uint32_t);
  const auto pixelAt = [&rows](std::size_t index) {
    std::uint32_t pixel = 0;
    std::memcpy(&pixel, &rows[index * sizeof pixel], sizeof pixel);
    return pixel;
  };
  for (std::size_t at = 0, end = 0; at < count; at = end) {
    const std::uint32_t pixel = pixelAt(at);
    for (end = at + 1; end < count && pixelAt(end) == pixel;) ++end;
    const bool isAlike = end - at >= kShortestAlike;
    mPixels.insert(mPixels.end(), isAlike ? 1 : end - at, pixel);
    if (isAlike || mRuns.empty() || mRuns.back().isAlike) mRuns.push_back({0, isAlike});
    mRuns.back().length += static_cast<std::uint32_t>(end - at);
  }
  mRuns.shrink_to_fit();
  mPixels.shrink_to_fit();
}

void PackedRows::unpack(std::span<std::uint8_t> rows) const {
  std::uint8_t* to = rows.data();
  const std::uint32_t* from = mPixels.data();
  for (const Run& run : mRuns) {
    const std::size_t bytes = run.length * sizeof *from;
    if (!run.isAlike) {
      std::memcpy(to, from, bytes);
    } else {
      for (std::size_t i = 0; i < bytes; i += sizeof *from) std::memcpy(to + i, from, sizeof *from);
    }
    from += run.isAlike ? 1 : run.length;
    to += bytes;
  }
}

}  // namespace QeltDesktop
