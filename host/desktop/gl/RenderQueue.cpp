#include "desktop/gl/RenderQueue.h"

#include <exception>
#include <future>
#include <utility>

#include "desktop/base/Log.h"
#include "desktop/gl/CallTask.h"
#include "desktop/gl/GlDevice.h"
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

void runAndDelete(Qelt::ITask* task) noexcept {
  try {
    task->run();
  } catch (const std::exception& error) {
    logError(std::string("a render task threw and was dropped: ") + error.what());
  } catch (...) {
    logError("a render task threw and was dropped");
  }
  delete task;
}

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

RenderQueue::RenderQueue(Mode mode, GL gl) : mMode(mode), mRunner(std::this_thread::get_id()) {
  if (mMode == Mode::Caller) {
    const CurrentDevice outer(GlDevice::current());
    openDevice(gl);
    if (mDevice != nullptr) mDevice->clearCurrent();
    return;
  }
  std::promise<void> opened;
  std::future<void> ready = opened.get_future();
  mThread = std::thread([this, gl, opened = std::move(opened)]() mutable {
    try {
      openDevice(gl);
      mRunner = std::this_thread::get_id();
    } catch (...) {
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

RenderQueue::~RenderQueue() {
  shutDown();
}

void RenderQueue::openDevice(GL gl) {
  mRendererName = "none";
  if (gl == GL::None) return;
  mDevice = std::make_unique<GlDevice>();
  mRendererName = mDevice->description();
}

bool RenderQueue::Post(Qelt::ITask* task) {
  if (task == nullptr) return true;
  if (accept && !accept(*task)) return false;
  return enqueue(task, false);
}

bool RenderQueue::enqueue(Qelt::ITask* task, bool internal) {
  bool wake = false;
  {
    const std::lock_guard guard(mMutex);
    if (mClosed) return false;
    // Told under the lock: once it is in the queue the task may be gone any moment.
    if (!internal && onAccepted) onAccepted(*task);
    task->mNext = nullptr;
    (mLast != nullptr ? mLast->mNext : mFirst) = task;
    mLast = task;
    ++mPosted;
    wake = mThreadWaits;
    mThreadWaits = false;
  }
  if (wake) mWork.notify_one();
  return true;
}

void RenderQueue::threadMain() {
  std::unique_lock lock(mMutex);
  for (;;) {
    if (mFirst != nullptr) {
      runBatch(lock);
      continue;
    }
    if (mClosed) break;
    mThreadWaits = true;
    mWork.wait(lock, [this] { return mFirst != nullptr || mClosed; });
    mThreadWaits = false;
  }
  lock.unlock();
  mDevice.reset();
}

void RenderQueue::runBatch(std::unique_lock<std::mutex>& lock) {
  Qelt::ITask* task = mFirst;
  mFirst = mLast = nullptr;
  mBatchRuns = true;
  lock.unlock();
  std::uint64_t count = 0;
  while (task != nullptr) {
    Qelt::ITask* const next = task->mNext;
    runAndDelete(task);
    ++count;
    task = next;
  }
  lock.lock();
  mBatchRuns = false;
  mRan += count;
  mProgress.notify_all();
}

bool RenderQueue::isRunner() const {
  return std::this_thread::get_id() == mRunner;
}

void RenderQueue::waitFor(std::uint64_t sequence) {
  std::unique_lock lock(mMutex);
  if (mMode == Mode::Thread) {
    if (!isRunner()) mProgress.wait(lock, [&] { return mRan >= sequence; });
    return;
  }
  if (!isRunner() || mBatchRuns) return;
  const CurrentDevice current(mDevice.get());
  while (mRan < sequence) runBatch(lock);
}

void RenderQueue::finish() {
  std::uint64_t sequence = 0;
  {
    const std::lock_guard guard(mMutex);
    sequence = mPosted;
  }
  waitFor(sequence);
}

void RenderQueue::runPending() {
  if (mMode == Mode::Caller) finish();
}

bool RenderQueue::run(const std::function<void()>& call) {
  bool inside = false;
  {
    const std::lock_guard guard(mMutex);
    inside = isRunner() && (mMode == Mode::Thread || mBatchRuns);
  }
  if (inside) {
    call();
    return true;
  }
  std::exception_ptr thrown;
  auto guarded = [&call, &thrown] {
    try {
      call();
    } catch (...) {
      thrown = std::current_exception();
    }
  };
  auto* const task = new CallTask<decltype(guarded)>(guarded);
  if (!enqueue(task, true)) {
    delete task;
    return false;
  }
  finish();
  if (thrown) std::rethrow_exception(thrown);
  return true;
}

void RenderQueue::shutDown() {
  {
    const std::lock_guard guard(mMutex);
    mClosed = true;
  }
  mWork.notify_one();
  if (mMode == Mode::Thread) {
    if (mThread.joinable() && !isRunner()) mThread.join();
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

std::string RenderQueue::rendererName() const {
  return mRendererName;
}

}  // namespace QeltDesktop
