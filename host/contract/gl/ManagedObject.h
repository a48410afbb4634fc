#pragma once

#include "base/HostApi.h"

namespace Qelt {

// Something that owns GL objects and hears of the loss of the GL context. Render thread.
// Slots: destructor pair, OnRelease, OnRestore.
class QELT_HOST_API ManagedObject {
 public:
  virtual ~ManagedObject();
  // The context is gone, and what was in it with it: nothing can be read back, and GL calls have no effect.
  virtual void OnRelease() = 0;
  // There is a context again. GL objects that were made through the host's wrappers exist again, without
  // their contents; only what a canvas drew into a bitmap is back.
  virtual void OnRestore() = 0;

  // The registry does not own. Registering twice counts once; unregistering a stranger does nothing.
  static void Register(ManagedObject* object);
  static void Unregister(ManagedObject* object);
};

}  // namespace Qelt
