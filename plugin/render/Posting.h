#pragma once

#include <new>
#include <type_traits>

#include "gl/IGLMsgQueue.h"
#include "gl/ITask.h"
#include "render/Tasks.h"

namespace Qelt {

// Hands a task to the render thread's queue; one that the queue refuses is destroyed at once. True when the
// queue took it. Without a queue, or without a task because memory ran out, nothing is posted.
inline bool postTask(IGLMsgQueue* queue, ITask* task) {
  if (task == nullptr) return false;
  task->mNext = nullptr;
  if (queue != nullptr && queue->Post(task)) return true;
  delete task;
  return false;
}

// Has `object->member(...)` called on the render thread. The task's type names the class that declares the
// member.
template <typename T, typename R>
bool post(IGLMsgQueue* queue, std::type_identity_t<T>* object, R (T::*member)()) {
  return postTask(queue, new (std::nothrow) WorkerTask::Member0<T, R (T::*)()>(object, member));
}

template <typename T, typename R, typename A>
bool post(IGLMsgQueue* queue, std::type_identity_t<T>* object, R (T::*member)(A),
          std::type_identity_t<A> argument) {
  return postTask(queue, new (std::nothrow) WorkerTask::Member1<T, R (T::*)(A), A>(object, member, argument));
}

template <typename T, typename R, typename A, typename B>
bool post(IGLMsgQueue* queue, std::type_identity_t<T>* object, R (T::*member)(A, B),
          std::type_identity_t<A> first, std::type_identity_t<B> second) {
  return postTask(
      queue, new (std::nothrow) WorkerTask::Member2<T, R (T::*)(A, B), A, B>(object, member, first, second));
}

// Has an object deleted on the render thread. When it answers false, the object is still the caller's.
template <typename T>
bool postDelete(IGLMsgQueue* queue, T* object) {
  return postTask(queue, new (std::nothrow) WorkerTask::Delete<T>(object));
}

}  // namespace Qelt
