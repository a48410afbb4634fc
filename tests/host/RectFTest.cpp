#include "base/RectF.h"

#include <gtest/gtest.h>

#include <limits>

namespace {

using Qelt::RectF;

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInfinity = std::numeric_limits<float>::infinity();

void expectEdges(const RectF& rect, float left, float top, float right, float bottom) {
  EXPECT_EQ(rect.left, left);
  EXPECT_EQ(rect.top, top);
  EXPECT_EQ(rect.right, right);
  EXPECT_EQ(rect.bottom, bottom);
}

TEST(RectF, GrowsByWhatHasNoAreaTooAndIgnoresNaNEdgeByEdge) {
  RectF rect{1, 2, 3, 4};
  rect.Union(RectF{7, 1, 7, 1});
  rect.Union(RectF());
  expectEdges(rect, 0, 0, 7, 4);
  rect.MakeRect(kNaN, 9);
  rect.Union(RectF{kNaN, -1, kNaN, kNaN});
  rect.MakeRect(nullptr);
  expectEdges(rect, 0, -1, 7, 9);
  rect = {kNaN, kNaN, kNaN, kNaN};
  rect.MakeRect(5, 6);
  expectEdges(rect, 5, 6, 5, 6);
}

TEST(RectF, RoundsOutwardsAndSurvivesInfinity) {
  RectF rect{-0.25f, -kInfinity, 1.25f, -1.5f};
  rect.ExtendRect();
  expectEdges(rect, -1, -kInfinity, 2, -1);
}

TEST(RectF, TouchingRectanglesIntersect) {
  const RectF tile{512, 0, 1024, 512};
  EXPECT_TRUE((RectF{500, 500, 512, 512}.IsIntersect(tile)));
  EXPECT_FALSE((RectF{500, 500, 511.99f, 512}.IsIntersect(tile)));
  EXPECT_TRUE((RectF{600, 100, 600, 100}.IsIntersect(tile)));
  EXPECT_FALSE((RectF{kNaN, 0, 1000, 100}.IsIntersect(tile)));
}

}  // namespace
