#include "desktop/gl/GlDevice.h"

#include <algorithm>

#include "desktop/gl/GlCall.h"

namespace QeltDesktop {

namespace {

thread_local GlDevice* tCurrent = nullptr;

std::string glText(GLenum name) {
  const GLubyte* const text = gl(glGetString)(name);
  return text != nullptr ? reinterpret_cast<const char*>(text) : "?";
}

}  // namespace

GlResource::GlResource() : mDevice(GlDevice::current()) {
  if (mDevice == nullptr) return;
  const std::lock_guard guard(mDevice->mLock);
  mDevice->mResources.push_back(this);
}

GlResource::~GlResource() {
  if (mDevice == nullptr) return;
  const std::lock_guard guard(mDevice->mLock);
  // Most objects die young: look from the back.
  auto& all = mDevice->mResources;
  const auto found = std::find(all.rbegin(), all.rend(), this);
  if (found != all.rend()) all.erase(std::next(found).base());
}

bool GlResource::isLive() const {
  return mDevice != nullptr && GlDevice::live() == mDevice;
}

GlDevice::GlDevice(const Surface& surface) : mSurface(surface), mContext(GlContext::make(surface)) {
  makeCurrent();
  try {
    readLimits();
  } catch (...) {
    clearCurrent();
    throw;
  }
}

GlDevice::~GlDevice() {
  {
    const std::lock_guard guard(mLock);
    for (GlResource* resource : mResources) {
      resource->forget();
      resource->mDevice = nullptr;
    }
  }
  ManagedObjects::forget(this);
  clearCurrent();
}

GlDevice* GlDevice::current() {
  return tCurrent;
}

GlDevice* GlDevice::live() {
  return tCurrent != nullptr && !tCurrent->isLost() ? tCurrent : nullptr;
}

void GlDevice::makeCurrent() {
  if (mContext != nullptr) mContext->makeCurrent();
  tCurrent = this;
}

void GlDevice::clearCurrent() {
  if (mContext != nullptr) mContext->clearCurrent();
  tCurrent = nullptr;
}

void GlDevice::lose() noexcept {
  if (isLost()) return;
  mContext.reset();
  mState.forget();
  {
    const std::lock_guard guard(mLock);
    for (GlResource* resource : mResources) resource->forget();
  }
  ManagedObjects::release(this);
}

void GlDevice::restore() {
  if (!isLost()) return;
  // All that may throw comes ahead of the change.
  std::unique_ptr<GlContext> context = GlContext::make(mSurface);
  context->makeCurrent();
  readLimits();
  mContext = std::move(context);
  {
    const std::lock_guard guard(mLock);
    for (GlResource* resource : mResources) resource->remake();
  }
  ManagedObjects::restore(this);
}

void GlDevice::readLimits() {
  gl(glGetIntegerv)(GL_MAX_TEXTURE_SIZE, &mMaxTextureSize);
  GLint viewport[2] = {};
  gl(glGetIntegerv)(GL_MAX_VIEWPORT_DIMS, viewport);
  mMaxViewportSize = std::min(viewport[0], viewport[1]);
  mDescription = glText(GL_RENDERER) + ", " + glText(GL_VERSION);
}

}  // namespace QeltDesktop
