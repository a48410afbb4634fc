#pragma once

#include "base/HostApi.h"
#include "base/Vector.h"
#include "graphics/ISPPenCanvas.h"
#include "math/Matrix3.h"

namespace QeltDesktop {

class CanvasLayer;

// A view of a layer. Everything it is given is borrowed and outlives it. Main thread, except GetLayer,
// BeginTile and EndTile, which are for the render thread.
class QELT_HOST_API PenCanvas : public Qelt::ISPPenCanvas {
 public:
  // Without a layer nothing is drawn and no GL is needed.
  PenCanvas(Qelt::IGLMsgQueue* queue, CanvasLayer* layer);
  ~PenCanvas() override;

  // Stroke units to canvas pixels, column-major; the identity at first.
  void setMatrix(const Qelt::Matrix3<float>& matrix);
  // The layer that is drawn into from now on, or none. Nothing posted through the canvas may still wait.
  void setLayer(CanvasLayer* layer) { mLayer = layer; }
  CanvasLayer* layer() const { return mLayer; }
  Qelt::IGLMsgQueue* queue() const { return mQueue; }

  Qelt::IGLMsgQueue* GetMsgQueue() override;
  // Also tells the stroke cache that this is the view that strokes are drawn for now.
  const Qelt::Matrix3<float>& GetMatrix() override;
  Qelt::ISPLayer* GetLayer() override;
  void BeginTile(int index) override;
  void EndTile(int index) override;

 private:
  Qelt::IGLMsgQueue* mQueue;
  CanvasLayer* mLayer;
  Qelt::Matrix3<float> mMatrix;
  Qelt::Vector2<float> mInverseScale{1.0f, 1.0f};  // of mMatrix: stroke units per pixel in x and y
};

}  // namespace QeltDesktop
