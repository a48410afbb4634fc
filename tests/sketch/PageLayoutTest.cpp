#include "play/PageLayout.h"

#include <gtest/gtest.h>

#include <cmath>

#include "base/PointF.h"
#include "ink/Ink.h"

namespace QeltDesktop {
namespace {

Qelt::PointF mapped(const PageLayout& layout, float x, float y) {
  const Qelt::Matrix3<float>& m = layout.matrix;
  return {m[0] * x + m[3] * y + m[6], m[1] * x + m[4] * y + m[7]};
}

void expectAt(const Qelt::PointF& point, float x, float y) {
  EXPECT_NEAR(point.x, x, 1e-3f);
  EXPECT_NEAR(point.y, y, 1e-3f);
}

TEST(PageLayout, PutsTheExtentInsideItsMargin) {
  Page page;
  page.strokes.add({{.x = 10.0f, .y = -5.0f}, {.x = 30.0f, .y = 15.0f}});
  page.strokes.add({{.x = 50.0f, .y = 0.0f}});
  const float margin = pageMargin(6.0f, 2.0f);  // 16 + 2 * 6 + 2
  EXPECT_EQ(margin, 30.0f);
  const PageLayout layout = layOut(pageArea(page, {}, margin), 2.0f, 0.0f);
  EXPECT_EQ(layout.width, 200.0);   // (40 + 60) * 2
  EXPECT_EQ(layout.height, 160.0);  // (20 + 60) * 2
  expectAt(mapped(layout, 10.0f, -5.0f), 60.0f, 60.0f);
  EXPECT_EQ(pageMargin(NAN, -1.0f), 16.0f);
  EXPECT_EQ(pageMargin(1e30f, 0.0f), 512.0f);

  const PageLayout given = layOut(pageArea(page, PageSize{300.0f, 200.0f}, margin), 1.0f, 0.0f);
  EXPECT_EQ(given.width, 300.0);
  expectAt(mapped(given, 0.0f, 0.0f), 0.0f, 0.0f);
}

TEST(PageLayout, TurnsClockwiseAboutTheCentreAndGrows) {
  const PageArea area{100.0f, 200.0f, 40.0f, 20.0f};
  const PageLayout quarter = layOut(area, 1.0f, 90.0f);
  EXPECT_EQ(quarter.width, 20.0);
  EXPECT_EQ(quarter.height, 40.0);
  expectAt(mapped(quarter, 100.0f, 200.0f), 20.0f, 0.0f);  // the top left corner goes to the top right
  expectAt(mapped(quarter, 140.0f, 220.0f), 0.0f, 40.0f);

  const PageLayout eighth = layOut(area, 2.0f, 45.0f);
  EXPECT_NEAR(eighth.width, 84.853, 1e-3);  // (40 + 20) * 2 / sqrt(2)
  EXPECT_NEAR(eighth.height, 84.853, 1e-3);
  expectAt(mapped(eighth, 120.0f, 210.0f), 42.426f, 42.426f);
  expectAt(mapped(eighth, 100.0f, 200.0f), 28.284f, 0.0f);  // 20 * sqrt(2), at the very top
}

}  // namespace
}  // namespace QeltDesktop
