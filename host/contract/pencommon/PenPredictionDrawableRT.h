#pragma once

#include <atomic>

#include "pencommon/PenDrawableRT.h"

namespace Qelt {

// The base of render drawables of predictions: one batch at a time, and how opaque it is drawn. No vector is
// owned.
class QELT_HOST_API PenPredictionDrawableRT : public PenDrawableRT {
 public:
  explicit PenPredictionDrawableRT(PenGLDataManager* manager);
  ~PenPredictionDrawableRT() override;

  virtual void SetBuffer(std::vector<float>* buffer);      // main thread
  virtual void SendDataToGPU(std::vector<float>* buffer);  // render thread; borrowed until `Clear`
  virtual void SetOpacity(float opacity);                  // main thread; 0 to 1, read at the next draw

 protected:
  // Written by the main thread, read by the render thread.
  float GetOpacity() const;

  std::vector<float>* mWriteBuffer = nullptr;
  std::vector<float>* mRenderBuffer = nullptr;

 private:
  std::atomic<float> mOpacity{1.0f};
};

}  // namespace Qelt
