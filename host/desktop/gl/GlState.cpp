#include "desktop/gl/GlState.h"

#include <algorithm>

#include "desktop/gl/GlCall.h"

namespace QeltDesktop {

namespace {

// Notes the value; false when it is known to hold already.
template <typename Value>
bool changes(std::optional<Value>& known, const Value& value) {
  if (known == value) return false;
  known = value;
  return true;
}

void drop(std::optional<GLuint>& known, GLuint name) {
  if (known == name) known.reset();
}

}  // namespace

void GlState::forget() {
  *this = {};
}

void GlState::bindFramebuffer(GLuint framebuffer) {
  if (changes(mFramebuffer, framebuffer)) gl(glBindFramebuffer)(GL_FRAMEBUFFER, framebuffer);
}

void GlState::setViewport(GLint x, GLint y, GLsizei width, GLsizei height) {
  if (changes(mViewport, {x, y, width, height})) gl(glViewport)(x, y, width, height);
}

Qelt::Vector4<int> GlState::viewport() {
  if (!mViewport) gl(glGetIntegerv)(GL_VIEWPORT, mViewport.emplace().data());
  const Four& values = *mViewport;
  return {values[0], values[1], values[2], values[3]};
}

void GlState::setScissor(GLint x, GLint y, GLsizei width, GLsizei height) {
  if (changes(mScissor, {x, y, width, height})) gl(glScissor)(x, y, width, height);
}

void GlState::setEnabled(GLenum capability, bool enabled) {
  const auto found = std::find(kCapabilities.begin(), kCapabilities.end(), capability);
  if (found != kCapabilities.end() &&
      !changes(mEnabled[static_cast<std::size_t>(found - kCapabilities.begin())], enabled)) {
    return;
  }
  if (enabled) {
    gl(glEnable)(capability);
  } else {
    gl(glDisable)(capability);
  }
}

void GlState::setBlendFactors(GLenum sourceColor, GLenum destinationColor, GLenum sourceAlpha,
                              GLenum destinationAlpha) {
  if (changes(mBlendFactors, {sourceColor, destinationColor, sourceAlpha, destinationAlpha})) {
    gl(glBlendFuncSeparate)(sourceColor, destinationColor, sourceAlpha, destinationAlpha);
  }
}

void GlState::openColorMask() {
  if (mColorMaskIsOpen) return;
  gl(glColorMask)(GL_TRUE, GL_TRUE, GL_TRUE, GL_TRUE);
  mColorMaskIsOpen = true;
}

void GlState::useProgram(GLuint program) {
  if (changes(mProgram, program)) gl(glUseProgram)(program);
}

GLuint GlState::program() {
  if (!mProgram) {
    GLint current = 0;
    gl(glGetIntegerv)(GL_CURRENT_PROGRAM, &current);
    mProgram = static_cast<GLuint>(current);
  }
  return *mProgram;
}

void GlState::bindTexture(int unit, GLuint texture) {
  if (mTextures[static_cast<std::size_t>(unit)] == texture) return;
  if (changes(mUnit, unit)) gl(glActiveTexture)(GL_TEXTURE0 + static_cast<GLenum>(unit));
  bindTexture(texture);
}

void GlState::bindTexture(GLuint texture) {
  // Which unit is active matters to no one here, so it is not asked for.
  if (!mUnit) {
    gl(glActiveTexture)(GL_TEXTURE0);
    mUnit = 0;
  }
  if (changes(mTextures[static_cast<std::size_t>(*mUnit)], texture))
    gl(glBindTexture)(GL_TEXTURE_2D, texture);
}

void GlState::bindVertexArray(GLuint array) {
  if (changes(mVertexArray, array)) gl(glBindVertexArray)(array);
}

void GlState::bindArrayBuffer(GLuint buffer) {
  if (changes(mArrayBuffer, buffer)) gl(glBindBuffer)(GL_ARRAY_BUFFER, buffer);
}

void GlState::forgetFramebuffer(GLuint framebuffer) {
  drop(mFramebuffer, framebuffer);
}

void GlState::forgetTexture(GLuint texture) {
  for (std::optional<GLuint>& bound : mTextures) drop(bound, texture);
}

void GlState::forgetVertexArray(GLuint array) {
  drop(mVertexArray, array);
}

void GlState::forgetArrayBuffer(GLuint buffer) {
  drop(mArrayBuffer, buffer);
}

}  // namespace QeltDesktop
