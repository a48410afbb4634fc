#pragma once

#include <cstddef>
#include <functional>
#include <map>
#include <string>
#include <typeindex>
#include <vector>

#include "desktop/gl/RenderQueue.h"
#include "desktop/pencommon/BatchObserver.h"
#include "output/OutputFile.h"
#include "output/Terminal.h"
#include "play/PagePlayer.h"

namespace QeltDesktop {

// Writes one line of JSON for each call of one kind of drawable: its result, the rectangle it left, the
// batches of vertices that reached the render drawable because of it, and the tasks that it posted. All on
// one thread: the queue is of mode Caller, and nothing has been posted to it yet.
class CallRecorder final : public PlayObserver {
 public:
  // Queue, file and progress, which counts the strokes, outlive it.
  CallRecorder(RenderQueue& queue, OutputFile& file, Progress& progress, DrawableKind wanted);
  ~CallRecorder() override;
  CallRecorder(const CallRecorder&) = delete;
  CallRecorder& operator=(const CallRecorder&) = delete;

  // Throws std::runtime_error when a task of the call fails, because its batches are then missing.
  void call(const DrawableCall& call, const std::function<bool(Qelt::RectF*)>& make) override;
  void strokeEnds() override { mProgress.step(); }

 private:
  void writeLine(const DrawableCall& call, bool result, const Qelt::RectF& rect);
  const std::string& typeNameOf(const Qelt::ITask& task);

  RenderQueue& mQueue;
  QueueWatch mWatch;
  OutputFile& mFile;
  Progress& mProgress;
  DrawableKind mWanted;
  bool mInCall = false;
  std::vector<Batch> mBatches;
  std::vector<const std::string*> mPosted;
  std::map<std::type_index, std::string> mTypeNames;
};

}  // namespace QeltDesktop
