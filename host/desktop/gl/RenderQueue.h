#pragma once

#include <condition_variable>
#include <cstdint>
#include <functional>
#include <limits>
#include <memory>
#include <mutex>
#include <string>
#include <thread>

#include "base/HostApi.h"
#include "desktop/platform/Platform.h"
#include "gl/IGLMsgQueue.h"

namespace QeltDesktop {

class GlDevice;
class WorkInFlight;

// The render thread: a queue of tasks, the thread that runs them in posting order, and the GL context they
// draw with. A task runs once and is then deleted; what it throws is logged and goes no further. Posting,
// waiting and `run` allocate nothing.
//
// `Post`, `run`, `finish`, `loseContext` and `restoreContext` may be called from any thread; `shutDown` and
// the destructor by the thread that made the queue.
//
// In `Caller` mode there is no thread: for hosts that have none, such as a browser's main loop. The thread
// that made the queue runs the tasks, whenever it calls `finish`, `runPending` or `run`, and at the latest
// when it ends the queue. Any other thread may post, and nothing more.
class QELT_HOST_API RenderQueue : public Qelt::IGLMsgQueue {
 public:
  enum class Mode { Thread, Caller };
  enum class GL { None, Context };

  // The surface is what the context can present to; by default none. Throws std::runtime_error with one clear
  // line when a context is wanted and there is none.
  RenderQueue(Mode mode, GL gl, const Surface& surface = {});
  // Does what `shutDown` does. GL wrappers that still exist do nothing from then on. No other thread may be
  // inside a call any more, except for a `Post` whose task has run. A task that destroys its own queue logs
  // one line and aborts the process.
  ~RenderQueue() override;
  RenderQueue(const RenderQueue&) = delete;
  RenderQueue& operator=(const RenderQueue&) = delete;

  // The queue itself where it is a render queue that has not been destroyed; else null. `queue` is compared
  // and never looked into.
  static RenderQueue* ifAlive(const Qelt::IGLMsgQueue* queue);

  bool Post(Qelt::ITask* task) override;

  // Waits until everything posted so far has run, and for nothing that is posted later. It cannot wait inside
  // a task, nor on a thread that may only post. Returns false when something that was posted before has not
  // run.
  bool finish();
  // `Caller` mode: runs everything posted so far; otherwise does nothing.
  void runPending();
  // Runs a call on the render thread after everything posted so far, and waits for it; inside a task it runs
  // at once. What the call throws is thrown here. Returns false, and runs nothing, when the queue has been
  // shut down, or when it is in `Caller` mode and the calling thread is not the one that made it. Neither
  // `accept` nor `onAccepted` sees it.
  bool run(const std::function<void()>& call);
  // Refuses posts from now on, runs what was posted, ends the thread and destroys the context. Inside a task
  // it only refuses posts.
  void shutDown();

  // The GL context is gone: the system took it away, or a test wants to see what happens then. Nothing is
  // read back from it. Managed objects hear OnRelease, and until the next context nothing is drawn. Waits.
  void loseContext();
  // Makes the next context. In it the host's own objects exist again: programs with their bindings, vertex
  // objects without vertices, bitmaps and layers transparent, except for what a canvas drew. Then managed
  // objects hear OnRestore, and upload their textures. Layers wait for their owners (`CanvasLayer`). Waits.
  // Throws std::runtime_error when there is no context to be had.
  void restoreContext();

  // How many tasks threw. Any thread.
  std::uint64_t droppedTasks();

  // Renderer and version of the context, for people; "none" without GL.
  std::string rendererName() const;

  // Called for every accepted task on the thread that posts it, before it can run. Must not throw or post.
  // Set both before the first post.
  std::function<void(const Qelt::ITask&)> onAccepted;
  // When it is set and returns false, a post is refused.
  std::function<bool(const Qelt::ITask&)> accept;

 private:
  static constexpr std::uint64_t kRefused = 0;
  static constexpr std::uint64_t kNobodyWaits = std::numeric_limits<std::uint64_t>::max();

  // The task's number, counted from 1.
  std::uint64_t enqueue(Qelt::ITask* task, bool internal);
  void threadMain();
  void openDevice(GL gl, const Surface& surface);

  // These are called with the lock held. The first two release it while they run a task or wait.
  void runNext(std::unique_lock<std::mutex>& lock);
  void waitFor(std::unique_lock<std::mutex>& lock, std::uint64_t last);
  bool isRunner() const;
  bool isInsideTask() const;
  // In `Caller` mode only the one thread runs tasks.
  bool canWait() const;
  // The device to be made current where tasks run on the caller's thread.
  GlDevice* callersDevice() const;

  const Mode mMode;
  std::mutex mMutex;  // guards the members from here to the blank line
  std::condition_variable mWork;
  std::condition_variable mProgress;
  Qelt::ITask* mFirst = nullptr;
  Qelt::ITask* mLast = nullptr;
  std::uint64_t mPosted = 0;
  std::uint64_t mRan = 0;
  std::uint64_t mDropped = 0;
  std::uint64_t mWakeAt = kNobodyWaits;  // the least count of run tasks that somebody waits for
  bool mClosed = false;
  bool mThreadWaits = false;
  bool mTaskRuns = false;
  std::thread::id mRunner;  // the thread that runs tasks; none once it has ended

  // Used by the runner alone; the latter in `Thread` mode alone.
  std::unique_ptr<GlDevice> mDevice;
  std::unique_ptr<WorkInFlight> mInFlight;
  std::string mRendererName;
  std::thread mThread;

  // Has the queue among those that `ifAlive` knows.
  class Registration {
   public:
    explicit Registration(RenderQueue* queue);
    ~Registration();
    Registration(const Registration&) = delete;
    Registration& operator=(const Registration&) = delete;

   private:
    RenderQueue* mQueue;
  };
  const Registration mRegistration{this};
};

}  // namespace QeltDesktop
