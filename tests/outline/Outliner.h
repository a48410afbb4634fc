#pragma once

#include <gmock/gmock.h>

#include <cstddef>
#include <string>
#include <vector>

#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "support/DrawableBoard.h"

namespace QeltTests {

// A stamp, read back from the six vertices of one stream.
struct OutlineStamp {
  float x, y, half, tiltFactor, directionX, directionY;
};

inline std::vector<OutlineStamp> outlineStamps(const std::vector<float>& floats) {
  EXPECT_EQ(floats.size() % 42, 0u);
  std::vector<OutlineStamp> stamps;
  for (std::size_t i = 0; i + 42 <= floats.size(); i += 42) {
    const float* first = floats.data() + i;
    const float* last = first + 35;
    // Top left, bottom left, top right twice, bottom left, bottom right.
    for (int vertex = 0; vertex < 6; ++vertex) {
      const float* v = first + static_cast<std::ptrdiff_t>(vertex) * 7;
      const bool right = vertex == 2 || vertex == 3 || vertex == 5;
      const bool bottom = vertex == 1 || vertex == 4 || vertex == 5;
      EXPECT_EQ(v[0], right ? last[0] : first[0]);
      EXPECT_EQ(v[1], bottom ? last[1] : first[1]);
      EXPECT_EQ(v[2], right ? 1.0f : 0.0f);
      EXPECT_EQ(v[3], bottom ? 0.0f : 1.0f);
      for (int value = 4; value < 7; ++value) EXPECT_EQ(v[value], first[value]);
    }
    stamps.push_back({(first[0] + last[0]) * 0.5f, (first[1] + last[1]) * 0.5f, (last[0] - first[0]) * 0.5f,
                      first[4], first[5], first[6]});
  }
  return stamps;
}

inline BoardOptions outlinePaper(float size, bool curve = true) {
  BoardOptions options;
  options.size = size;
  options.curve = curve;
  return options;
}

// An outline drawable and what it needs.
template <typename Drawable>
struct Outliner : DrawableBoard<Drawable> {
  using Board = DrawableBoard<Drawable>;
  using Board::Board;

  bool outline(const std::vector<Sample>& samples) {
    const Qelt::MotionEvent event = this->recorded(samples);
    return outline(event);
  }
  template <typename Input>
  bool outline(const Input& input) {
    this->rect = {};
    return this->drawable->DrawOutline(&input, &this->rect);
  }
  std::vector<OutlineStamp> takeStamps(std::size_t stream = 0) {
    std::vector<OutlineStamp> stamps;
    for (const QeltDesktop::Batch& batch : this->takeBatches()) {
      EXPECT_EQ(batch.buffers.size(), 2u);
      const std::vector<OutlineStamp> some = outlineStamps(batch.buffers.at(stream));
      stamps.insert(stamps.end(), some.begin(), some.end());
    }
    return stamps;
  }
};

}  // namespace QeltTests
