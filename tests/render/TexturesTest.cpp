#include "render/PatternTextures.h"

#include <GLES3/gl3.h>
#include <gmock/gmock.h>

#include <cstddef>
#include <cstdint>
#include <functional>
#include <vector>

#include "desktop/gl/RenderQueue.h"
#include "render/Patterns.h"
#include "support/Allocations.h"

namespace QeltTests {
namespace {

using namespace Qelt;
using QeltDesktop::RenderQueue;
using Source = PatternTextures::PointSource;

// Texture names alive in the current context.
int textureCount() {
  int count = 0;
  for (GLuint name = 1; name < 200; ++name) count += glIsTexture(name) == GL_TRUE ? 1 : 0;
  return count;
}

// A texture as it was bound to a unit.
class BoundTexture {
 public:
  BoundTexture(const std::function<void(int)>& bind, int unit) {
    bind(unit);
    glActiveTexture(GL_TEXTURE0 + static_cast<GLenum>(unit));
    GLint name = 0;
    glGetIntegerv(GL_TEXTURE_BINDING_2D, &name);
    mName = static_cast<GLuint>(name);
  }

  int parameter(GLenum which) const {
    GLint value = 0;
    glGetTexParameteriv(GL_TEXTURE_2D, which, &value);
    return value;
  }

  // RGBA, first row first.
  std::vector<std::uint8_t> pixels(int width, int height) const {
    std::vector<std::uint8_t> read(static_cast<std::size_t>(width * height * 4));
    GLuint frame = 0;
    glGenFramebuffers(1, &frame);
    glBindFramebuffer(GL_FRAMEBUFFER, frame);
    glFramebufferTexture2D(GL_FRAMEBUFFER, GL_COLOR_ATTACHMENT0, GL_TEXTURE_2D, mName, 0);
    EXPECT_EQ(glCheckFramebufferStatus(GL_FRAMEBUFFER), static_cast<GLenum>(GL_FRAMEBUFFER_COMPLETE));
    glReadPixels(0, 0, width, height, GL_RGBA, GL_UNSIGNED_BYTE, read.data());
    glBindFramebuffer(GL_FRAMEBUFFER, 0);
    glDeleteFramebuffers(1, &frame);
    return read;
  }

 private:
  GLuint mName = 0;
};

BoundTexture grainOf(const PatternTextures& textures) {
  return BoundTexture([&textures](int unit) { textures.bindGrain(unit); }, 0);
}

BoundTexture shapesOf(const PatternTextures& textures) {
  return BoundTexture([&textures](int unit) { textures.bindPoints(unit); }, 1);
}

// A pattern byte in red, nothing else.
bool holdsPattern(const std::vector<std::uint8_t>& pixels,
                  const std::function<std::uint8_t(std::size_t)>& byte) {
  for (std::size_t i = 0; i * 4 < pixels.size(); ++i) {
    if (pixels[i * 4] != byte(i) || pixels[i * 4 + 1] != 0 || pixels[i * 4 + 2] != 0 ||
        pixels[i * 4 + 3] != 0)
      return false;
  }
  return true;
}

bool holdsGrain(const PatternTextures& textures) {
  return holdsPattern(grainOf(textures).pixels(150, 150), [](std::size_t i) { return g_backgroundPtn[i]; });
}

bool holdsShapes(const PatternTextures& textures) {
  return holdsPattern(shapesOf(textures).pixels(100, 300), [](std::size_t i) { return g_pointPtn[i]; });
}

class Textures : public testing::Test {
 protected:
  void onRenderThread(const std::function<void()>& call) { queue.run(call); }

