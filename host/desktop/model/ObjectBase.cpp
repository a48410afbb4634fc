#include "model/ObjectStroke.h"

#include <map>
#include <mutex>

namespace Qelt {

namespace {

struct Registry {
  std::mutex lock;
  std::map<int, ObjectBase*> objects;
  int lastHandle = 0;
};

// Never destroyed: objects with static lifetime still leave it at exit.
Registry& registry() {
  static Registry* const instance = new Registry;
  return *instance;
}

}  // namespace

ObjectBase::ObjectBase() {
  Registry& all = registry();
  const std::lock_guard guard(all.lock);
  mRuntimeHandle = ++all.lastHandle;
  all.objects.emplace(mRuntimeHandle, this);
}

ObjectBase::~ObjectBase() {
  Registry& all = registry();
  const std::lock_guard guard(all.lock);
  all.objects.erase(mRuntimeHandle);
}

int ObjectBase::GetRuntimeHandle() const {
  return mRuntimeHandle;
}

int ObjectBase::GetOriginalRuntimeHandle() const {
  return mOriginalRuntimeHandle;
}

void ObjectBase::SetOriginalRuntimeHandle(int handle) {
  mOriginalRuntimeHandle = handle;
}

bool ObjectBase::IsRedrawingCacheDirty() const {
  return mRedrawingCacheDirty;
}

void ObjectBase::ClearRedrawingCacheDirtyFlag() {
  mRedrawingCacheDirty = false;
}

void ObjectBase::SetRedrawingCacheDirtyFlag() {
  mRedrawingCacheDirty = true;
}

ObjectBase* ObjectBase::FindObjectBase(int runtimeHandle) {
  Registry& all = registry();
  const std::lock_guard guard(all.lock);
  const auto found = all.objects.find(runtimeHandle);
  return found == all.objects.end() ? nullptr : found->second;
}

ObjectStroke::ObjectStroke() = default;
ObjectStroke::~ObjectStroke() = default;

}  // namespace Qelt
