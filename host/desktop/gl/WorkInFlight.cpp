#include "desktop/gl/WorkInFlight.h"

#include "desktop/gl/GlVertexObject.h"

namespace QeltDesktop {

void WorkInFlight::taskEnded() {
  mBytes += GlVertexObject::takeUploadedBytes();
  if (mBytes < kMostBytes) return;
  mBytes = 0;
  mPoints[mOldest].wait();
  mPoints[mOldest].set();
  mOldest = 1 - mOldest;
}

}  // namespace QeltDesktop
