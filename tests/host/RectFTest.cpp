#include "base/RectF.h"

#include <gtest/gtest.h>
#include <cmath>

namespace {

using Qelt::RectF;

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
  rect.MakeRect(NAN, 9);
  rect.Union(RectF{NAN, -1, NAN, NAN});
  rect.MakeRect(nullptr);
  expectEdges(rect, 0, -1, 7, 9);
  rect = {NAN, NAN, NAN, NAN};
  rect.MakeRect(5, 6);
  expectEdges(rect, 5, 6, 5, 6);
}

TEST(RectF, RoundsOutwardsAndSurvivesInfinity) {
  RectF rect{-0.25f, -INFINITY, 1.25f, -1.5f};
  rect.ExtendRect();
  expectEdges(rect, -1, -INFINITY, 2, -1);
}

TEST(RectF, TouchingRectanglesIntersect) {
  const RectF tile{512, 0, 1024, 512};
  EXPECT_TRUE((RectF{500, 500, 512, 512}.IsIntersect(tile)));
  EXPECT_FALSE((RectF{500, 500, 511.99f, 512}.IsIntersect(tile)));
  EXPECT_TRUE((RectF{600, 100, 600, 100}.IsIntersect(tile)));
  EXPECT_FALSE((RectF{NAN, 0, 1000, 100}.IsIntersect(tile)));
}

}  // namespace
