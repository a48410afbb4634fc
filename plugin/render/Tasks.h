#pragma once

#include "gl/ITask.h"

// Work for the render thread. No task owns or counts its object: the object must outlive the task. All
// destructors are trivial, so that a refused task takes nothing with it.
namespace Qelt::WorkerTask {

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

}  // namespace Qelt::WorkerTask
