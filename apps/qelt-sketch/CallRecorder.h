#pragma once

#include <cstddef>
#include <functional>
#include <map>
#include <string>
#include <typeindex>
#include <vector>

#include "OutputFile.h"
#include "PagePlayer.h"
#include "QueueWatch.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/pencommon/BatchObserver.h"

namespace QeltDesktop {

// Floats a vertex in the batches of a drawable.
int floatsPerVertex(DrawableKind drawable, int renderingVersion);

// A type's name for people: demangled, without the namespaces in front of it.
std::string readableTypeName(const char* mangled);

// Writes one line of JSON for each call of one kind of drawable: what it answered, the rectangle it left, the
// batches that reached the render drawable because of it, and the tasks that it posted. All on one thread:
// the queue is of mode Caller, and has not been posted to yet.
class CallRecorder : public PlayObserver {
 public:
  // Queue and file outlive it.
  CallRecorder(RenderQueue& queue, OutputFile& file, DrawableKind wanted, int renderingVersion);
  ~CallRecorder() override;
  CallRecorder(const CallRecorder&) = delete;
  CallRecorder& operator=(const CallRecorder&) = delete;

  // Throws std::runtime_error when a task of the call fails, as its batches are then missing.
  void call(const DrawableCall& call, const std::function<bool(Qelt::RectF*)>& make) override;

 private:
  void writeLine(const DrawableCall& call, bool result, const Qelt::RectF& rect);
  const std::string& typeNameOf(const Qelt::ITask& task);

  RenderQueue& mQueue;
  QueueWatch mWatch;
  OutputFile& mFile;
  DrawableKind mWanted;
  int mStride;
  bool mInCall = false;
  std::vector<Batch> mBatches;
  std::vector<const std::string*> mPosted;
  std::map<std::type_index, std::string> mTypeNames;
};

}  // namespace QeltDesktop
