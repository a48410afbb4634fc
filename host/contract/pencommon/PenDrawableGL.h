#pragma once

#include "base/HostApi.h"

namespace Qelt {

class IDepthMapBitmapSettable;
class IGLMsgQueue;
class IReferenceBitmapSettable;
class ISPPenCanvas;
class PenDrawableRT;
class PenGLDataManager;

// The base of every drawable: its canvas and its render drawable. Main thread. Slots: destructor pair, then
// as declared. Chosen here: that the four kinds share one base with these fields.
class QELT_HOST_API PenDrawableGL {
 public:
  explicit PenDrawableGL(PenGLDataManager* manager);  // borrowed
  virtual ~PenDrawableGL();
  PenDrawableGL(const PenDrawableGL&) = delete;
  PenDrawableGL& operator=(const PenDrawableGL&) = delete;

  // The canvas to draw into, borrowed; null takes it away. Has the render drawable prepared on the render
  // thread.
  virtual void SetCanvas(ISPPenCanvas* canvas);
  virtual ISPPenCanvas* GetCanvas();
  virtual int GetCanvasBitmapType();
  virtual void SetCanvasCleared();
  virtual IReferenceBitmapSettable* GetReferenceBitmapSettable();
  virtual IDepthMapBitmapSettable* GetDepthMapBitmapSettable();

 protected:
  // Hands over the render drawable, which may be null; the base owns it from here on.
  void setDrawableRT(PenDrawableRT* drawable);
  // Has the render drawable released and deleted on the render thread, after everything posted before. Where
  // the queue refuses, waits until what it took has run and has the render drawable gone on return. To be
  // called by the destructor of the final class; the base's does it too, for whoever forgot.
  void destroy();

  PenGLDataManager* mDataManager;
  ISPPenCanvas* mCanvas = nullptr;

 private:
  // Posts `CreatePenCanvas` for a render drawable on a canvas that can be drawn into.
  void prepareDrawableRT();

  PenDrawableRT* mDrawableRT = nullptr;
  // The last canvas's, where batches went: it may still run them when the canvas is long taken away.
  IGLMsgQueue* mCanvasQueue = nullptr;
  bool mPrepared = false;  // `CreatePenCanvas` has been posted
};

}  // namespace Qelt
