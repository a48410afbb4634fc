#pragma once

#include <mutex>

#include "base/HostApi.h"

namespace Qelt {

// A recursive lock.
class QELT_HOST_API CriticalSection {
 public:
  CriticalSection();
  ~CriticalSection();
  void Enter();
  void Leave();

 private:
  std::recursive_mutex mMutex;
};

// Holds a critical section for a scope.
class QELT_HOST_API AutoCriticalSection {
 public:
  explicit AutoCriticalSection(CriticalSection* section);
  ~AutoCriticalSection();
  AutoCriticalSection(const AutoCriticalSection&) = delete;
  AutoCriticalSection& operator=(const AutoCriticalSection&) = delete;

 private:
  CriticalSection* mSection;
};

}  // namespace Qelt
