#include <GLES3/gl3.h>
#include <gmock/gmock.h>

#include <array>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <memory>
#include <optional>
#include <stdexcept>
#include <utility>
#include <vector>

#include "desktop/gl/GlVertexObject.h"
#include "desktop/gl/GpuFence.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/LayerBackup.h"
#include "gl/GraphicsFactory.h"
#include "gl/GraphicsObject.h"
#include "gl/ManagedObject.h"
#include "gl/OpenGLRenderer.h"
#include "gl/OpenGLShaderProgram.h"
#include "gl/VertexDescriptor.h"
#include "graphics/ISPBitmap.h"
#include "graphics/ISPCanvas.h"
#include "graphics/SPGraphicsFactory.h"
#include "math/Matrix4.h"
#include "support/LogCapture.h"

namespace {

using QeltDesktop::CanvasLayer;
using QeltDesktop::GlVertexObject;
using QeltDesktop::RenderQueue;
using testing::HasSubstr;
using Pixels = std::vector<std::uint8_t>;

constexpr const char* kVertexShader = R"(#version 300 es
layout(location = 0) in vec2 position;
layout(location = 1) in vec2 extra;
uniform mat4 projection;
out vec2 passed;
void main() {
  gl_Position = projection * vec4(position, 0.0, 1.0);
  passed = extra;
}
)";

// Writes where the pixel lies in the window, so that each byte can be foretold.
constexpr const char* kWindowShader = R"(#version 300 es
precision highp float;
in vec2 passed;
out vec4 FragColor;
void main() {
  vec2 at = floor(gl_FragCoord.xy);
  FragColor = vec4(mod(at.x, 256.0) / 255.0, mod(at.y, 256.0) / 255.0, passed.x, 1.0);
}
)";

constexpr const char* kTextureShader = R"(#version 300 es
precision highp float;
in vec2 passed;
uniform sampler2D picture;
out vec4 FragColor;
void main() {
  FragColor = texture(picture, passed);
}
)";

// Draws a quad into a layer with one of the shaders above, kept over context losses as a pen keeps its own.
class Painter {
 public:
  explicit Painter(const char* fragmentShader, int sliceVertices = GlVertexObject::kSliceVertices) {
    program = Qelt::GraphicsFactory::createOpenGLShaderProgram(kVertexShader, fragmentShader, nullptr);
    projection = program->getBindingIntf("projection", 0);
    picture = program->getBindingIntf("picture", Qelt::kBindingInt);
    Qelt::VertexDescriptor layout;
    layout.addAttribute(Qelt::AttributeType::Float, 2, -1);
    layout.addAttribute(Qelt::AttributeType::Float, 2, -1);
    quad = new GlVertexObject(1, GL_TRIANGLES, layout, sliceVertices);
  }
  ~Painter() {
    // Uniforms may outlive their program.
    program->release();
    projection->release();
    if (picture != nullptr) picture->release();
    quad->release();
  }
  Painter(const Painter&) = delete;
  Painter& operator=(const Painter&) = delete;

  // With the texture coordinates 0 to 1.
  void setQuad(float left, float top, float right, float bottom) {
    const std::vector<float> vertices{left,  top, 0, 0, left, bottom, 0, 1, right, top,    1, 0,
                                      right, top, 1, 0, left, bottom, 0, 1, right, bottom, 1, 1};
    quad->updateBuffer(0, vertices.data(), 6);
  }

  void draw(Qelt::ISPBitmap& target, int first = 0, int count = -1) {
    Qelt::OpenGLRenderer::disableState(GL_BLEND);
    for (int i = 0; i < target.GetTileCount(); ++i) {
      Qelt::ISPSubBitmap& tile = *target.GetSubBitmap(i);
      tile.BeginRender(0);
      program->activate();
      projection->set(tile.GetProjection());
      if (picture != nullptr) picture->set(1);
      quad->draw(first, count, true, 0);
      Qelt::OpenGLRenderer::discardFramebuffer(6);
      tile.EndRender(0);
    }
  }

  Qelt::OpenGLShaderProgram* program;
  Qelt::IParameterBinding *projection, *picture;
  Qelt::GraphicsObject* quad;
};

