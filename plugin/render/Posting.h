#pragma once

#include <cstdint>
#include <new>
#include <type_traits>

#include "base/PointF.h"
#include "base/RectF.h"
#include "gl/IGLMsgQueue.h"
#include "gl/ITask.h"
#include "pencommon/PenDrawableRT.h"
#include "pencommon/PenGLDataManager.h"

namespace Qelt {

// Work for the render thread. A task neither owns its object nor holds a reference on it; the object must
// outlive the task. All destructors are trivial, so that a refused task takes nothing with it.
namespace WorkerTask {

// Calls a member without arguments.
template <typename T, typename F>
class Member0 final : public ITask {
 public:
  Member0(T* object, F member) : mObject(object), mMember(member) {}
  void run() override { (mObject->*mMember)(); }

 private:
  T* mObject;
  F mMember;
};

// Calls a member with one argument, held by value; a result is ignored.
template <typename T, typename F, typename A>
class Member1 final : public ITask {
 public:
  Member1(T* object, F member, A argument) : mObject(object), mMember(member), mArgument(argument) {}
  void run() override { (void)(mObject->*mMember)(mArgument); }

 private:
  T* mObject;
  F mMember;
  A mArgument;
};

// Calls a member with two arguments, held by value.
template <typename T, typename F, typename A, typename B>
class Member2 final : public ITask {
 public:
  Member2(T* object, F member, A first, B second)
      : mObject(object), mMember(member), mFirst(first), mSecond(second) {}
  void run() override { (mObject->*mMember)(mFirst, mSecond); }

 private:
  T* mObject;
  F mMember;
  A mFirst;
  B mSecond;
};

// Deletes an object.
template <typename T>
class Delete final : public ITask {
 public:
  explicit Delete(T* object) : mObject(object) {}
  void run() override { delete mObject; }

 private:
  T* mObject;
};

}  // namespace WorkerTask

// Hands a task to the render thread's queue; one that the queue refuses is destroyed at once. Returns true if
// the queue took it. Without a queue, or without a task because memory ran out, nothing is posted.
inline bool postTask(IGLMsgQueue* queue, ITask* task) {
  if (task == nullptr) return false;
  task->mNext = nullptr;
  if (queue != nullptr && queue->Post(task)) return true;
  delete task;
  return false;
}

// Has `object->member(...)` called on the render thread. The task's type names the class of the member
// pointer.
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

// Has an object deleted on the render thread. If it returns false, the object is still the caller's.
template <typename T>
bool postDelete(IGLMsgQueue* queue, T* object) {
  return postTask(queue, new (std::nothrow) WorkerTask::Delete<T>(object));
}

// Either thread. Null without a manager.
inline IGLMsgQueue* queueOf(PenGLDataManager* manager) {
  return manager != nullptr ? manager->GetMsgQueue() : nullptr;
}

// What main-thread drawables tell their render drawables. Main thread; without a queue nothing is told.

// The point that a stroke's grain is fixed to, stroke units.
template <typename RenderDrawable>
void postStartPoint(IGLMsgQueue* queue, RenderDrawable* drawable, PointF at) {
  // The member may be inherited, but the task's type names the drawable's own class.
  void (RenderDrawable::*const member)(float, float) = &RenderDrawable::SetStartPoint;
  post(queue, drawable, member, at.x, at.y);
}

inline void postPenData(IGLMsgQueue* queue, PenDrawableRT* drawable, float size, std::uint32_t argb) {
  post(queue, drawable, &PenDrawableRT::SetPenData, size, static_cast<int>(argb));
}

// A whole stroke is about to be drawn again.
inline void postRedrawState(IGLMsgQueue* queue, PenDrawableRT* drawable) {
  post(queue, drawable, &PenDrawableRT::SetRedrawState, true);
}

// The call's rectangle, grown to whole stroke units.
inline void postRect(IGLMsgQueue* queue, PenDrawableRT* drawable, RectF rect) {
  rect.ExtendRect();
  post(queue, drawable, &PenDrawableRT::SetRect, rect);
}

}  // namespace Qelt
