#include "desktop/graphics/Presenter.h"

#include <cmath>
#include <new>
#include <stdexcept>
#include <string>

#include "base/Vector.h"
#include "desktop/base/Log.h"
#include "desktop/gl/GlCall.h"
#include "desktop/gl/GlDevice.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "gl/GraphicsFactory.h"
#include "gl/OpenGLShaderProgram.h"
#include "graphics/ISPBitmap.h"

namespace QeltDesktop {

namespace {

// One triangle that covers the whole surface.
constexpr const char* kVertexShader = R"(#version 300 es
void main() {
  gl_Position = vec4(gl_VertexID == 1 ? 3.0 : -1.0, gl_VertexID == 2 ? 3.0 : -1.0, 0.0, 1.0);
}
)";

// All layers in one pass: laid over each other in floats they are rounded once. A place holds the layer's top
// left corner on the surface, and texture coordinates per surface pixel; negative ones lie outside of every
// texture.
constexpr const char* kFragmentShader = R"(#version 300 es
precision highp float;
precision highp sampler2D;
uniform sampler2D layer0, layer1, layer2, layer3;
uniform vec4 place0, place1, place2, place3;
uniform vec4 paper;
uniform float height;
out vec4 FragColor;
vec4 over(vec4 below, sampler2D layer, vec4 place) {
  vec2 at = (vec2(gl_FragCoord.x, height - gl_FragCoord.y) - place.xy) * place.zw;
  if (any(lessThan(at, vec2(0.0))) || any(greaterThan(at, vec2(1.0)))) return below;
  vec4 color = textureLod(layer, at, 0.0);
  return color + (1.0 - color.a) * below;
}
void main() {
  FragColor = over(over(over(over(paper, layer0, place0), layer1, place1), layer2, place2), layer3, place3);
}
)";

bool isWhole(float value) {
  return value == std::floor(value);
}

bool isShown(const ShownLayer& shown) {
  return shown.layer != nullptr && shown.layer->GetBitmap() != nullptr && std::isfinite(shown.x) &&
         std::isfinite(shown.y) && std::isfinite(shown.scale) && shown.scale > 0.0f;
}

}  // namespace

Presenter::Presenter(RenderQueue& queue) : mQueue(queue) {
  if (!mQueue.run([this] { make(); })) {
    throw std::runtime_error("nothing can be shown, because the render thread has been shut down");
  }
}

// On the render thread: what lets GL go elsewhere would leave it to the context.
void Presenter::release() {
  for (std::size_t i = 0; i < kMostLayers; ++i) {
    mLayers[i].reset();
    mPlaces[i].reset();
  }
  mPaper.reset();
  mHeight.reset();
  mProgram.reset();
}

void Presenter::make() {
  GlDevice* const device = GlDevice::live();
  if (device == nullptr) throw std::runtime_error("nothing can be shown without OpenGL");
  device->state().bindFramebuffer(0);
  if (gl(glCheckFramebufferStatus)(GL_FRAMEBUFFER) != GL_FRAMEBUFFER_COMPLETE) {
    throw std::runtime_error("nothing can be shown, because the OpenGL context has no surface");
  }
  mProgram.reset(Qelt::GraphicsFactory::createOpenGLShaderProgram(kVertexShader, kFragmentShader, nullptr));
  if (mProgram == nullptr) throw std::runtime_error("the shader that shows layers cannot be made");
  try {
    bindAll();
  } catch (...) {
    release();
    throw;
  }
}

void Presenter::bindAll() {
  const auto bind = [this](const std::string& name) {
    Binding binding(mProgram->getBindingIntf(name.c_str(), Qelt::kBindingAny));
    if (binding == nullptr) throw std::bad_alloc();
    return binding;
  };
  for (std::size_t i = 0; i < kMostLayers; ++i) {
    mLayers[i] = bind("layer" + std::to_string(i));
    mPlaces[i] = bind("place" + std::to_string(i));
  }
  mPaper = bind("paper");
  mHeight = bind("height");
}

Presenter::~Presenter() {
  try {
    mQueue.run([this] { release(); });
  } catch (...) {
    logError("a shader program could not be given back to OpenGL; it goes with the context");
  }
}

void Presenter::present(std::span<const ShownLayer> layers,
                        const std::optional<std::array<std::uint8_t, 3>>& paper, int width, int height) {
  if (layers.size() > kMostLayers) throw std::invalid_argument("more layers than can be shown at once");
  mQueue.run([&] { draw(layers, paper, width, height); });
}

void Presenter::draw(std::span<const ShownLayer> layers,
                     const std::optional<std::array<std::uint8_t, 3>>& paper, int width, int height) {
  GlDevice* const device = GlDevice::live();
  if (device == nullptr) return;
  GlState& state = device->state();
  state.bindFramebuffer(0);
  state.setViewport(0, 0, width, height);
  for (const GLenum off : {GL_BLEND, GL_SCISSOR_TEST, GL_CULL_FACE, GL_DEPTH_TEST, GL_STENCIL_TEST}) {
    state.setEnabled(off, false);
  }
  state.openColorMask();
  mProgram->activate();
  if (state.program() == 0) return;
  const auto share = [&paper](std::size_t i) { return static_cast<float>((*paper)[i]) / 255.0f; };
  mPaper->set(paper ? Qelt::Vector4<float>{share(0), share(1), share(2), 1.0f} : Qelt::Vector4<float>{});
  mHeight->set(static_cast<float>(height));
  for (std::size_t i = 0; i < kMostLayers; ++i) {
    const bool isThere = i < layers.size() && isShown(layers[i]);
    mLayers[i]->set(static_cast<int>(i));
    if (!isThere) {
      mPlaces[i]->set(Qelt::Vector4<float>{0.0f, 0.0f, -1.0f, -1.0f});
      continue;
    }
    const ShownLayer& shown = layers[i];
    Qelt::ISPTexture& texture = *shown.layer->GetBitmap()->GetTexture();
    texture.Bind(static_cast<int>(i));
    const int filter = shown.scale == 1.0f && isWhole(shown.x) && isWhole(shown.y) ? GL_NEAREST : GL_LINEAR;
    texture.SetFilter(Qelt::ISPTexture::kMinFilter, filter);
    texture.SetFilter(Qelt::ISPTexture::kMagFilter, filter);
    mPlaces[i]->set(Qelt::Vector4<float>{shown.x, shown.y,
                                         1.0f / (shown.scale * static_cast<float>(shown.layer->width())),
                                         1.0f / (shown.scale * static_cast<float>(shown.layer->height()))});
  }
  state.bindVertexArray(0);
  gl(glDrawArrays)(GL_TRIANGLES, 0, 3);
}

}  // namespace QeltDesktop
