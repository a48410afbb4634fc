#pragma once

#include "base/HostApi.h"

namespace Qelt {

class ITask;

// The way to the render thread: tasks run one at a time, in the order they were posted.
class QELT_HOST_API IGLMsgQueue {
 public:
  virtual ~IGLMsgQueue();
  // True: the queue owns the task, will run it and then destroy it, both on the render thread. False: it
  // refused; the caller still owns the task. A null task is ignored. Any thread. Chosen here: the operation's
  // name; for a null task it returns true.
  virtual bool Post(ITask* task) = 0;
};

}  // namespace Qelt
