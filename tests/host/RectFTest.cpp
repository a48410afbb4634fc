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

TEST(RectF, GrowsByRectanglesWithoutAreaToo) {
  RectF rect{1, 2, 3, 4};
  rect.Union(RectF{7, 1, 7, 1});
  expectEdges(rect, 1, 1, 7, 4);
  rect.Union(RectF());
  expectEdges(rect, 0, 0, 7, 4);
}

TEST(RectF, IgnoresWhatIsNotANumberEdgeByEdge) {
  RectF rect{1, 2, 3, 4};
  rect.MakeRect(NAN, 9);
  expectEdges(rect, 1, 2, 3, 9);
  rect.Union(RectF{NAN, -1, NAN, NAN});
  expectEdges(rect, 1, -1, 3, 9);
  rect.MakeRect(nullptr);
  expectEdges(rect, 1, -1, 3, 9);

  RectF broken{NAN, NAN, NAN, NAN};
  broken.MakeRect(5, 6);
  expectEdges(broken, 5, 6, 5, 6);
}

TEST(RectF, RoundsOutwardsAndSurvivesInfinity) {
  RectF rect{-0.25f, 1.0f, 1.25f, -1.5f};
  rect.ExtendRect();
  expectEdges(rect, -1, 1, 2, -1);
  rect = RectF{-INFINITY, NAN, INFINITY, 1e30f};
  rect.ExtendRect();
  EXPECT_EQ(rect.left, -INFINITY);
  EXPECT_NE(rect.top, rect.top);
  EXPECT_EQ(rect.bottom, 1e30f);
}

TEST(RectF, TouchingRectanglesIntersect) {
  const RectF tile{512, 0, 1024, 512};
  EXPECT_TRUE((RectF{500, 500, 512, 512}.IsIntersect(tile)));
  EXPECT_FALSE((RectF{500, 500, 511.99f, 512}.IsIntersect(tile)));
  EXPECT_TRUE((RectF{600, 100, 600, 100}.IsIntersect(tile)));
  EXPECT_FALSE((RectF{NAN, 0, 1000, 100}.IsIntersect(tile)));
}

}  // namespace
