#include "desktop/pencommon/BatchObserver.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "pencommon/PenStrokeDrawableRT.h"

namespace Qelt {

PenStrokeDrawableGL::PenStrokeDrawableGL(PenGLDataManager* manager) : PenDrawableGL(manager) {}

PenStrokeDrawableGL::~PenStrokeDrawableGL() = default;

PenStrokeDrawableRT::PenStrokeDrawableRT(PenGLDataManager* manager) : PenDrawableRT(manager) {}

PenStrokeDrawableRT::~PenStrokeDrawableRT() = default;

void PenStrokeDrawableRT::SetBuffer(std::vector<float>* buffer) {
  if (buffer == nullptr) QeltDesktop::countWritten({mWriteBuffer});
  mWriteBuffer = buffer;
}

void PenStrokeDrawableRT::SendDataToGPU(std::vector<float>* buffer) {
  mRenderBuffer = buffer;
  mHasPendingData = true;
  QeltDesktop::observeBatch(this, false, {buffer});
}

void PenStrokeDrawableRT::SetCacheBuffer(std::vector<float>* buffer) {
  mCacheBuffer = buffer;
  mHasPendingData = true;
  QeltDesktop::observeBatch(this, true, {buffer});
}

}  // namespace Qelt
