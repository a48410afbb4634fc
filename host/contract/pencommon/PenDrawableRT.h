#pragma once

#include <vector>

#include "base/HostApi.h"
#include "base/Matrix.h"
#include "base/RectF.h"
#include "base/Vector.h"
#include "gl/ManagedObject.h"

namespace Qelt {

class IGLMsgQueue;
class ISPBitmap;
class ISPSubBitmap;
class PenGLDataManager;

// Takes a bitmap that a drawable may look up. The pencil has no use for one.
class QELT_HOST_API IReferenceBitmapSettable {
 public:
  virtual void SetReferenceBitmap(ISPBitmap* bitmap) = 0;

 protected:
  virtual ~IReferenceBitmapSettable();
};

class QELT_HOST_API IDepthMapBitmapSettable {
 public:
  virtual void SetDepthMapBitmap(ISPBitmap* bitmap) = 0;

 protected:
  virtual ~IDepthMapBitmapSettable();
};

// The base of every render drawable. Everything runs on the render thread but what is marked. Slots:
// ManagedObject's, then as declared.
class QELT_HOST_API PenDrawableRT : public ManagedObject {
 public:
  explicit PenDrawableRT(PenGLDataManager* manager);  // main thread; borrowed
  ~PenDrawableRT() override;
  PenDrawableRT(const PenDrawableRT&) = delete;
  PenDrawableRT& operator=(const PenDrawableRT&) = delete;

  void OnRelease() override;  // calls ReleaseGLObject
  void OnRestore() override;  // calls RestoreGLObject
  virtual void ReleaseGLObject();
  virtual void RestoreGLObject();
  virtual void Init();
  virtual void Release();
  virtual void AddPoint(Vector2<float> point, float size);
  virtual void CreatePenCanvas(int width, int height, IGLMsgQueue* queue);
  virtual void ClearPenCanvas();
  virtual void Clear();
  virtual void Update(bool useCacheBuffer);
  virtual void Draw(ISPSubBitmap* tile, Matrix4<float>& matrix);
  virtual IDepthMapBitmapSettable* GetDepthMapBitmapSettable();
  virtual IReferenceBitmapSettable* GetReferenceBitmapSettable();

  void SetPenData(float size, int argb);
  void SetRedrawState(bool redrawing);
  // The call's rectangle, in whole stroke units.
  void SetRect(RectF rect);

 protected:
  PenGLDataManager* mDataManager;
  float mPenSize = 0.0f;
  Vector4<float> mPenColor;  // r, g, b, a, each 0 to 1
  RectF mRect;
  bool mRedrawState = false;
  bool mHasPendingData = false;  // a batch arrived and is not cleared yet
};

}  // namespace Qelt
