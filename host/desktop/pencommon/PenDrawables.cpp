#include "desktop/pencommon/BatchObserver.h"
#include "pencommon/IPenMorphable.h"
#include "pencommon/PenDrawableRT.h"
#include "pencommon/PenGLDataManager.h"
#include "pencommon/PenManager.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenOutlineDrawableRT.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenPredictionDrawableRT.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenPreviewDrawableRT.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "pencommon/PenStrokeDrawableRT.h"

namespace Qelt {

const char* const PenManager::QELT_PENCIL2_NAME = "QeltPencil2";

IPenMorphable::~IPenMorphable() = default;
IPenListRedrawable::~IPenListRedrawable() = default;
IReferenceBitmapSettable::~IReferenceBitmapSettable() = default;
IDepthMapBitmapSettable::~IDepthMapBitmapSettable() = default;
PenGLDataManager::~PenGLDataManager() = default;

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
