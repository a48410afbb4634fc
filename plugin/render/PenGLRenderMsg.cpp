#include "render/PenGLRenderMsg.h"

#include "graphics/ISPBitmap.h"
#include "graphics/ISPPenCanvas.h"
#include "math/Matrix3.h"
#include "pencommon/PenDrawableRT.h"
#include "render/ScopeExit.h"

namespace Qelt {
namespace {

// Turns a transform of the plane into one of space that leaves z as it is.
Matrix4<float> embed(const Matrix3<float>& m) {
  Matrix4<float> embedded;
  embedded[0] = m[0];
  embedded[1] = m[1];
  embedded[3] = m[2];
  embedded[4] = m[3];
  embedded[5] = m[4];
  embedded[7] = m[5];
  embedded[12] = m[6];
  embedded[13] = m[7];
  embedded[15] = m[8];
  return embedded;
}

RectF tileRect(const ISPSubBitmap& tile) {
  RectF rect;
  rect.Set(static_cast<float>(tile.GetX()), static_cast<float>(tile.GetY()),
           static_cast<float>(tile.GetX() + tile.GetWidth()),
           static_cast<float>(tile.GetY() + tile.GetHeight()));
  return rect;
}

}  // namespace

PenGLRenderMsg::PenGLRenderMsg(PenDrawableRT* drawable, ISPPenCanvas* canvas, const RectF& rect,
                               bool useCacheBuffer)
    : mDrawable(drawable), mCanvas(canvas), mRect(rect), mUseCacheBuffer(useCacheBuffer) {
  if (canvas != nullptr) mMatrix = embed(canvas->GetMatrix());
}

RectF PenGLRenderMsg::getTransformedRect() const {
  const auto mapX = [this](float x, float y) { return mMatrix[0] * x + mMatrix[4] * y + mMatrix[12]; };
  const auto mapY = [this](float x, float y) { return mMatrix[1] * x + mMatrix[5] * y + mMatrix[13]; };
  const float x = mapX(mRect.left, mRect.top);
  const float y = mapY(mRect.left, mRect.top);
  RectF box;
  box.Set(x, y, x, y);
  box.MakeRect(mapX(mRect.left, mRect.bottom), mapY(mRect.left, mRect.bottom));
  box.MakeRect(mapX(mRect.right, mRect.top), mapY(mRect.right, mRect.top));
  box.MakeRect(mapX(mRect.right, mRect.bottom), mapY(mRect.right, mRect.bottom));
  return box;
}

void PenGLRenderMsg::run() {
  if (mDrawable == nullptr || mCanvas == nullptr) return;
  // The task after this message deletes the batch, drawn or not: the render drawable must not refer to it
  // when the message ends.
  const ScopeExit forgetBatch([this] { mDrawable->Clear(); });
  ISPLayer* layer = mCanvas->GetLayer();
  if (layer == nullptr) return;
  ISPBitmap* bitmap = layer->GetBitmap();
  if (bitmap == nullptr) return;

  mDrawable->Update(mUseCacheBuffer);
  const RectF dirty = getTransformedRect();
  const int tiles = bitmap->GetTileCount();
  for (int i = 0; i < tiles; ++i) {
    mCanvas->BeginTile(i);
    const ScopeExit endTile([this, i] { mCanvas->EndTile(i); });
    ISPSubBitmap* tile = bitmap->GetSubBitmap(i);
    if (tile != nullptr && tileRect(*tile).IsIntersect(dirty)) {
      IReferenceBitmapSettable* reference = mDrawable->GetReferenceBitmapSettable();
      if (reference != nullptr && mReferenceBitmap != nullptr)
        reference->SetReferenceBitmap(mReferenceBitmap);
      IDepthMapBitmapSettable* depthMap = mDrawable->GetDepthMapBitmapSettable();
      if (depthMap != nullptr && mDepthMapBitmap != nullptr) depthMap->SetDepthMapBitmap(mDepthMapBitmap);
      mDrawable->Draw(tile, mMatrix);
    }
  }
}

}  // namespace Qelt
