#pragma once

#include "pencommon/PenDrawableRT.h"

namespace Qelt {

// The base of render drawables of settings previews: one batch at a time. No vector is owned.
class QELT_HOST_API PenPreviewDrawableRT : public PenDrawableRT {
 public:
  explicit PenPreviewDrawableRT(PenGLDataManager* manager);
  ~PenPreviewDrawableRT() override;

  virtual void SetBuffer(std::vector<float>* buffer);      // main thread
  virtual void SendDataToGPU(std::vector<float>* buffer);  // render thread; borrowed until `Clear`

 protected:
  std::vector<float>* mWriteBuffer = nullptr;
  std::vector<float>* mRenderBuffer = nullptr;
};

}  // namespace Qelt
