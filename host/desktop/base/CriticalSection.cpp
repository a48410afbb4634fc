#include "base/CriticalSection.h"

namespace Qelt {

CriticalSection::CriticalSection() = default;
CriticalSection::~CriticalSection() = default;

void CriticalSection::Enter() {
  mMutex.lock();
}

void CriticalSection::Leave() {
  mMutex.unlock();
}

AutoCriticalSection::AutoCriticalSection(CriticalSection* section) : mSection(section) {
  if (mSection != nullptr) mSection->Enter();
}

AutoCriticalSection::~AutoCriticalSection() {
  if (mSection != nullptr) mSection->Leave();
}

}  // namespace Qelt
