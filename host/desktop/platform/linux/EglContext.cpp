#include <EGL/egl.h>
#include <EGL/eglext.h>

#include <array>
#include <cstdio>
#include <stdexcept>
#include <string_view>
#include <vector>

#include "desktop/platform/Platform.h"

namespace QeltDesktop {

namespace {

bool lists(const char* extensions, std::string_view wanted) {
  if (extensions == nullptr) return false;
  std::string_view rest(extensions);
  while (!rest.empty()) {
    const std::size_t end = rest.find(' ');
    if (rest.substr(0, end) == wanted) return true;
    if (end == std::string_view::npos) break;
    rest.remove_prefix(end + 1);
  }
  return false;
}

// Displays worth a try, the ones without any window system first.
std::vector<EGLDisplay> candidateDisplays() {
  std::vector<EGLDisplay> displays;
  const char* const client = eglQueryString(EGL_NO_DISPLAY, EGL_EXTENSIONS);
  const auto getPlatformDisplay = reinterpret_cast<PFNEGLGETPLATFORMDISPLAYEXTPROC>(
      lists(client, "EGL_EXT_platform_base") ? eglGetProcAddress("eglGetPlatformDisplayEXT") : nullptr);
  if (getPlatformDisplay != nullptr && lists(client, "EGL_MESA_platform_surfaceless")) {
    displays.push_back(getPlatformDisplay(EGL_PLATFORM_SURFACELESS_MESA, EGL_DEFAULT_DISPLAY, nullptr));
  }
  if (getPlatformDisplay != nullptr && lists(client, "EGL_EXT_platform_device")) {
    const auto queryDevices =
        reinterpret_cast<PFNEGLQUERYDEVICESEXTPROC>(eglGetProcAddress("eglQueryDevicesEXT"));
    std::array<EGLDeviceEXT, 16> devices{};
    EGLint count = 0;
    if (queryDevices != nullptr && queryDevices(devices.size(), devices.data(), &count) == EGL_TRUE) {
      for (EGLint i = 0; i < count; ++i) {
        displays.push_back(getPlatformDisplay(EGL_PLATFORM_DEVICE_EXT, devices[i], nullptr));
      }
    }
  }
  displays.push_back(eglGetDisplay(EGL_DEFAULT_DISPLAY));
  return displays;
}

struct Attempt {
  EGLDisplay display = EGL_NO_DISPLAY;
  EGLSurface surface = EGL_NO_SURFACE;
  EGLContext context = EGL_NO_CONTEXT;
  const char* failedStep = nullptr;
};

Attempt tryDisplay(EGLDisplay display, const Surface& wanted) {
  Attempt attempt{.display = display};
  if (display == EGL_NO_DISPLAY || eglInitialize(display, nullptr, nullptr) != EGL_TRUE) {
    attempt.failedStep = "eglInitialize";
    return attempt;
  }
  if (eglBindAPI(EGL_OPENGL_ES_API) != EGL_TRUE) {
    attempt.failedStep = "eglBindAPI";
    return attempt;
  }
  const bool isShown = wanted.width > 0 && wanted.height > 0;
  const bool needsNone =
      !isShown && lists(eglQueryString(display, EGL_EXTENSIONS), "EGL_KHR_surfaceless_context");
  const EGLint configAttributes[] = {EGL_RENDERABLE_TYPE,
                                     EGL_OPENGL_ES3_BIT,
                                     EGL_SURFACE_TYPE,
                                     needsNone ? 0 : EGL_PBUFFER_BIT,
                                     EGL_RED_SIZE,
                                     8,
                                     EGL_GREEN_SIZE,
                                     8,
                                     EGL_BLUE_SIZE,
                                     8,
                                     EGL_ALPHA_SIZE,
                                     8,
                                     EGL_NONE};
  EGLConfig config = nullptr;
  EGLint count = 0;
  if (eglChooseConfig(display, configAttributes, &config, 1, &count) != EGL_TRUE || count < 1) {
    attempt.failedStep = "eglChooseConfig";
    return attempt;
  }
  if (!needsNone) {
    // Where contexts without any surface are not offered, a single pixel stands in.
    const EGLint surfaceAttributes[] = {EGL_WIDTH, isShown ? wanted.width : 1, EGL_HEIGHT,
                                        isShown ? wanted.height : 1, EGL_NONE};
    attempt.surface = eglCreatePbufferSurface(display, config, surfaceAttributes);
    if (attempt.surface == EGL_NO_SURFACE) {
      attempt.failedStep = "eglCreatePbufferSurface";
      return attempt;
    }
  }
  const EGLint contextAttributes[] = {EGL_CONTEXT_CLIENT_VERSION, 3, EGL_NONE};
  attempt.context = eglCreateContext(display, config, EGL_NO_CONTEXT, contextAttributes);
  if (attempt.context == EGL_NO_CONTEXT) {
    attempt.failedStep = "eglCreateContext";
    if (attempt.surface != EGL_NO_SURFACE) eglDestroySurface(display, attempt.surface);
  }
  return attempt;
}

std::string eglErrorText() {
  char text[16];
  std::snprintf(text, sizeof text, "0x%04X", static_cast<unsigned>(eglGetError()));
  return text;
}

class EglContext final : public GlContext {
 public:
  explicit EglContext(const Attempt& made) : mMade(made) {}
  // The display stays initialised: other contexts of the process share it, and ending it would unload the
  // driver whose threads may still be winding down.
  ~EglContext() override {
    if (eglGetCurrentContext() == mMade.context) EglContext::clearCurrent();
    eglDestroyContext(mMade.display, mMade.context);
    if (mMade.surface != EGL_NO_SURFACE) eglDestroySurface(mMade.display, mMade.surface);
  }

  void makeCurrent() override {
    if (eglMakeCurrent(mMade.display, mMade.surface, mMade.surface, mMade.context) != EGL_TRUE) {
      throw std::runtime_error("the OpenGL ES context cannot be made current (" + eglErrorText() + ")");
    }
  }
  void clearCurrent() override {
    eglMakeCurrent(mMade.display, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
  }

 private:
  const Attempt mMade;
};

}  // namespace

std::unique_ptr<GlContext> GlContext::make(const Surface& surface) {
  std::string reasons;
  for (EGLDisplay display : candidateDisplays()) {
    const Attempt attempt = tryDisplay(display, surface);
    if (attempt.failedStep == nullptr) return std::make_unique<EglContext>(attempt);
    reasons += std::string(reasons.empty() ? "" : ", ") + attempt.failedStep + " " + eglErrorText();
  }
  throw std::runtime_error("no OpenGL ES 3.0 on this machine (" + reasons + ")");
}

}  // namespace QeltDesktop
