#include "desktop/graphics/GlCanvas.h"

#include <GLES3/gl3.h>

#include <algorithm>
#include <array>
#include <cmath>

#include "base/Vector.h"
#include "desktop/graphics/GlBitmap.h"
#include "gl/GraphicsFactory.h"
#include "gl/GraphicsObject.h"
#include "gl/OpenGLRenderer.h"
#include "gl/OpenGLShaderProgram.h"
#include "gl/VertexDescriptor.h"

namespace Qelt {

ISPCanvas::~ISPCanvas() = default;

}  // namespace Qelt

namespace QeltDesktop {

namespace {

constexpr const char* kVertexShader = R"(#version 300 es
layout(location = 0) in vec2 corner;
void main() {
  gl_Position = vec4(corner, 0.0, 1.0);
}
)";

// The share of each pixel that a rectangle covers.
constexpr const char* kFragmentShader = R"(#version 300 es
precision highp float;
uniform vec4 edges;
uniform vec4 color;
uniform float antiAlias;
out vec4 FragColor;
void main() {
  vec2 low = max(edges.xy, gl_FragCoord.xy - 0.5);
  vec2 high = min(edges.zw, gl_FragCoord.xy + 0.5);
  vec2 share = max(high - low, vec2(0.0));
  float coverage = share.x * share.y;
  if (antiAlias == 0.0) coverage = step(0.5, share.x) * step(0.5, share.y);
  FragColor = color * coverage;
}
)";

float channel(unsigned int argb, int shift) {
  return static_cast<float>((argb >> shift) & 0xFFu) / 255.0f;
}

Qelt::Vector4<float> premultiplied(unsigned int argb) {
  const float alpha = channel(argb, 24);
  return {channel(argb, 16) * alpha, channel(argb, 8) * alpha, channel(argb, 0) * alpha, alpha};
}

}  // namespace

GlCanvas::GlCanvas(GlBitmap& bitmap) : mBitmap(bitmap) {
  mBitmap.keepPixels();
  mProgram.reset(Qelt::GraphicsFactory::createOpenGLShaderProgram(kVertexShader, kFragmentShader, nullptr));
  if (mProgram != nullptr) {
    mEdges.reset(mProgram->getBindingIntf("edges", Qelt::kBindingVector4));
    mColor.reset(mProgram->getBindingIntf("color", Qelt::kBindingVector4));
    mAntiAlias.reset(mProgram->getBindingIntf("antiAlias", Qelt::kBindingFloat));
  }
  Qelt::VertexDescriptor layout;
  layout.addAttribute(Qelt::AttributeType::Float, 2, -1);
  mQuad.reset(
      Qelt::GraphicsFactory::createGraphicsObject(1, Qelt::GraphicsFactory::kTriangles, layout, 0, 0));
}

GlCanvas::~GlCanvas() = default;

bool GlCanvas::isReady() const {
  return mEdges != nullptr && mColor != nullptr && mAntiAlias != nullptr && mQuad != nullptr;
}

void GlCanvas::Clear(unsigned int argb) {
  const Qelt::Vector4<float> color = premultiplied(argb);
  mBitmap.clear(color.x, color.y, color.z, color.w);
}

void GlCanvas::DrawShape(float x, float y, float size, const Qelt::SPPaint& paint) {
  if (!std::isfinite(x) || !std::isfinite(y) || !std::isfinite(size) || size <= 0.0f) return;
  const auto width = static_cast<float>(mBitmap.GetWidth());
  const auto height = static_cast<float>(mBitmap.GetHeight());
  const Qelt::Vector4<float> edges{std::clamp(x, 0.0f, width), std::clamp(y, 0.0f, height),
                                   std::clamp(x + size, 0.0f, width), std::clamp(y + size, 0.0f, height)};
  const int left = static_cast<int>(std::floor(edges.x));
  const int top = static_cast<int>(std::floor(edges.y));
  const int right = static_cast<int>(std::ceil(edges.z));
  const int bottom = static_cast<int>(std::ceil(edges.w));
  if (left >= right || top >= bottom || !isReady()) return;
  if (!mBitmap.beginRender(left, top, right - left, bottom - top)) return;
  Qelt::OpenGLRenderer::enableState(GL_BLEND);
  Qelt::OpenGLRenderer::setBlendFuncFactors(GL_ONE, GL_ONE_MINUS_SRC_ALPHA, GL_ONE, GL_ONE_MINUS_SRC_ALPHA);
  mProgram->activate();
  mEdges->set(edges);
  mColor->set(premultiplied(paint.GetColor()));
  mAntiAlias->set(paint.IsAntiAlias() ? 1.0f : 0.0f);
  // Each time: a loss of the context leaves the buffer empty.
  constexpr std::array<float, 12> kCorners{-1, -1, 1, -1, -1, 1, -1, 1, 1, -1, 1, 1};
  mQuad->updateBuffer(0, kCorners.data(), 6);
  mQuad->draw(0, -1, true, 0);
  mBitmap.endRender();
}

}  // namespace QeltDesktop
