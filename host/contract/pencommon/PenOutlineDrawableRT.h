#pragma once

#include <atomic>

#include "pencommon/PenDrawableRT.h"

namespace Qelt {

// The base of render drawables of outlines: two streams of vertices. No vector is owned. Size and colour are
// set by the main thread and read by both; a batch is drawn in the colour that is set when it is drawn.
class QELT_HOST_API PenOutlineDrawableRT : public PenDrawableRT {
 public:
  explicit PenOutlineDrawableRT(PenGLDataManager* manager);
  ~PenOutlineDrawableRT() override;

  virtual void SetOutlineSize(float size);  // stroke units
  virtual float GetOutlineSize();
  virtual void SetOutlineColor(unsigned int argb);
  virtual unsigned int GetOutlineColor();
  // One stream.
  virtual void SetBuffer(std::vector<float>* buffer);      // main thread
  virtual void SendDataToGPU(std::vector<float>* buffer);  // render thread
  // Both streams: the stamp-sized quads first, the enlarged ones second.
  virtual void SetBuffer(std::vector<float>* inner, std::vector<float>* outer);      // main thread
  virtual void SendDataToGPU(std::vector<float>* inner, std::vector<float>* outer);  // render thread

 protected:
  std::vector<float>* mInnerWriteBuffer = nullptr;
  std::vector<float>* mOuterWriteBuffer = nullptr;
  std::vector<float>* mInnerRenderBuffer = nullptr;
  std::vector<float>* mOuterRenderBuffer = nullptr;

 private:
  std::atomic<float> mOutlineSize{0.0f};
  std::atomic<unsigned int> mOutlineColor{0};
};

}  // namespace Qelt