const std::uint8_t* pixelAt(const Pixels& pixels, int width, int x, int y) {
  return pixels.data() + (y * width + x) * 4;
}

class Layer : public testing::TestWithParam<RenderQueue::Mode> {
 protected:
  // GL errors and the like are failures wherever they come from.
  void TearDown() override {
    for (const QeltTests::LogLine& line : log.take()) ADD_FAILURE() << "logged: " << line.text;
  }

  void expectOneLine(const char* text) {
    const auto lines = log.take();
    ASSERT_EQ(lines.size(), 1u);
    EXPECT_EQ(lines[0].priority, 6);
    EXPECT_THAT(lines[0].text, HasSubstr(text));
  }

  QeltTests::LogCapture log;
  RenderQueue queue{GetParam(), RenderQueue::GL::Context};
};

INSTANTIATE_TEST_SUITE_P(Modes, Layer, testing::Values(RenderQueue::Mode::Thread, RenderQueue::Mode::Caller));

TEST_P(Layer, ComesBackEmptyAfterEachOfTwoLossesAndOutlivesTheRenderThread) {
  CanvasLayer layer(queue, 10, 10);
  std::unique_ptr<Painter> painter;
  const auto paint = [&](bool uploads) {
    queue.run([&] {
      if (painter == nullptr) painter = std::make_unique<Painter>(kWindowShader);
      if (uploads) painter->setQuad(0, 0, 5, 10);
      painter->draw(*layer.GetBitmap());
    });
  };
  for (int round = 0; round < 2; ++round) {
    paint(true);
    queue.loseContext();
    queue.loseContext();
    EXPECT_THROW(layer.readPixels(), std::runtime_error);
    paint(false);  // without effect and harm
    EXPECT_EQ(layer.timesEmptied(), round);
    queue.restoreContext();
    queue.restoreContext();
    EXPECT_EQ(layer.timesEmptied(), round + 1);
    paint(false);  // no vertices are left
    EXPECT_EQ(layer.readPixels(), Pixels(10 * 10 * 4));
  }
  queue.shutDown();
  EXPECT_THROW(layer.readPixels(), std::runtime_error);
}

TEST_P(Layer, SaysClearlyWhatCannotBeDrawn) {
  for (const int tile : {CanvasLayer::kTileSize, CanvasLayer::kOneTile})
    EXPECT_THAT([&] { CanvasLayer(queue, 1 << 20, 10, tile); },
                testing::ThrowsMessage<std::runtime_error>(HasSubstr("1048576 x 10")));
  CanvasLayer tiled(queue, 1030, 600);
  EXPECT_EQ(tiled.GetBitmap()->GetTileCount(), 6) << "tiles are of 512 pixels";
  EXPECT_EQ(tiled.GetBitmap()->GetSubBitmap(6), nullptr);
  EXPECT_EQ(tiled.GetBitmap()->GetSubBitmap(-1), nullptr);
  EXPECT_EQ(CanvasLayer(queue, 1030, 600, CanvasLayer::kOneTile).GetBitmap()->GetTileCount(), 1);
  EXPECT_THROW(tiled.setTileSize(0), std::runtime_error);
  EXPECT_EQ(tiled.GetBitmap()->GetTileCount(), 6);
  tiled.setTileSize(CanvasLayer::kOneTile);
  EXPECT_EQ(tiled.GetBitmap()->GetTileCount(), 1);
  EXPECT_THROW(CanvasLayer(queue, 0, 10), std::runtime_error);
  EXPECT_THROW(CanvasLayer(queue, 10, 10, 0), std::runtime_error);
  RenderQueue blind(GetParam(), RenderQueue::GL::None);
  EXPECT_THROW(CanvasLayer(blind, 10, 10), std::runtime_error);
}

