#include "pencommon/PenDrawableRT.h"

namespace Qelt {

namespace {

float channel(int argb, int shift) {
  return static_cast<float>((static_cast<unsigned int>(argb) >> shift) & 0xFFu) / 255.0f;
}

}  // namespace

PenDrawableRT::PenDrawableRT(PenGLDataManager* manager) : mDataManager(manager) {}

PenDrawableRT::~PenDrawableRT() = default;

void PenDrawableRT::OnRelease() {
  ReleaseGLObject();
}

void PenDrawableRT::OnRestore() {
  RestoreGLObject();
}

void PenDrawableRT::ReleaseGLObject() {}

void PenDrawableRT::RestoreGLObject() {}

void PenDrawableRT::Init() {}

void PenDrawableRT::Release() {}

void PenDrawableRT::AddPoint(Vector2<float>, float) {}

void PenDrawableRT::CreatePenCanvas(int, int, IGLMsgQueue*) {}

void PenDrawableRT::ClearPenCanvas() {}

void PenDrawableRT::Clear() {
  mHasPendingData = false;
}

void PenDrawableRT::Update(bool) {}

void PenDrawableRT::Draw(ISPSubBitmap*, Matrix4<float>&) {}

IDepthMapBitmapSettable* PenDrawableRT::GetDepthMapBitmapSettable() {
  return nullptr;
}

IReferenceBitmapSettable* PenDrawableRT::GetReferenceBitmapSettable() {
  return nullptr;
}

void PenDrawableRT::SetPenData(float size, int argb) {
  mPenSize = size;
  mPenColor = {channel(argb, 16), channel(argb, 8), channel(argb, 0), channel(argb, 24)};
}

void PenDrawableRT::SetRedrawState(bool redrawing) {
  mRedrawState = redrawing;
}

void PenDrawableRT::SetRect(RectF rect) {
  mRect = rect;
}

}  // namespace Qelt