  RenderQueue queue{RenderQueue::Mode::Caller, RenderQueue::GL::Context};
};

TEST_F(Textures, HoldThePatternsInRedWithoutSmoothing) {
  onRenderThread([this] {
    PatternTextures textures;
    textures.build(&queue, 150, 150, "Test");
    EXPECT_FALSE(textures.ready());
    // Of an empty grain they still hold the shapes.
    textures.upload(0, 150, Source::StampShapes);
    EXPECT_TRUE(textures.ready());
    EXPECT_FALSE(holdsGrain(textures));
    EXPECT_TRUE(holdsShapes(textures));
    textures.upload(150, 150, Source::StampShapes);
    EXPECT_TRUE(holdsGrain(textures));
    EXPECT_TRUE(holdsShapes(textures));

    const BoundTexture grain = grainOf(textures);
    EXPECT_EQ(grain.parameter(GL_TEXTURE_MIN_FILTER), GL_NEAREST);
    EXPECT_EQ(grain.parameter(GL_TEXTURE_MAG_FILTER), GL_NEAREST);
    EXPECT_EQ(grain.parameter(GL_TEXTURE_WRAP_S), GL_REPEAT);
    EXPECT_EQ(grain.parameter(GL_TEXTURE_WRAP_T), GL_REPEAT);
    const BoundTexture shapes = shapesOf(textures);
    EXPECT_EQ(shapes.parameter(GL_TEXTURE_MIN_FILTER), GL_NEAREST);
    EXPECT_EQ(shapes.parameter(GL_TEXTURE_MAG_FILTER), GL_NEAREST);

    // The prediction's stamps: the first 10,000 bytes of grain, in rows of 100, three times.
    textures.upload(150, 150, Source::PaperGrain);
    EXPECT_TRUE(holdsPattern(shapesOf(textures).pixels(100, 300),
                             [](std::size_t i) { return g_backgroundPtn[i % 10000]; }));
    textures.release();
  });
}

TEST_F(Textures, AreMadeOnceAndGoneAfterTheRelease) {
  onRenderThread([this] {
    const int before = textureCount();
    PatternTextures textures;
    for (int i = 0; i < 2; ++i) {
      textures.build(&queue, 150, 150, "Test");
      EXPECT_EQ(textureCount(), before + 2);
    }
    textures.upload(150, 150, Source::StampShapes);
    // Kept: what is released stays released, whoever asks again.
    for (int i = 0; i < 2; ++i) {
      textures.release();
      EXPECT_FALSE(textures.ready());
      EXPECT_EQ(textureCount(), before);
      textures.build(&queue, 150, 150, "Test");
      textures.upload(150, 150, Source::StampShapes);
      EXPECT_FALSE(textures.ready());
      EXPECT_EQ(textureCount(), before);
    }
  });
}

TEST_F(Textures, ComeBackWithTheirPixelsAfterALoss) {
  PatternTextures textures;
  onRenderThread([&] {
    textures.build(&queue, 150, 150, "Test");
    textures.upload(150, 150, Source::StampShapes);
  });
  queue.loseContext();
  queue.restoreContext();
  onRenderThread([&] {
    EXPECT_FALSE(holdsGrain(textures));
    textures.upload(150, 150, Source::StampShapes);
    EXPECT_TRUE(holdsGrain(textures));
    EXPECT_TRUE(holdsShapes(textures));
    EXPECT_EQ(grainOf(textures).parameter(GL_TEXTURE_WRAP_S), GL_REPEAT);
    textures.release();
  });
}

TEST_F(Textures, AreLeftAsTheyWereWhenMemoryRunsOut) {
  if (!countsAllocations()) GTEST_SKIP() << "allocations are the sanitizer's";
  onRenderThread([this] {
    PatternTextures textures;
    textures.build(&queue, 150, 150, "Test");
    {
      const FailingAllocation grain(0);
      textures.upload(150, 150, Source::StampShapes);
    }
    EXPECT_FALSE(textures.ready());
    EXPECT_FALSE(holdsGrain(textures));
    {
      const FailingAllocation shapes(1);
      textures.upload(150, 150, Source::StampShapes);
    }
    EXPECT_FALSE(textures.ready());
    EXPECT_TRUE(holdsGrain(textures));
    EXPECT_FALSE(holdsShapes(textures));
    textures.upload(150, 150, Source::StampShapes);
    EXPECT_TRUE(textures.ready());
    textures.release();
  });
}

}  // namespace
}  // namespace QeltTests