// A bitmap's owner, filling it again when told to, as pens do.
class PatternOwner final : public Qelt::ManagedObject {
 public:
  PatternOwner() {
    bitmap = Qelt::SPGraphicsFactory::CreateBitmap(nullptr, 4, 4, nullptr, false, 0);
    OnRestore();
    Register(this);
    Register(this);
  }
  ~PatternOwner() override {
    Unregister(this);
    Qelt::SPGraphicsFactory::ReleaseBitmap(bitmap);
    Qelt::SPGraphicsFactory::ReleaseBitmap(bitmap);  // a second time does nothing
    Qelt::SPGraphicsFactory::ReleaseBitmap(nullptr);
  }
  // Told afterwards: there is no context any more.
  void OnRelease() override {
    ++released;
    EXPECT_EQ(Qelt::OpenGLRenderer::getViewport().z, 0);
  }
  // Wider than the bitmap: what does not fit is left out, and rows keep their stride.
  void OnRestore() override {
    ++filled;
    std::uint8_t pixels[2][6][4] = {};
    for (int i = 0; i < 12; ++i) pixels[i / 6][i % 6][0] = static_cast<std::uint8_t>(i + 1);
    bitmap->SetPixels(pixels, 6, 2);
    bitmap->SetPixels(nullptr, 4, 4);
    bitmap->SetPixels(pixels, 0, 4);
  }

  Qelt::ISPBitmap* bitmap;
  int released = 0;
  int filled = 0;
};

// Draws a bitmap over the whole layer, pixel for pixel.
Pixels pictureOf(RenderQueue& queue, CanvasLayer& layer, Qelt::ISPBitmap& bitmap) {
  queue.run([&] {
    Painter painter(kTextureShader);
    painter.setQuad(0, 0, static_cast<float>(layer.width()), static_cast<float>(layer.height()));
    bitmap.GetTexture()->SetFilter(Qelt::ISPTexture::kMinFilter, GL_NEAREST);
    bitmap.GetTexture()->SetFilter(Qelt::ISPTexture::kMagFilter, GL_NEAREST);
    bitmap.GetTexture()->Bind(1);
    painter.draw(*layer.GetBitmap());
  });
  return layer.readPixels();
}

TEST_P(Layer, BitmapsAreFilledFromTheTopLeftByTheirOwnersInTheNextContextToo) {
  CanvasLayer layer(queue, 4, 4);
  std::optional<PatternOwner> owner;
  queue.run([&] {
    owner.emplace();
    EXPECT_EQ(owner->bitmap->GetTileCount(), 0);
    for (const int side : {0, 1 << 20})
      EXPECT_EQ(Qelt::SPGraphicsFactory::CreateBitmap(nullptr, side, 4, nullptr, false, 0), nullptr);
  });
  const Pixels filled = pictureOf(queue, layer, *owner->bitmap);
  // First row, first column of the upload is texture coordinate 0, and the page's top left.
  std::vector<int> reds;
  for (std::size_t i = 0; i < 16; ++i) reds.push_back(filled[4 * i]);
  EXPECT_THAT(reds, testing::ElementsAre(1, 2, 3, 4, 7, 8, 9, 10, 0, 0, 0, 0, 0, 0, 0, 0));
  queue.loseContext();
  queue.restoreContext();
  EXPECT_EQ(owner->released, 1);
  EXPECT_EQ(owner->filled, 2);
  EXPECT_EQ(pictureOf(queue, layer, *owner->bitmap), filled);
  queue.run([&] { owner.reset(); });
}

