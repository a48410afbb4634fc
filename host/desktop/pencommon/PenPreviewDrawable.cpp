#include "desktop/pencommon/BatchObserver.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenPreviewDrawableRT.h"

namespace Qelt {

PenPreviewDrawableGL::PenPreviewDrawableGL(PenGLDataManager* manager) : PenDrawableGL(manager) {}

PenPreviewDrawableGL::~PenPreviewDrawableGL() = default;

PenPreviewDrawableRT::PenPreviewDrawableRT(PenGLDataManager* manager) : PenDrawableRT(manager) {}

PenPreviewDrawableRT::~PenPreviewDrawableRT() = default;

void PenPreviewDrawableRT::SetBuffer(std::vector<float>* buffer) {
  if (buffer == nullptr) QeltDesktop::countWritten({mWriteBuffer});
  mWriteBuffer = buffer;
}

void PenPreviewDrawableRT::SendDataToGPU(std::vector<float>* buffer) {
  mRenderBuffer = buffer;
  mHasPendingData = true;
  QeltDesktop::observeBatch(this, false, {buffer});
}

}  // namespace Qelt
