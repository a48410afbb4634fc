#include "gl/OpenGLRenderer.h"

#include "desktop/gl/GlCall.h"
#include "desktop/gl/GlDevice.h"

namespace Qelt {

using QeltDesktop::gl;

namespace {

bool hasContext() {
  return QeltDesktop::GlDevice::live() != nullptr;
}

}  // namespace

void OpenGLRenderer::enableState(unsigned int capability) {
  if (hasContext()) gl(glEnable)(capability);
}

void OpenGLRenderer::disableState(unsigned int capability) {
  if (hasContext()) gl(glDisable)(capability);
}

void OpenGLRenderer::setBlendFuncFactors(unsigned int sourceColor, unsigned int destinationColor,
                                         unsigned int sourceAlpha, unsigned int destinationAlpha) {
  if (hasContext()) gl(glBlendFuncSeparate)(sourceColor, destinationColor, sourceAlpha, destinationAlpha);
}

Vector4<int> OpenGLRenderer::getViewport() {
  GLint values[4] = {};
  if (hasContext()) gl(glGetIntegerv)(GL_VIEWPORT, values);
  return {values[0], values[1], values[2], values[3]};
}

void OpenGLRenderer::discardFramebuffer(int attachments) {
  constexpr int kDepthBit = 2;
  constexpr int kStencilBit = 4;
  GLenum names[2];
  GLsizei count = 0;
  if ((attachments & kDepthBit) != 0) names[count++] = GL_DEPTH_ATTACHMENT;
  if ((attachments & kStencilBit) != 0) names[count++] = GL_STENCIL_ATTACHMENT;
  if (count > 0 && hasContext()) gl(glInvalidateFramebuffer)(GL_FRAMEBUFFER, count, names);
}

}  // namespace Qelt
