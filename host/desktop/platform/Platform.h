#pragma once

#include <memory>
#include <string>

#include "base/HostApi.h"

namespace QeltDesktop {

// What the host needs of the system that it runs on, and all that it knows of it: a GL context, the plug-in's
// library, and the log. A folder beside this header implements it for one system; CMake's QELT_PLATFORM says
// which one is built.

// Where a context shows its pictures: its default framebuffer (0).
struct Surface {
  // Which window, as the platform names it (a browser's canvas, by its selector). Linux has no windows: its
  // surfaces lie off screen, and only a reader of pixels sees them.
  std::string window;
  int width = 0;  // pixels; 0: the context draws into textures alone and has no framebuffer 0
  int height = 0;
};

// One OpenGL ES 3.0 context, or a browser's WebGL 2. Made, used and destroyed by the thread that draws; its
// destruction leaves that thread without a context.
class QELT_HOST_API GlContext {
 public:
  // A new context, not current yet; on a platform that brings a lost context back itself, that one. Throws
  // std::runtime_error with one clear line when there is none to be had.
  static std::unique_ptr<GlContext> make(const Surface& surface);

  virtual ~GlContext() = default;
  GlContext(const GlContext&) = delete;
  GlContext& operator=(const GlContext&) = delete;

  // Makes this the calling thread's context; throws std::runtime_error when that fails.
  virtual void makeCurrent() = 0;
  // Leaves the calling thread without a context.
  virtual void clearCurrent() = 0;

 protected:
  GlContext() = default;
};

// A plug-in in the process. Where the platform has no shared libraries it is linked in, and `path` says so.
struct LoadedPlugin {
  void* handle;
  std::string path;  // where it was found
};

// Loads a plug-in for the rest of the process's life. Throws std::runtime_error with the reason when it
// cannot. Any thread.
QELT_HOST_API LoadedPlugin loadPlugin(const std::string& path);
// The address of a name that the plug-in exports; null when there is none. Any thread.
QELT_HOST_API void* findInPlugin(const LoadedPlugin& plugin, const char* name);

// Writes one line of priority error, under the tag that the pens use, to where the pens' own lines go. Any
// thread. Takes no memory.
QELT_HOST_API void writeError(const char* line) noexcept;
// From here on the process logs nothing, neither host nor pens.
QELT_HOST_API void silenceLog();

}  // namespace QeltDesktop
