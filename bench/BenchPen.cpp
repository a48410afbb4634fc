#include "BenchPen.h"

#include "pen/Pencil2.h"

namespace QeltBench {

BenchPen::BenchPen(int version, float size)
    : mQueue(QeltDesktop::RenderQueue::Mode::Caller, QeltDesktop::RenderQueue::GL::None),
      mManager(&mQueue),
      mCanvas(&mQueue, nullptr),
      mPen(createPenInst()) {
  mPen->setPenDataManager(&mManager);
  mPen->setVersion(version);
  mPen->SetSize(size);
  mPen->SetScreenResolution(1440, 2960);
}

}  // namespace QeltBench
