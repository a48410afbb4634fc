#pragma once

#include <string>

#include "base/HostApi.h"
#include "desktop/platform/Platform.h"

namespace Qelt {
class Pen;
}  // namespace Qelt

namespace QeltDesktop {

// A loaded pen plug-in. It stays loaded until the process ends: tasks and registry entries made by its
// code may outlive this object.
class QELT_HOST_API PluginLibrary {
 public:
  // Throws std::runtime_error, naming the file, when it cannot be loaded or has no `createPenInst`.
  explicit PluginLibrary(const std::string& path);

  // A new pen, owned by the caller and deleted through its virtual destructor; null when memory ran out.
  Qelt::Pen* createPen() const;
  // The address of an exported name; null when there is none.
  void* symbol(const char* name) const;
  // Where the library was found.
  const std::string& path() const;

 private:
  using CreatePen = Qelt::Pen* (*)();

  LoadedPlugin mPlugin;
  CreatePen mCreatePen;
};

}  // namespace QeltDesktop