// Half a pixel at the rim is half covered; the colour is premultiplied.
TEST_P(Layer, TheHostShapeFillsItsSquareInTheNextContextToo) {
  CanvasLayer layer(queue, 20, 30);
  Qelt::ISPBitmap* bitmap = nullptr;
  Qelt::ISPCanvas* canvas = nullptr;
  queue.run([&] {
    bitmap = Qelt::SPGraphicsFactory::CreateBitmap(nullptr, 20, 30, nullptr, false, 0);
    canvas = Qelt::SPGraphicsFactory::CreateCanvas(nullptr, bitmap, 0);
  });
  queue.loseContext();
  queue.restoreContext();
  Qelt::SPPaint paint;
  paint.SetAntiAlias(true);
  paint.SetColor(0xFFFF0000u);
  queue.run([&] {
    canvas->Clear(0);
    canvas->DrawShape(10.5f, 20.0f, 2.0f, paint);
    canvas->DrawShape(std::nanf(""), 0.0f, 200.0f, paint);
    canvas->DrawShape(0.0f, 0.0f, INFINITY, paint);
    canvas->DrawShape(0.0f, 0.0f, -5.0f, paint);
    canvas->DrawShape(1e30f, 0.0f, 5.0f, paint);
  });
  const Pixels square = pictureOf(queue, layer, *bitmap);
  for (const auto& [x, y, red, alpha] : {std::array{10, 20, 128, 128},
                                         {11, 21, 255, 255},
                                         {12, 21, 128, 128},
                                         {9, 20, 0, 0},
                                         {11, 22, 0, 0}}) {
    EXPECT_NEAR(pixelAt(square, 20, x, y)[0], red, 1) << x << ", " << y;
    EXPECT_NEAR(pixelAt(square, 20, x, y)[3], alpha, 1) << x << ", " << y;
  }
  queue.run([&] {
    Qelt::SPGraphicsFactory::ReleaseCanvas(canvas);
    Qelt::SPGraphicsFactory::ReleaseBitmap(bitmap);
    EXPECT_EQ(Qelt::SPGraphicsFactory::CreateCanvas(nullptr, nullptr, 0), nullptr);
    EXPECT_EQ(Qelt::SPGraphicsFactory::CreateCanvas(nullptr, layer.GetBitmap(), 0), nullptr);
    Qelt::SPGraphicsFactory::ReleaseCanvas(nullptr);
  });
}

TEST_P(Layer, AreasAreCopiedClearedAndExchanged) {
  CanvasLayer painted(queue, 40, 30, 16), other(queue, 32, 32);
  queue.run([&] {
    Painter painter(kWindowShader);
    painter.setQuad(0, 0, 40, 30);
    painter.draw(*painted.GetBitmap());
  });
  const Pixels before = painted.readPixels();
  Pixels rows(40 * 4 * 7);
  painted.readRows(11, rows);
  EXPECT_EQ(rows, Pixels(before.begin() + 40 * 4 * 11, before.begin() + 40 * 4 * 18));
  for (const auto& [top, size] : {std::pair(24, 40 * 4 * 7), {-1, 40 * 4}, {31, 0}, {0, 40 * 4 + 4}}) {
    rows.resize(static_cast<std::size_t>(size));
    EXPECT_THROW(painted.readRows(top, rows), std::invalid_argument) << top << ", " << size;
  }
  // Where the window shader painted, red is the column. Areas end at the layers' edges.
  other.copyFrom(painted, {-5, 10, 100, 100});
  EXPECT_EQ(pixelAt(other.readPixels(), 32, 31, 29)[0], 31);
  EXPECT_EQ(pixelAt(other.readPixels(), 32, 31, 9)[3], 0);
  EXPECT_EQ(pixelAt(other.readPixels(), 32, 0, 30)[3], 0);
  other.copyFrom(painted, {50, 0, 60, 5});

  QeltDesktop::LayerBackup backup(queue, painted, {7, 3, 20, 25});
  EXPECT_EQ(backup.bytes(), 4u * 13 * 22);
  painted.clear({0, 0, 18, 1000});
  const Pixels after = painted.readPixels();
  EXPECT_EQ(pixelAt(after, 40, 17, 29)[3], 0);
  EXPECT_EQ(pixelAt(after, 40, 18, 0)[0], 18);
  backup.swapWith(painted);
  EXPECT_EQ(pixelAt(painted.readPixels(), 40, 7, 3)[0], 7);
  EXPECT_EQ(pixelAt(painted.readPixels(), 40, 6, 3)[3], 0);
  backup.swapWith(painted);
  EXPECT_EQ(painted.readPixels(), after);
  painted.clear({9, 9, 9, 20});
  EXPECT_EQ(painted.readPixels(), after) << "an area without pixels";
  EXPECT_NE(after, before);

  std::unique_ptr<QeltDesktop::GpuFence> fence;
  queue.run([&] {
    fence = std::make_unique<QeltDesktop::GpuFence>();
    EXPECT_TRUE(fence->hasPassed()) << "nothing to wait for";
    fence->set();
  });
  painted.readPixels();  // which waits for the GPU
  queue.run([&] { EXPECT_TRUE(fence->hasPassed()); });
  queue.run([&] { fence->set(); });
  queue.loseContext();
  queue.run([&] { EXPECT_TRUE(fence->hasPassed()) << "it went with the context"; });
  queue.restoreContext();
  backup.swapWith(painted);
  EXPECT_EQ(pixelAt(painted.readPixels(), 40, 7, 3)[3], 0) << "and so did the pixels";
  queue.run([&] { fence.reset(); });
}

