#pragma once

#include <memory>

#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/pencommon/PenDataManager.h"
#include "pencommon/Pen.h"

namespace QeltBench {

// A pen with everything a host gives it but GL: tasks queue up until `drain`. `version`: rendering version;
// `size`: stroke units.
class BenchPen {
 public:
  BenchPen(int version, float size);

  Qelt::Pen& pen() { return *mPen; }
  QeltDesktop::PenCanvas& canvas() { return mCanvas; }
  // Runs what was posted, as the render thread would.
  void drain() { mQueue.runPending(); }

 private:
  QeltDesktop::RenderQueue mQueue;
  QeltDesktop::PenDataManager mManager;
  QeltDesktop::PenCanvas mCanvas;
  std::unique_ptr<Qelt::Pen> mPen;
};

}  // namespace QeltBench
