#pragma once

#include <cstddef>
#include <deque>
#include <vector>

#include "core/PageLayers.h"
#include "core/PageTypes.h"

namespace QeltDesktop {

// One step: strokes came to the page, or were hidden.
struct Step {
  bool isAddition = true;
  std::vector<StrokeId> strokes;
  // Exchanged in their order when the step is done again, in the other order when it is undone.
  std::vector<PageBackup> backups;
  // Whether the backups hold all that the step changes.
  bool isBacked = false;
};

// The steps of a page, done and undone, with a bound on their backups: the oldest steps lose theirs first.
// Main thread.
class History {
 public:
  explicit History(std::size_t mostBackupBytes) : mMostBytes(mostBackupBytes) {}

  // The next to undo, or to do again; null when there is none. Valid until a step is added or dropped.
  Step* toUndo() { return mDone > 0 ? &mSteps[mDone - 1] : nullptr; }
  Step* toRedo() { return mDone < mSteps.size() ? &mSteps[mDone] : nullptr; }
  bool canUndo() const { return mDone > 0; }
  bool canRedo() const { return mDone < mSteps.size(); }
  void undone() { --mDone; }
  void redone() { ++mDone; }
  // The newest step that is done; there is none to do again. Throws std::bad_alloc.
  Step& add(Step step);
  // The last of the steps to do again is dropped.
  void dropLast();
  const Step& last() const { return mSteps.back(); }
  // The step that was done `back` steps before the last; null where there is none.
  Step* doneBefore(std::size_t back) { return back < mDone ? &mSteps[mDone - 1 - back] : nullptr; }

  // Takes in a backup, and drops what is too much then: it may be this one, with the step's others. Throws
  // std::bad_alloc; the step is not backed then.
  void addBackup(Step& step, PageBackup backup);
  void dropBackups(Step& step);
  void dropAllBackups();
  std::size_t bytes() const { return mBytes; }

 private:
  const std::size_t mMostBytes;
  std::size_t mBytes = 0;
  std::deque<Step> mSteps;
  std::size_t mDone = 0;         // the first so many are done
  std::size_t mFirstBacked = 0;  // none before it has backups
};

}  // namespace QeltDesktop