TEST_P(Layer, ShadersThatAreBrokenOrMisusedAreLoggedAndAnswerNull) {
  queue.run([&] {
    EXPECT_EQ(Qelt::GraphicsFactory::createOpenGLShaderProgram("nonsense", kWindowShader, nullptr), nullptr);
    EXPECT_EQ(Qelt::GraphicsFactory::createOpenGLShaderProgram(kVertexShader, nullptr, nullptr), nullptr);
    EXPECT_EQ(Qelt::GraphicsFactory::createGraphicsObject(0, 4, Qelt::VertexDescriptor(), 0, 0), nullptr);
    Painter painter(kTextureShader);
    EXPECT_EQ(painter.program->getBindingIntf("nowhere", 0), nullptr);
    EXPECT_EQ(painter.program->getBindingIntf("picture", Qelt::kBindingFloat), nullptr);
    EXPECT_EQ(painter.program->getBindingIntf(nullptr, 0), nullptr);
    painter.projection->set(3.0f);  // of another type: dropped, no GL error
  });
  expectOneLine("vertex shader does not compile");
}

// Overlapping triangles, each pair of a blue of its own: what is drawn last shows.
TEST_P(Layer, ALargeBatchLooksTheSameInSlicesAndGoesWithItsTask) {
  std::vector<float> vertices;
  for (int i = 0; i < 40; ++i) {
    const auto left = static_cast<float>(i % 8 * 3), top = static_cast<float>(i / 8 * 4);
    const float blue = static_cast<float>(i) / 40.0f;
    for (const auto& [x, y] : {std::pair{0, 0}, {0, 10}, {10, 0}, {10, 0}, {0, 10}, {10, 10}}) {
      vertices.insert(vertices.end(),
                      {left + static_cast<float>(x), top + static_cast<float>(y), blue, 0.0f});
    }
  }
  constexpr int kStamp = 6, kWhole = 40 * kStamp;
  CanvasLayer layer(queue, 32, 32, 20);
  const auto picture = [&](int sliceVertices, int first, int count, bool inLaterTask) {
    layer.clear();
    std::unique_ptr<Painter> painter;
    queue.run([&] {
      painter = std::make_unique<Painter>(kWindowShader, sliceVertices);
      painter->quad->updateBuffer(0, vertices.data(), kWhole);
      if (!inLaterTask) painter->draw(*layer.GetBitmap(), first, count);
    });
    queue.run([&] {
      if (inLaterTask) painter->draw(*layer.GetBitmap(), first, count);
      painter.reset();
    });
    return layer.readPixels();
  };
  EXPECT_EQ(picture(kWhole, 0, -1, true), picture(kWhole, 0, -1, false));
  EXPECT_EQ(picture(kStamp, 0, -1, true), Pixels(32 * 32 * 4));
  for (const auto& [first, count] : {std::pair{0, -1}, {0, 51}, {7 * kStamp, -1}, {5 * kStamp, 100}}) {
    const Pixels expected = picture(kWhole, first, count, false);
    for (const int slice : {kStamp, 7 * kStamp, 39 * kStamp})
      EXPECT_EQ(picture(slice, first, count, false), expected) << slice << ": " << first << ", " << count;
  }
}

TEST_P(Layer, ABatchThatThereIsNoMemoryForIsLoggedOnceAndNotDrawn) {
  CanvasLayer layer(queue, 8, 8);
  queue.run([&] {
    constexpr int kMost = std::numeric_limits<int>::max();
    Painter painter(kWindowShader, kMost);
    painter.setQuad(0, 0, 8, 8);
    const float none = 0.0f;
    painter.quad->updateBuffer(0, &none, kMost);  // 32 GiB, and no driver looks at what it has no room for
    painter.draw(*layer.GetBitmap());
  });
  expectOneLine("no memory to draw a batch of 2147483647 vertices");
  EXPECT_EQ(layer.readPixels(), Pixels(8 * 8 * 4));
}

}  // namespace
