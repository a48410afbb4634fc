#include <GLES3/gl3.h>
#include <gtest/gtest.h>

#include "desktop/gl/RenderQueue.h"
#include "desktop/pencommon/PenDataManager.h"
#include "render/RenderDrawables.h"

namespace QeltTests {
namespace {

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
  QeltDesktop::PenDataManager data(&queue);
  queue.run([&data] {
    const int before = textureCount();
    Qelt::Pencil2StrokeDrawableRTV1 drawable(&data);
    for (int i = 0; i < 2; ++i) {
      drawable.Init();
      EXPECT_EQ(textureCount(), before + 2);
    }
    // Kept: what is released stays released, whoever asks again.
    for (int i = 0; i < 2; ++i) {
      drawable.Release();
      drawable.Init();
      drawable.RestoreGLObject();
      EXPECT_EQ(textureCount(), before);
    }
  });
}

}  // namespace
}  // namespace QeltTests
