#pragma once

#include <memory>
#include <string>
#include <vector>

#include "pencommon/Pen.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "support/Board.h"

namespace QeltTests {

struct LiveStrokeOptions {
  int renderingVersion = 8;
  // With a picture there are a render thread, a GL context and a layer of 256 x 256 pixels; without, batches
  // only.
  bool picture = false;
};

// A stroke drawn by a pen of the built library. Each call returns when the render thread has done its part,
// so batches and pixels can be read.
class LiveStroke : public Board {
 public:
  explicit LiveStroke(const LiveStrokeOptions& wanted = {});
  ~LiveStroke() override;

  // The buffers that reached the render drawable since the last call.
  std::vector<std::vector<float>> takeBatches() { return takeBuffers(); }
  std::vector<std::string> takePosted() { return takePosts(); }

  // Deletes the pen, as a host does that closes its document.
  void deletePen();

 protected:
  bool draw(const Qelt::MotionEvent& event) override;

 private:
  std::unique_ptr<Qelt::Pen> mPen;
  Qelt::PenStrokeDrawableGL* mDrawable = nullptr;
};

}  // namespace QeltTests
