#include <gmock/gmock.h>

#include <array>
#include <cstddef>

#include "base/RectF.h"
#include "desktop/graphics/PenCanvas.h"
#include "math/Matrix3.h"
#include "render/PenGLRenderMsg.h"
#include "support/DrawableBoard.h"

namespace QeltTests {
namespace {

// By 45 degrees no two corners give the box: (0, 0, 10, 20) has its left at (0, 20), its right at (10, 0),
// its bottom at (10, 20): -14.142136, 7.0710678 and 21.213203; moved by (100, 50). The other way round its
// top is at (10, 0), its right at (10, 20), its bottom at (0, 20).
TEST(RenderMessage, BoxesAllFourCornersOfItsRectangle) {
  constexpr float h = 0.70710678f;
  struct Case {
    std::array<float, 9> view;
    float left, top, right, bottom;
  };
  for (const auto& [view, left, top, right, bottom] :
       {Case{{h, h, 0, -h, h, 0, 100, 50, 1}, 85.857864f, 50.0f, 107.0710678f, 71.213203f},
        Case{{h, -h, 0, h, h, 0, 100, 50, 1}, 100.0f, 42.928932f, 121.213203f, 64.142136f}}) {
    QeltDesktop::PenCanvas canvas(nullptr, nullptr);
    canvas.setMatrix(Qelt::Matrix3<float>(view.data()));
    const Qelt::RectF box =
        Qelt::PenGLRenderMsg(nullptr, &canvas, {0, 0, 10, 20}, false).getTransformedRect();
    EXPECT_THAT((std::array{box.left, box.top, box.right, box.bottom}),
                testing::Pointwise(testing::FloatNear(1e-4f), {left, top, right, bottom}));
  }
}

// The middle of the ink of a stamp at (40, 60): x 40 + 0.2 * 60 = 52 and y 60, over 0.01 * 40 + 0.005 * 60
// + 1.5.
TEST(RenderMessage, DrawsInPerspective) {
  DrawingBoard board({.version = 1, .size = 12.0f, .width = 64, .height = 64});
  const float view[9] = {1.0f, 0.0f, 0.01f, 0.2f, 1.0f, 0.005f, 0.0f, 0.0f, 1.5f};
  board.canvas.setMatrix(Qelt::Matrix3<float>(view));
  board.stroke({{40.0f, 60.0f, 1.0f}, {40.0f, 60.0f, 1.0f}});
  const auto pixels = board.pixels();
  float ink = 0.0f, x = 0.0f, y = 0.0f;
  for (std::size_t i = 0; i < pixels.size() / 4; ++i) {
    const float alpha = pixels[4 * i + 3];
    ink += alpha;
    x += alpha * (static_cast<float>(i % 64) + 0.5f);
    y += alpha * (static_cast<float>(i / 64) + 0.5f);
  }
  EXPECT_NEAR(x / ink, 52.0f / 2.2f, 0.5f);
  EXPECT_NEAR(y / ink, 60.0f / 2.2f, 0.5f);
}

}  // namespace
}  // namespace QeltTests
