#include "core/History.h"

#include <algorithm>
#include <utility>

namespace QeltDesktop {

Step& History::add(Step step) {
  mSteps.push_back(std::move(step));
  ++mDone;
  return mSteps.back();
}

void History::dropLast() {
  dropBackups(mSteps.back());
  mSteps.pop_back();
}

void History::addBackup(Step& step, PageBackup backup) {
  const std::size_t bytes = backup.bytes();
  try {
    step.backups.push_back(std::move(backup));
  } catch (...) {
    dropBackups(step);
    throw;
  }
  mBytes += bytes;
  // Looked for from the end: it is one of the newest.
  std::size_t index = mSteps.size() - 1;
  while (&mSteps[index] != &step) --index;
  mFirstBacked = std::min(mFirstBacked, index);
  while (mBytes > mMostBytes) dropBackups(mSteps[mFirstBacked++]);
}

void History::dropBackups(Step& step) {
  for (const PageBackup& backup : step.backups) mBytes -= backup.bytes();
  step.backups.clear();
  step.isBacked = false;
}

void History::dropAllBackups() {
  for (Step& step : mSteps) dropBackups(step);
  mFirstBacked = 0;
}

}  // namespace QeltDesktop
