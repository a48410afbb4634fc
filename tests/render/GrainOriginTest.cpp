#include <gtest/gtest.h>

#include "render/StampRenderer.h"

namespace Qelt {
namespace {

// A view that is sheared and in perspective, in a viewport that is neither square nor at the origin.
TEST(GrainOriginTest, IsTheStartPointInWindowPixels) {
  Matrix4<float> projection;
  projection[0] = 0.01f;
  projection[4] = 0.002f;
  projection[12] = -0.5f;
  projection[1] = 0.003f;
  projection[5] = 0.02f;
  projection[13] = 0.25f;
  projection[3] = 0.001f;
  projection[7] = 0.002f;
  GrainOrigin origin;
  origin.set(30.0f, 40.0f);
  origin.settle(projection, {10, 20, 0, 100});
  EXPECT_TRUE(origin.isPending()) << "there is no viewport yet";
  origin.settle(projection, {10, 20, 200, 100});
  EXPECT_FALSE(origin.isPending());
  // Clip coordinates (-0.12, 1.14) over 1.11, then 100 pixels a unit in x and 50 in y.
  EXPECT_NEAR(origin.value().x, (-0.12f / 1.11f + 1.0f) * 100.0f + 10.0f, 1e-3f);
  EXPECT_NEAR(origin.value().y, (1.14f / 1.11f + 1.0f) * 50.0f + 20.0f, 1e-3f);
}

}  // namespace
}  // namespace Qelt
