#include "desktop/pencommon/BatchObserver.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenPredictionDrawableRT.h"

namespace Qelt {

IPenPredictionDrawableGL::IPenPredictionDrawableGL(PenGLDataManager* manager) : PenDrawableGL(manager) {}

IPenPredictionDrawableGL::~IPenPredictionDrawableGL() = default;

PenPredictionDrawableGL::PenPredictionDrawableGL(PenGLDataManager* manager)
    : IPenPredictionDrawableGL(manager) {}

PenPredictionDrawableGL::~PenPredictionDrawableGL() = default;

PenPredictionDrawableRT::PenPredictionDrawableRT(PenGLDataManager* manager) : PenDrawableRT(manager) {}

PenPredictionDrawableRT::~PenPredictionDrawableRT() = default;

void PenPredictionDrawableRT::SetBuffer(std::vector<float>* buffer) {
  if (buffer == nullptr) QeltDesktop::countWritten({mWriteBuffer});
  mWriteBuffer = buffer;
}

void PenPredictionDrawableRT::SendDataToGPU(std::vector<float>* buffer) {
  mRenderBuffer = buffer;
  mHasPendingData = true;
  QeltDesktop::observeBatch(this, false, {buffer});
}

void PenPredictionDrawableRT::SetOpacity(float opacity) {
  mOpacity = opacity;
}

float PenPredictionDrawableRT::GetOpacity() const {
  return mOpacity;
}

}  // namespace Qelt
