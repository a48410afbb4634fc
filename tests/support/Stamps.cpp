#include "support/Stamps.h"

#include <cstddef>
#include <ostream>

namespace QeltTests {

std::ostream& operator<<(std::ostream& out, const Stamp& stamp) {
  return out << "stamp (" << stamp.x << ", " << stamp.y << ") half " << stamp.halfWidth << " x "
             << stamp.halfHeight << " alpha " << stamp.alpha << " narrowing " << stamp.narrowing << " tile "
             << stamp.tile << " direction (" << stamp.directionX << ", " << stamp.directionY << ") inner "
             << stamp.innerRadius << " by width " << stamp.alphaByWidth;
}

std::vector<Stamp> stampsOf(const std::vector<float>& batch, int stride) {
  const auto floatsInVertex = static_cast<std::size_t>(stride);
  EXPECT_EQ(batch.size() % (6 * floatsInVertex), 0u) << "not whole stamps";

  // Vertex by vertex: 0 the left or top edge, 1 the right or bottom one.
  constexpr int kRight[6] = {0, 0, 1, 1, 0, 1};
  constexpr int kBottom[6] = {0, 1, 0, 0, 1, 1};
  std::vector<Stamp> stamps;
  for (std::size_t start = 0; start + 6 * floatsInVertex <= batch.size(); start += 6 * floatsInVertex) {
    const float* first = batch.data() + start;
    const float* last = first + 5 * floatsInVertex;
    for (int number = 0; number < 6; ++number) {
      const float* vertex = first + number * floatsInVertex;
      const auto where = testing::Message() << "stamp " << stamps.size() << ", vertex " << number;
      EXPECT_EQ(vertex[0], kRight[number] != 0 ? last[0] : first[0]) << where;
      EXPECT_EQ(vertex[1], kBottom[number] != 0 ? last[1] : first[1]) << where;
      EXPECT_EQ(vertex[2], static_cast<float>(kRight[number])) << where;
      EXPECT_EQ(vertex[3], static_cast<float>(1 - kBottom[number])) << where;
      for (std::size_t value = 4; value < floatsInVertex; ++value) {
        EXPECT_EQ(vertex[value], first[value]) << where << ", float " << value;
      }
    }
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
