#include "desktop/pencommon/PenDataManager.h"

namespace QeltDesktop {

PenDataManager::PenDataManager(Qelt::IGLMsgQueue* queue) : mQueue(queue) {}

PenDataManager::~PenDataManager() = default;

Qelt::IGLMsgQueue* PenDataManager::GetMsgQueue() {
  return mQueue;
}

bool PenDataManager::ReleasePenData(Qelt::String*) {
  ++mReleases;
  return false;
}

int PenDataManager::releaseCount() const {
  return mReleases;
}

}  // namespace QeltDesktop
