#pragma once

#include <GLES3/gl3.h>

#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "base/HostApi.h"
#include "desktop/gl/GlState.h"
#include "desktop/platform/Platform.h"

namespace QeltDesktop {

class GlDevice;

// An object that owns GL names: textures, buffers, programs. It belongs to the device that is current on the
// thread that makes it. When the device's context is lost its names are gone, and it gets new ones in the
// next context. Without a context it does nothing. It is made, used and destroyed on the render thread. One
// made on another thread never has any names; one destroyed there leaves its names to the context, which
// takes them along when it goes.
class QELT_HOST_API GlResource {
 public:
  GlResource(const GlResource&) = delete;
  GlResource& operator=(const GlResource&) = delete;

 protected:
  GlResource();
  virtual ~GlResource();

  // True when GL may be called for this resource now.
  bool isLive() const;
  GlDevice* device() const { return mDevice; }

 private:
  friend class GlDevice;

  // The context is gone, and the names with it: they are not to be used again, nor any GL called.
  virtual void forget() noexcept = 0;
  // There is a new context: makes the names again.
  virtual void remake() noexcept = 0;

  GlDevice* mDevice;
};

// A GL context, the resources that have been made in it, and what is known of its state. Render thread.
class QELT_HOST_API GlDevice {
 public:
  // Makes a context and leaves it current. Throws std::runtime_error when there is none to be had.
  explicit GlDevice(const Surface& surface);
  // Resources that are still there become inert for good.
  ~GlDevice();
  GlDevice(const GlDevice&) = delete;
  GlDevice& operator=(const GlDevice&) = delete;

  // The device that the calling thread draws with, its context lost or not; null on any other thread.
  static GlDevice* current();
  // The same, but null while the context is lost.
  static GlDevice* live();

  // Takes the calling thread, or leaves it.
  void makeCurrent();
  void clearCurrent();

  bool isLost() const { return mContext == nullptr; }
  // The context has been taken away: destroys what is left of it, without a single GL call, has every
  // resource forget its names, and then tells managed objects. Does nothing while the context is lost
  // already.
  void lose() noexcept;
  // Makes a new context and the names of every resource in it, then tells managed objects. Throws
  // std::runtime_error when there is no context to be had, std::bad_alloc when there is no memory; nothing
  // has changed then.
  void restore();

  // The context's state, which nobody sets past it.
  GlState& state() { return mState; }
  // The longest sides that a texture may have, and that can be drawn into at once.
  int maxTextureSize() const { return mMaxTextureSize; }
  int maxViewportSize() const { return mMaxViewportSize; }
  // Renderer and version of the context, for people.
  const std::string& description() const { return mDescription; }

 private:
  friend class GlResource;
  void readLimits();

  const Surface mSurface;
  std::unique_ptr<GlContext> mContext;  // null while it is lost
  std::mutex mLock;                     // guards mResources
  std::vector<GlResource*> mResources;
  GlState mState;
  int mMaxTextureSize = 0;
  int mMaxViewportSize = 0;
  std::string mDescription;
};

// Tells the registered managed objects of a device what becomes of its context. What one object throws is
// logged, and the others are told all the same. Render thread.
class ManagedObjects {
 public:
  static void release(const GlDevice* device);
  static void restore(const GlDevice* device);
  // The device is going: whoever registered with it hears nothing any more.
  static void forget(const GlDevice* device);
};

}  // namespace QeltDesktop
