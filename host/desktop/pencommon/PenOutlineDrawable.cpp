#include "desktop/pencommon/BatchObserver.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenOutlineDrawableRT.h"

namespace Qelt {

PenOutlineDrawableGL::PenOutlineDrawableGL(PenGLDataManager* manager) : PenDrawableGL(manager) {}

PenOutlineDrawableGL::~PenOutlineDrawableGL() = default;

void PenOutlineDrawableGL::SetOutlineSize(float size) {
  mOutlineSize = size;
}

float PenOutlineDrawableGL::GetOutlineSize() {
  return mOutlineSize;
}

void PenOutlineDrawableGL::SetOutlineColor(int argb) {
  mOutlineColor = argb;
}

int PenOutlineDrawableGL::GetOutlineColor() {
  return mOutlineColor;
}

PenOutlineDrawableRT::PenOutlineDrawableRT(PenGLDataManager* manager) : PenDrawableRT(manager) {}

PenOutlineDrawableRT::~PenOutlineDrawableRT() = default;

void PenOutlineDrawableRT::SetOutlineSize(float size) {
  mOutlineSize = size;
}

float PenOutlineDrawableRT::GetOutlineSize() {
  return mOutlineSize;
}

void PenOutlineDrawableRT::SetOutlineColor(unsigned int argb) {
  mOutlineColor = argb;
}

unsigned int PenOutlineDrawableRT::GetOutlineColor() {
  return mOutlineColor;
}

void PenOutlineDrawableRT::SetBuffer(std::vector<float>* buffer) {
  SetBuffer(buffer, nullptr);
}

void PenOutlineDrawableRT::SendDataToGPU(std::vector<float>* buffer) {
  SendDataToGPU(buffer, nullptr);
}

void PenOutlineDrawableRT::SetBuffer(std::vector<float>* inner, std::vector<float>* outer) {
  if (inner == nullptr) QeltDesktop::countWritten({mInnerWriteBuffer, mOuterWriteBuffer});
  mInnerWriteBuffer = inner;
  mOuterWriteBuffer = outer;
}

void PenOutlineDrawableRT::SendDataToGPU(std::vector<float>* inner, std::vector<float>* outer) {
  mInnerRenderBuffer = inner;
  mOuterRenderBuffer = outer;
  mHasPendingData = true;
  QeltDesktop::observeBatch(this, false, {inner, outer});
}

}  // namespace Qelt
