#include "support/Stamps.h"

#include <cstddef>
#include <ostream>

#include "support/BatchCheck.h"

namespace QeltTests {

std::ostream& operator<<(std::ostream& out, const Stamp& stamp) {
  return out << "stamp (" << stamp.x << ", " << stamp.y << ") half " << stamp.halfWidth << " x "
             << stamp.halfHeight << " alpha " << stamp.alpha << " narrowing " << stamp.narrowing << " tile "
             << stamp.tile << " direction (" << stamp.directionX << ", " << stamp.directionY << ") inner "
             << stamp.innerRadius << " by width " << stamp.alphaByWidth;
}

std::vector<Stamp> stampsOf(const std::vector<float>& batch, int stride) {
  const auto floatsInVertex = static_cast<std::size_t>(stride);
  EXPECT_TRUE(isOfStamps(batch, floatsInVertex)) << "not the two triangles of one rectangle each";
  std::vector<Stamp> stamps;
  for (std::size_t start = 0; start + 6 * floatsInVertex <= batch.size(); start += 6 * floatsInVertex) {
    const float* first = batch.data() + start;
    const float* last = first + 5 * floatsInVertex;
    Stamp& stamp = stamps.emplace_back();
    stamp.x = (first[0] + last[0]) * 0.5f;
    stamp.y = (first[1] + last[1]) * 0.5f;
    stamp.halfWidth = (last[0] - first[0]) * 0.5f;
    stamp.halfHeight = (last[1] - first[1]) * 0.5f;
    // An outline's vertex has no alpha and no tile.
    if (stride > 7) stamp.alpha = first[4];
    stamp.narrowing = first[stride > 7 ? 5 : 4];
    if (stride > 7) stamp.tile = static_cast<int>(first[6]);
    stamp.directionX = first[stride > 7 ? 7 : 5];
    stamp.directionY = first[stride > 7 ? 8 : 6];
    if (stride == 11) {
      stamp.innerRadius = first[9];
      stamp.alphaByWidth = first[10];
    }
  }
  return stamps;
}

}  // namespace QeltTests
