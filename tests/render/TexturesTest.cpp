#include <GLES3/gl3.h>
#include <gtest/gtest.h>

#include "desktop/gl/RenderQueue.h"
#include "render/PatternTextures.h"

namespace QeltTests {
namespace {

using Qelt::PatternTextures;
using QeltDesktop::RenderQueue;

// Texture names alive in the current context.
int textureCount() {
  int count = 0;
  for (GLuint name = 1; name < 200; ++name) count += glIsTexture(name) == GL_TRUE ? 1 : 0;
  return count;
}

// What the textures hold and how they are looked up is seen in pictures of single stamps.
TEST(Textures, AreMadeOnceAndGoneAfterTheRelease) {
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  queue.run([&queue] {
    const int before = textureCount();
    PatternTextures textures;
    for (int i = 0; i < 2; ++i) {
      textures.build(&queue, 150, 150, "Test");
      EXPECT_EQ(textureCount(), before + 2);
    }
    EXPECT_FALSE(textures.ready());
    textures.upload(0, 150, PatternTextures::PointSource::StampShapes);  // of an empty grain
    EXPECT_TRUE(textures.ready());
    // Kept: what is released stays released, whoever asks again.
    for (int i = 0; i < 2; ++i) {
      textures.release();
      EXPECT_FALSE(textures.ready());
      EXPECT_EQ(textureCount(), before);
      textures.build(&queue, 150, 150, "Test");
      textures.upload(150, 150, PatternTextures::PointSource::StampShapes);
      EXPECT_FALSE(textures.ready());
      EXPECT_EQ(textureCount(), before);
    }
  });
}

}  // namespace
}  // namespace QeltTests
