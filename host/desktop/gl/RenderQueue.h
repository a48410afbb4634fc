#pragma once

#include <condition_variable>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <thread>

#include "base/HostApi.h"
#include "gl/IGLMsgQueue.h"

namespace QeltDesktop {

class GlDevice;

// The render thread: a queue of tasks, the thread that runs them in posting order, and the GL context they
// draw with. A task runs once and is then deleted; what it throws is logged and goes no further. Posting
// allocates nothing.
//
// `Post` and `run` may be called from any thread; everything else by the thread that made the queue. In
// `Caller` mode there is no thread: tasks run on the thread that made the queue, inside `finish`,
// `runPending` and `run`, and so does the destructor's rest; no other thread may call those.
class QELT_HOST_API RenderQueue : public Qelt::IGLMsgQueue {
 public:
  enum class Mode { Thread, Caller };
  enum class GL { None, Context };

  // Throws std::runtime_error with one clear line when a context is wanted and there is none.
  RenderQueue(Mode mode, GL gl);
  // As `shutDown`. GL wrappers that are still there become inert.
  ~RenderQueue() override;
  RenderQueue(const RenderQueue&) = delete;
  RenderQueue& operator=(const RenderQueue&) = delete;

  bool Post(Qelt::ITask* task) override;

  // Waits until everything posted so far has run. Inside a task it returns at once.
  void finish();
  // `Caller` mode: runs everything posted so far; otherwise does nothing.
  void runPending();
  // Runs a call on the render thread after everything posted so far, and waits for it; inside a task it runs
  // at once. What the call throws is thrown here. False, and nothing ran, when the queue has been shut
  // down. Neither `accept` nor `onAccepted` sees it.
  bool run(const std::function<void()>& call);
  // Refuses posts from now on, runs what was posted, ends the thread and destroys the context.
  void shutDown();

  // Loses the GL context and makes another: managed objects hear of both, and the host's GL wrappers come
  // back: buffers with their data, programs with their bindings, layers and what a canvas drew into with
  // their pixels, other bitmaps zeroed. Each waits, and throws std::runtime_error when there is no context to
  // be had. Without GL they do nothing.
  void loseContext();
  void restoreContext();

  // Renderer and version of the context, for people; "none" without GL.
  std::string rendererName() const;

  // Called for every accepted task on the thread that posts it, before it can run. Must not throw or post.
  // Set both before the first post.
  std::function<void(const Qelt::ITask&)> onAccepted;
  // When set and answering false, a post is refused.
  std::function<bool(const Qelt::ITask&)> accept;

 private:
  bool enqueue(Qelt::ITask* task, bool internal);
  void threadMain();
  void openDevice(GL gl);
  // Takes all that is queued and runs it. Called with the lock held, which is let go meanwhile.
  void runBatch(std::unique_lock<std::mutex>& lock);
  bool isRunner() const;
  void waitFor(std::uint64_t sequence);

  const Mode mMode;
  mutable std::mutex mMutex;  // guards what follows, to the blank line
  std::condition_variable mWork;
  std::condition_variable mProgress;
  Qelt::ITask* mFirst = nullptr;
  Qelt::ITask* mLast = nullptr;
  std::uint64_t mPosted = 0;
  std::uint64_t mRan = 0;
  bool mClosed = false;
  bool mThreadWaits = false;
  bool mBatchRuns = false;

  std::thread::id mRunner;
  std::unique_ptr<GlDevice> mDevice;  // used by the runner alone
  std::string mRendererName;
  std::thread mThread;
};

}  // namespace QeltDesktop
