#include "desktop/gl/RenderQueue.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdlib>
#include <exception>
#include <future>
#include <new>
#include <utility>
#include <vector>

#include "desktop/base/Log.h"
#include "desktop/gl/GlDevice.h"
#include "desktop/gl/GlVertexObject.h"
#include "desktop/gl/WorkInFlight.h"
#include "gl/ITask.h"

namespace Qelt {

IGLMsgQueue::~IGLMsgQueue() = default;
ITask::~ITask() = default;

bool ITask::isGlobalLockAllowed() {
  return true;
}

}  // namespace Qelt

namespace QeltDesktop {

namespace {

// Every render queue there is. Never destroyed: a queue may live as long as the process.
struct LiveQueues {
  std::mutex mutex;
  std::vector<RenderQueue*> queues;
};
LiveQueues& liveQueues() {
  static LiveQueues* const all = new LiveQueues;
  return *all;
}

// False when the task threw. Takes no memory: its end may be what the task ran into.
bool runAndDelete(Qelt::ITask* task) noexcept {
  bool ran = false;
  try {
    task->run();
    ran = true;
  } catch (const std::exception& error) {
    logError("a render task threw and was dropped", error.what());
  } catch (...) {
    logError("a render task threw and was dropped");
  }
  delete task;
  return ran;
}

// A call may have used GL in its own way.
void noteForeignUse() {
  if (GlDevice* const device = GlDevice::live(); device != nullptr) device->state().forget();
}

// A call that somebody waits for. It lies in the memory of whoever waits, so that it can be posted when there
// is no other memory left.
class WaitedCall final : public Qelt::ITask {
 public:
  WaitedCall(const std::function<void()>& call, std::exception_ptr& thrown) : mCall(call), mThrown(thrown) {}
  void run() override {
    try {
      mCall();
    } catch (...) {
      mThrown = std::current_exception();
    }
    noteForeignUse();
  }

  static void* operator new(std::size_t, void* place) noexcept { return place; }
  // The queue deletes what it has run; the place is not the heap's.
  static void operator delete(void*) noexcept {}
  static void operator delete(void*, void*) noexcept {}

 private:
  const std::function<void()>& mCall;
  std::exception_ptr& mThrown;
};

// In `Caller` mode the context is current only while tasks run, so that several queues share a thread.
class CurrentDevice {
 public:
  explicit CurrentDevice(GlDevice* device) : mDevice(device), mOuter(GlDevice::current()) {
    if (mDevice != nullptr) mDevice->makeCurrent();
  }
  ~CurrentDevice() {
    if (mDevice == nullptr) return;
    mDevice->clearCurrent();
    if (mOuter != nullptr) mOuter->makeCurrent();
  }
  CurrentDevice(const CurrentDevice&) = delete;
  CurrentDevice& operator=(const CurrentDevice&) = delete;

