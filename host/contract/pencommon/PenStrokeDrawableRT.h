#pragma once

#include "pencommon/PenDrawableRT.h"

namespace Qelt {

// The base of render drawables of strokes: their batches. No vector is owned.
class QELT_HOST_API PenStrokeDrawableRT : public PenDrawableRT {
 public:
  explicit PenStrokeDrawableRT(PenGLDataManager* manager);
  ~PenStrokeDrawableRT() override;

  // Main thread: where stamps are appended from now on; null for nowhere.
  virtual void SetBuffer(std::vector<float>* buffer);
  // Render thread: the batch that `Update(false)` uploads, borrowed until `Clear`.
  virtual void SendDataToGPU(std::vector<float>* buffer);
  // Render thread: the batch that `Update(true)` uploads, borrowed until `Clear`.
  virtual void SetCacheBuffer(std::vector<float>* buffer);

 protected:
  std::vector<float>* mWriteBuffer = nullptr;
  std::vector<float>* mRenderBuffer = nullptr;
  std::vector<float>* mCacheBuffer = nullptr;
};

}  // namespace Qelt
