#pragma once

#include "base/HostApi.h"

namespace Qelt {

// What every object on a page has: runtime handles for caches, and the mark that its cached drawing
// is stale. Main thread.
class QELT_HOST_API ObjectBase {
 public:
  // Gives the object a fresh runtime handle, 1 and up.
  ObjectBase();
  virtual ~ObjectBase();
  ObjectBase(const ObjectBase&) = delete;
  ObjectBase& operator=(const ObjectBase&) = delete;

  int GetRuntimeHandle() const;
  // The handle of the object this one was copied from, whose cached drawing still fits; -1 when none.
  int GetOriginalRuntimeHandle() const;
  void SetOriginalRuntimeHandle(int handle);

  // True when the cached drawing no longer fits the object.
  bool IsRedrawingCacheDirty() const;
  void ClearRedrawingCacheDirtyFlag();
  // Chosen here: how a document marks a changed object.
  void SetRedrawingCacheDirtyFlag();

  // The living object with a runtime handle, or null. Borrowed.
  static ObjectBase* FindObjectBase(int runtimeHandle);

 private:
  int mRuntimeHandle;
  int mOriginalRuntimeHandle = -1;
  bool mRedrawingCacheDirty = true;
};

}  // namespace Qelt
