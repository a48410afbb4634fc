#include <emscripten/html5.h>

#include <stdexcept>

#include "desktop/platform/Platform.h"

namespace QeltDesktop {

namespace {

class WebGlContext final : public GlContext {
 public:
  explicit WebGlContext(EMSCRIPTEN_WEBGL_CONTEXT_HANDLE context) : mContext(context) {}
  // The canvas keeps its context: a browser has one for each, and brings that back after a loss.
  ~WebGlContext() override { emscripten_webgl_destroy_context(mContext); }

  void makeCurrent() override {
    if (emscripten_webgl_make_context_current(mContext) != EMSCRIPTEN_RESULT_SUCCESS) {
      throw std::runtime_error("the WebGL 2 context cannot be made current");
    }
  }
  void clearCurrent() override { emscripten_webgl_make_context_current(0); }

 private:
  const EMSCRIPTEN_WEBGL_CONTEXT_HANDLE mContext;
};

}  // namespace

// The page's script has made the canvas's context before, with attributes of its own choice; it is the one
// that is found here, since a canvas has but one.
std::unique_ptr<GlContext> GlContext::make(const Surface& surface) {
  EmscriptenWebGLContextAttributes attributes;
  emscripten_webgl_init_context_attributes(&attributes);
  attributes.majorVersion = 2;
  attributes.minorVersion = 0;
  attributes.antialias = false;  // layers cannot be blitted to a multisampled framebuffer
  attributes.depth = false;
  attributes.stencil = false;
  attributes.premultipliedAlpha = true;
  const EMSCRIPTEN_WEBGL_CONTEXT_HANDLE context =
      emscripten_webgl_create_context(surface.window.c_str(), &attributes);
  if (context <= 0) throw std::runtime_error("this browser has no WebGL 2");
  auto made = std::make_unique<WebGlContext>(context);
  // A lost context can be had as well, and takes every call, but nothing is ever drawn with it.
  made->makeCurrent();
  const bool isLost = emscripten_is_webgl_context_lost(context) != 0;
  made->clearCurrent();
  if (isLost) throw std::runtime_error("the browser has not brought the WebGL context back yet");
  return made;
}

}  // namespace QeltDesktop
