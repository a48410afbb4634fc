#pragma once

#include <GLES3/gl3.h>

#include <array>
#include <cstddef>
#include <optional>

#include "base/HostApi.h"
#include "base/Vector.h"

namespace QeltDesktop {

// What is known of a context's state, so that GL is told only what does not hold yet: a call costs more than
// a comparison, and in a browser much more. All of the host sets state through here. Whoever calls GL itself
// on the render thread does so in `RenderQueue::run`, after which nothing counts as known; or calls `forget`.
// Render thread, with the context current.
class QELT_HOST_API GlState {
 public:
  // From here on nothing is known: the context is new, or somebody else has used it.
  void forget();

  void bindFramebuffer(GLuint framebuffer);
  void setViewport(GLint x, GLint y, GLsizei width, GLsizei height);
  // x, y, width, height.
  Qelt::Vector4<int> viewport();
  void setScissor(GLint x, GLint y, GLsizei width, GLsizei height);
  void setEnabled(GLenum capability, bool enabled);
  void setBlendFactors(GLenum sourceColor, GLenum destinationColor, GLenum sourceAlpha,
                       GLenum destinationAlpha);
  // Every channel can be drawn into.
  void openColorMask();
  void useProgram(GLuint program);
  // 0 when none is current.
  GLuint program();
  // A GL_TEXTURE_2D, on a unit or on whichever is active.
  void bindTexture(int unit, GLuint texture);
  void bindTexture(GLuint texture);
  void bindVertexArray(GLuint array);
  void bindArrayBuffer(GLuint buffer);

  // The object is about to be deleted: its name may come back as another's.
  void forgetFramebuffer(GLuint framebuffer);
  void forgetTexture(GLuint texture);
  void forgetVertexArray(GLuint array);
  void forgetArrayBuffer(GLuint buffer);

 private:
  static constexpr std::size_t kUnits = 16;  // what every OpenGL ES 3.0 offers a fragment shader
  // The capabilities that host and pens switch.
  static constexpr std::array<GLenum, 5> kCapabilities{GL_BLEND, GL_SCISSOR_TEST, GL_CULL_FACE, GL_DEPTH_TEST,
                                                       GL_STENCIL_TEST};
  using Four = std::array<GLint, 4>;

  std::optional<GLuint> mFramebuffer;
  std::optional<Four> mViewport, mScissor;
  std::array<std::optional<bool>, kCapabilities.size()> mEnabled;
  std::optional<std::array<GLenum, 4>> mBlendFactors;
  bool mColorMaskIsOpen = false;
  std::optional<GLuint> mProgram;
  std::optional<int> mUnit;  // the active one
  std::array<std::optional<GLuint>, kUnits> mTextures;
  std::optional<GLuint> mVertexArray;
  std::optional<GLuint> mArrayBuffer;
};

}  // namespace QeltDesktop
