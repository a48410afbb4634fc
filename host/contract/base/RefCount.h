#pragma once

#include <atomic>

#include "base/HostApi.h"

namespace Qelt {

// Shared ownership by count. A new object has one reference; the last `Unref` deletes it. Any thread.
class QELT_HOST_API RefCount {
 public:
  RefCount();
  RefCount(const RefCount&) = delete;
  RefCount& operator=(const RefCount&) = delete;

  void Ref();
  void Unref();

 protected:
  virtual ~RefCount();

 private:
  std::atomic<int> mReferences{1};
};

}  // namespace Qelt
