#include "gl/OpenGLRenderer.h"

#include "desktop/gl/GlCall.h"
#include "desktop/gl/GlDevice.h"

namespace Qelt {

using QeltDesktop::gl;

namespace {

// Null without a context.
QeltDesktop::GlState* liveState() {
  QeltDesktop::GlDevice* const device = QeltDesktop::GlDevice::live();
  return device != nullptr ? &device->state() : nullptr;
}

}  // namespace

void OpenGLRenderer::enableState(unsigned int capability) {
  if (QeltDesktop::GlState* const state = liveState()) state->setEnabled(capability, true);
}

void OpenGLRenderer::disableState(unsigned int capability) {
  if (QeltDesktop::GlState* const state = liveState()) state->setEnabled(capability, false);
}

void OpenGLRenderer::setBlendFuncFactors(unsigned int sourceColor, unsigned int destinationColor,
                                         unsigned int sourceAlpha, unsigned int destinationAlpha) {
  QeltDesktop::GlState* const state = liveState();
  if (state != nullptr) state->setBlendFactors(sourceColor, destinationColor, sourceAlpha, destinationAlpha);
}

Vector4<int> OpenGLRenderer::getViewport() {
  QeltDesktop::GlState* const state = liveState();
  return state != nullptr ? state->viewport() : Vector4<int>{};
}

void OpenGLRenderer::discardFramebuffer(int attachments) {
  constexpr int kDepthBit = 2;
  constexpr int kStencilBit = 4;
  GLenum names[2];
  GLsizei count = 0;
  if ((attachments & kDepthBit) != 0) names[count++] = GL_DEPTH_ATTACHMENT;
  if ((attachments & kStencilBit) != 0) names[count++] = GL_STENCIL_ATTACHMENT;
  if (count > 0 && liveState() != nullptr) gl(glInvalidateFramebuffer)(GL_FRAMEBUFFER, count, names);
}

}  // namespace Qelt
