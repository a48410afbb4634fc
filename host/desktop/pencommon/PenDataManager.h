#pragma once

#include <atomic>

#include "base/HostApi.h"
#include "pencommon/PenGLDataManager.h"

namespace QeltDesktop {

// What the desktop's pens share: the queue to the render thread, and a count of the pens that were deleted.
class QELT_HOST_API PenDataManager : public Qelt::PenGLDataManager {
 public:
  // Borrowed; may be null.
  explicit PenDataManager(Qelt::IGLMsgQueue* queue);
  ~PenDataManager() override;

  Qelt::IGLMsgQueue* GetMsgQueue() override;
  // The desktop keeps nothing for a type of pens, so there is never anything to drop.
  bool ReleasePenData(Qelt::String* penName) override;

  // Calls of `ReleasePenData` so far. Any thread.
  int releaseCount() const;

 private:
  Qelt::IGLMsgQueue* mQueue;
  std::atomic<int> mReleases{0};
};

}  // namespace QeltDesktop
