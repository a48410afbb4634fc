#include "gl/ManagedObject.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <exception>
#include <mutex>
#include <new>
#include <vector>

#include "desktop/base/Log.h"
#include "desktop/gl/GlDevice.h"

namespace {

struct Entry {
  Qelt::ManagedObject* object;
  const QeltDesktop::GlDevice* device;
  std::uint64_t told;  // the last notice it has heard of
};

struct Registry {
  std::mutex lock;
  std::vector<Entry> entries;
  std::uint64_t notices = 0;
};

// Never destroyed, since objects with static lifetime still leave it at exit. Not on the heap: it needs no
// memory.
Registry& registry() {
  alignas(Registry) static std::byte place[sizeof(Registry)];
  static Registry* const instance = new (place) Registry;
  return *instance;
}

using Notice = void (Qelt::ManagedObject::*)();

// Needs no memory, so that everybody is told even when none is left. Objects may come and go meanwhile; those
// that come are not told.
void notify(const QeltDesktop::GlDevice* device, Notice notice) {
  std::uint64_t number = 0;
  for (;;) {
    Qelt::ManagedObject* next = nullptr;
    {
      const std::lock_guard guard(registry().lock);
      if (number == 0) number = ++registry().notices;
      auto& entries = registry().entries;
      const auto found = std::find_if(entries.begin(), entries.end(), [&](const Entry& entry) {
        return entry.device == device && entry.told < number;
      });
      if (found == entries.end()) return;
      found->told = number;
      next = found->object;
    }
    try {
      (next->*notice)();
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
  if (found != entries.end()) return;
  entries.push_back({object, QeltDesktop::GlDevice::current(), registry().notices});
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
