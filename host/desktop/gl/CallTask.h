#pragma once

#include <new>
#include <utility>

#include "gl/IGLMsgQueue.h"
#include "gl/ITask.h"

namespace QeltDesktop {

// A task that calls a function object.
template <typename Call>
class CallTask final : public Qelt::ITask {
 public:
  explicit CallTask(Call call) : mCall(std::move(call)) {}
  void run() override { mCall(); }

 private:
  Call mCall;
};

// Posts a call; false when the queue refused it or memory ran out.
template <typename Call>
bool postCall(Qelt::IGLMsgQueue& queue, Call call) {
  auto* const task = new (std::nothrow) CallTask<Call>(std::move(call));
  if (task == nullptr) return false;
  if (queue.Post(task)) return true;
  delete task;
  return false;
}

}  // namespace QeltDesktop
