#pragma once

#include <GLES3/gl3.h>

#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "base/HostApi.h"

namespace QeltDesktop {

class EglContext;
class GlDevice;

// Something made of GL names. It registers with the device whose context is current where it is made, loses
// its names with the context and makes them again in the next one. Where there is no context it is inert.
// Made, used and destroyed on the render thread; made or destroyed elsewhere it only forgets or never had
// its names, which then go with the context.
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

  // The context is still there and about to go: last chance to read something back. May throw
  // std::bad_alloc: the context stays then.
  virtual void save();
  // The context stays after all: what was saved is not needed.
  virtual void dropSaved() noexcept;
  // The names are gone; no GL may be called.
  virtual void forget() = 0;
  // There is a context again. Must not throw.
  virtual void remake() = 0;

  GlDevice* mDevice;
};

// A GL context, what has been made in it, and a little of its state. Render thread.
class QELT_HOST_API GlDevice {
 public:
  // Makes a context and leaves it current. Throws std::runtime_error when there is none to be had.
  GlDevice();
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
  // Drops the context: managed objects hear of it first, then resources save and forget. Twice counts once.
  // Throws std::bad_alloc when there is no memory to save with; the context is still there then.
  void lose();
  // Makes a new context and everything in it: resources first, then managed objects hear of it. Throws
  // std::runtime_error when there is no context to be had, std::bad_alloc when there is no memory; nothing
  // has changed then.
  void restore();

  // Makes a program the current one, without asking GL when it is so already.
  void useProgram(GLuint program);
  void forgetProgram(GLuint program);
  // The longest sides that a texture may have, and that can be drawn into at once.
  int maxTextureSize() const { return mMaxTextureSize; }
  int maxViewportSize() const { return mMaxViewportSize; }
  // Renderer and version of the context, for people.
  const std::string& description() const { return mDescription; }

 private:
  friend class GlResource;
  void readLimits();
  std::vector<GlResource*> resources();

  std::unique_ptr<EglContext> mContext;
  std::mutex mLock;  // guards mResources
  std::vector<GlResource*> mResources;
  GLuint mProgram = 0;
  int mMaxTextureSize = 0;
  int mMaxViewportSize = 0;
  std::string mDescription;
};

}  // namespace QeltDesktop
