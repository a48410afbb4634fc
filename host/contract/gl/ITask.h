#pragma once

#include "base/HostApi.h"
#include "gl/QueueItemBase.h"

namespace Qelt {

// A piece of work for the render thread. Slots: destructor pair, run, isGlobalLockAllowed.
class QELT_HOST_API ITask : public QueueItemBase<ITask> {
 public:
  virtual ~ITask();
  // Runs once, on the render thread.
  virtual void run() = 0;
  // True when the host may hold its global lock around `run`.
  virtual bool isGlobalLockAllowed();
};

}  // namespace Qelt
