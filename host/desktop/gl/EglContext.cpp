#include "desktop/gl/EglContext.h"

#include <EGL/egl.h>
#include <EGL/eglext.h>

#include <array>
#include <cstdio>
#include <stdexcept>
#include <string_view>
#include <vector>

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
  EGLSurface surface = EGL_NO_SURFACE;
  EGLContext context = EGL_NO_CONTEXT;
  const char* failedStep = nullptr;
};

Attempt tryDisplay(EGLDisplay display) {
  Attempt attempt;
  if (display == EGL_NO_DISPLAY || eglInitialize(display, nullptr, nullptr) != EGL_TRUE) {
    attempt.failedStep = "eglInitialize";
    return attempt;
  }
  if (eglBindAPI(EGL_OPENGL_ES_API) != EGL_TRUE) {
    attempt.failedStep = "eglBindAPI";
    return attempt;
  }
  const bool surfaceless = lists(eglQueryString(display, EGL_EXTENSIONS), "EGL_KHR_surfaceless_context");
  const EGLint configAttributes[] = {EGL_RENDERABLE_TYPE,
                                     EGL_OPENGL_ES3_BIT,
                                     EGL_SURFACE_TYPE,
                                     surfaceless ? 0 : EGL_PBUFFER_BIT,
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
  if (!surfaceless) {
    const EGLint surfaceAttributes[] = {EGL_WIDTH, 1, EGL_HEIGHT, 1, EGL_NONE};
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

}  // namespace

EglContext::EglContext() {
  std::string reasons;
  for (EGLDisplay display : candidateDisplays()) {
    const Attempt attempt = tryDisplay(display);
    if (attempt.failedStep == nullptr) {
      mDisplay = display;
      mSurface = attempt.surface;
      mContext = attempt.context;
      return;
    }
    reasons += std::string(reasons.empty() ? "" : ", ") + attempt.failedStep + " " + eglErrorText();
  }
  throw std::runtime_error("no OpenGL ES 3.0 on this machine (" + reasons + ")");
}

// The display stays initialised: other contexts of the process share it, and ending it would unload the
// driver whose threads may still be winding down.
EglContext::~EglContext() {
  if (eglGetCurrentContext() == mContext) clearCurrent();
  eglDestroyContext(mDisplay, mContext);
  if (mSurface != EGL_NO_SURFACE) eglDestroySurface(mDisplay, mSurface);
}

void EglContext::makeCurrent() {
  if (eglMakeCurrent(mDisplay, mSurface, mSurface, mContext) != EGL_TRUE) {
    throw std::runtime_error("the OpenGL ES context cannot be made current (" + eglErrorText() + ")");
  }
}

void EglContext::clearCurrent() {
  eglMakeCurrent(mDisplay, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
}

}  // namespace QeltDesktop
