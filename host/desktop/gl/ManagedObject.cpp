#include "gl/ManagedObject.h"

#include <algorithm>
#include <cstddef>
#include <exception>
#include <mutex>
#include <new>
#include <vector>

#include "desktop/base/Log.h"
#include "desktop/gl/GlDevice.h"
#include "desktop/gl/ManagedObjects.h"

namespace {

struct Entry {
  Qelt::ManagedObject* object;
  const QeltDesktop::GlDevice* device;
};

struct Registry {
  std::mutex lock;
  std::vector<Entry> entries;
};

// Never destroyed: objects with static lifetime still leave it at exit. In place: leaving takes no memory.
Registry& registry() {
  alignas(Registry) static std::byte place[sizeof(Registry)];
  static Registry* const instance = new (place) Registry;
  return *instance;
}

using Notice = void (Qelt::ManagedObject::*)();

void notify(const QeltDesktop::GlDevice* device, Notice notice) {
  std::vector<Entry> told;
  {
    const std::lock_guard guard(registry().lock);
    told = registry().entries;
  }
  for (const Entry& entry : told) {
    if (entry.device != device) continue;
    {
      // An object told before may have taken this one away.
      const std::lock_guard guard(registry().lock);
      const auto& now = registry().entries;
      const bool stillThere = std::any_of(now.begin(), now.end(),
                                          [&](const Entry& other) { return other.object == entry.object; });
      if (!stillThere) continue;
    }
    try {
      (entry.object->*notice)();
    } catch (const std::exception& error) {
      QeltDesktop::logError("a managed object threw on a change of context", error.what());
    } catch (...) {
      QeltDesktop::logError("a managed object threw on a change of context");
    }
  }
}

}  // namespace

namespace Qelt {

ManagedObject::~ManagedObject() {
  Unregister(this);
}

void ManagedObject::Register(ManagedObject* object) {
  if (object == nullptr) return;
  const std::lock_guard guard(registry().lock);
  auto& entries = registry().entries;
  const auto found = std::find_if(entries.begin(), entries.end(),
                                  [&](const Entry& entry) { return entry.object == object; });
  if (found == entries.end()) entries.push_back({object, QeltDesktop::GlDevice::current()});
}

void ManagedObject::Unregister(ManagedObject* object) {
  const std::lock_guard guard(registry().lock);
  std::erase_if(registry().entries, [&](const Entry& entry) { return entry.object == object; });
}

}  // namespace Qelt

namespace QeltDesktop {

void ManagedObjects::release(const GlDevice* device) {
  notify(device, &Qelt::ManagedObject::OnRelease);
}

void ManagedObjects::restore(const GlDevice* device) {
  notify(device, &Qelt::ManagedObject::OnRestore);
}

void ManagedObjects::forget(const GlDevice* device) {
  const std::lock_guard guard(registry().lock);
  for (Entry& entry : registry().entries) {
    if (entry.device == device) entry.device = nullptr;
  }
}

}  // namespace QeltDesktop