 private:
  GlDevice* mDevice;
  GlDevice* mOuter;
};

}  // namespace

RenderQueue::RenderQueue(Mode mode, GL gl, const Surface& surface)
    : mMode(mode), mRunner(std::this_thread::get_id()) {
  if (mMode == Mode::Caller) {
    const CurrentDevice outer(GlDevice::current());
    openDevice(gl, surface);
    if (mDevice != nullptr) mDevice->clearCurrent();
    return;
  }
  std::promise<void> opened;
  std::future<void> ready = opened.get_future();
  mThread = std::thread([this, gl, &surface, opened = std::move(opened)]() mutable {
    try {
      openDevice(gl, surface);
      mInFlight = std::make_unique<WorkInFlight>();
      const std::lock_guard guard(mMutex);
      mRunner = std::this_thread::get_id();
    } catch (...) {
      mDevice.reset();
      opened.set_exception(std::current_exception());
      return;
    }
    opened.set_value();
    threadMain();
  });
  try {
    ready.get();
  } catch (...) {
    mThread.join();
    throw;
  }
}

RenderQueue::Registration::Registration(RenderQueue* queue) : mQueue(queue) {
  const std::lock_guard guard(liveQueues().mutex);
  liveQueues().queues.push_back(queue);
}

RenderQueue::Registration::~Registration() {
  const std::lock_guard guard(liveQueues().mutex);
  std::erase(liveQueues().queues, mQueue);
}

RenderQueue* RenderQueue::ifAlive(const Qelt::IGLMsgQueue* queue) {
  const std::lock_guard guard(liveQueues().mutex);
  for (RenderQueue* const live : liveQueues().queues) {
    if (static_cast<const Qelt::IGLMsgQueue*>(live) == queue) return live;
  }
  return nullptr;
}

RenderQueue::~RenderQueue() {
  bool inside = false;
  {
    const std::lock_guard guard(mMutex);
    inside = isInsideTask();
  }
  if (inside) {
    logError("a render queue was destroyed by one of its own tasks");
    std::abort();
  }
  shutDown();
}

void RenderQueue::openDevice(GL gl, const Surface& surface) {
  mRendererName = "none";
  if (gl == GL::None) return;
  mDevice = std::make_unique<GlDevice>(surface);
  mRendererName = mDevice->description();
}

bool RenderQueue::Post(Qelt::ITask* task) {
  if (task == nullptr) return true;
  if (accept && !accept(*task)) return false;
  return enqueue(task, false) != kRefused;
}

std::uint64_t RenderQueue::enqueue(Qelt::ITask* task, bool internal) {
  const std::lock_guard guard(mMutex);
  if (mClosed) return kRefused;
  // Told under the lock: once it is in the queue the task may be gone any moment.
  if (!internal && onAccepted) onAccepted(*task);
  task->mNext = nullptr;
  (mLast != nullptr ? mLast->mNext : mFirst) = task;
  mLast = task;
  // Woken under the lock: once that is free the queue itself may be gone.
  if (mThreadWaits) mWork.notify_one();
  mThreadWaits = false;
  return ++mPosted;
}

void RenderQueue::threadMain() {
  std::unique_lock lock(mMutex);
  for (;;) {
    if (mFirst != nullptr) {
      runNext(lock);
      continue;
    }
    if (mClosed) break;
    mThreadWaits = true;
    mWork.wait(lock, [this] { return mFirst != nullptr || mClosed; });
    mThreadWaits = false;
  }
  lock.unlock();
  mInFlight.reset();
  mDevice.reset();
  lock.lock();
  // The system gives the number of a thread that has ended to another.
  mRunner = {};
}

void RenderQueue::runNext(std::unique_lock<std::mutex>& lock) {
  Qelt::ITask* const task = mFirst;
  mFirst = task->mNext;
  if (mFirst == nullptr) mLast = nullptr;
  mTaskRuns = true;
  lock.unlock();
  const bool ran = runAndDelete(task);
  GlVertexObject::dropLargeBatches();
  if (mInFlight != nullptr) mInFlight->taskEnded();
  lock.lock();
  mTaskRuns = false;
  if (!ran) ++mDropped;
  if (++mRan < mWakeAt) return;
  mWakeAt = kNobodyWaits;
  mProgress.notify_all();
}

bool RenderQueue::isRunner() const {
  return std::this_thread::get_id() == mRunner;
}

bool RenderQueue::canWait() const {
  return mMode == Mode::Thread || isRunner();
}

GlDevice* RenderQueue::callersDevice() const {
  return mMode == Mode::Caller ? mDevice.get() : nullptr;
}

bool RenderQueue::isInsideTask() const {
  return isRunner() && (mMode == Mode::Thread || mTaskRuns);
}

void RenderQueue::waitFor(std::unique_lock<std::mutex>& lock, std::uint64_t last) {
  while (mRan < last) {
    if (mMode == Mode::Caller) {
      runNext(lock);
    } else {
      // Those who wait for more look again and wait on.
      mWakeAt = std::min(mWakeAt, last);
      mProgress.wait(lock);
    }
  }
}

bool RenderQueue::finish() {
  std::unique_lock lock(mMutex);
  if (isInsideTask()) return mFirst == nullptr;
  if (mRan == mPosted) return true;
  if (!canWait()) return false;
  const CurrentDevice current(callersDevice());
  waitFor(lock, mPosted);
  return true;
}

void RenderQueue::runPending() {
  if (mMode == Mode::Caller) finish();
}

bool RenderQueue::run(const std::function<void()>& call) {
  bool inside = false;
  {
    const std::lock_guard guard(mMutex);
    inside = isInsideTask();
    if (!canWait()) return false;
  }
  if (inside) {
    call();
    noteForeignUse();
    return true;
  }
  // Before the call is in the queue: it may throw, and the call goes with this frame.
  const CurrentDevice current(callersDevice());
  std::exception_ptr thrown;
  alignas(WaitedCall) std::array<std::byte, sizeof(WaitedCall)> place;
  auto* const task = new (place.data()) WaitedCall(call, thrown);
  const std::uint64_t number = enqueue(task, true);
  if (number == kRefused) {
    delete task;
    return false;
  }
  {
    std::unique_lock lock(mMutex);
    waitFor(lock, number);
  }
  if (thrown) std::rethrow_exception(thrown);
  return true;
}

void RenderQueue::shutDown() {
  {
    const std::lock_guard guard(mMutex);
    mClosed = true;
    mWork.notify_one();
    if (isInsideTask()) return;
  }
  if (mMode == Mode::Thread) {
    if (mThread.joinable()) mThread.join();
    return;
  }
  finish();
  if (mDevice == nullptr || GlDevice::current() == mDevice.get()) return;
  const CurrentDevice outer(GlDevice::current());
  mDevice->makeCurrent();
  mDevice.reset();
}

void RenderQueue::loseContext() {
  run([this] {
    if (mDevice != nullptr) mDevice->lose();
  });
}

void RenderQueue::restoreContext() {
  run([this] {
    if (mDevice != nullptr) mDevice->restore();
  });
}

std::uint64_t RenderQueue::droppedTasks() {
  const std::lock_guard guard(mMutex);
  return mDropped;
}

std::string RenderQueue::rendererName() const {
  return mRendererName;
}

}  // namespace QeltDesktop
