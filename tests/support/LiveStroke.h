#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "base/RectF.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/pencommon/PenDataManager.h"
#include "engine/MotionEvent.h"
#include "pencommon/Pen.h"
#include "pencommon/PenStrokeDrawableGL.h"

namespace QeltTests {

// A point of the stroke under way; pressure 0 to 1, angles in radians.
struct Sample {
  float x, y;
  float pressure = 0.5f;
  float tilt = 0.0f;
  float orientation = 0.0f;
};

struct LiveStrokeOptions {
  int renderingVersion = 8;
  float size = 12.0f;  // stroke units
  std::uint32_t color = 0xFF202020u;
  bool curve = true;
  int toolType = Qelt::kToolStylus;
  int source = Qelt::kSourceStylus;
  // With a picture there are a GL context and a layer of this many pixels; without, batches only.
  bool picture = false;
  int width = 256, height = 256, tile = 512;
  // A render thread, or everything on the test's own thread.
  bool thread = false;
};

// What a host sets up to draw one live stroke with the built library: pen, queue, canvas. Each call returns
// when the render thread has done its part, so batches and pixels can be read. One at a time: the observer of
// batches, and the GL context of a picture, belong to the process.
class LiveStroke {
 public:
  explicit LiveStroke(const LiveStrokeOptions& options = {});
  ~LiveStroke();
  LiveStroke(const LiveStroke&) = delete;
  LiveStroke& operator=(const LiveStroke&) = delete;

  // Each hands one event to the drawable and returns its answer; the last sample of a move is the current
  // one, those before it are its history.
  bool down(const Sample& sample);
  bool move(const std::vector<Sample>& samples);
  bool up(const Sample& sample);
  bool draw(int action, const std::vector<Sample>& samples);

  // What the last call left in the rectangle, handed in as four zeros, and in the event.
  const Qelt::RectF& rect() const { return mRect; }
  const Qelt::MotionEvent& event() const { return *mEvent; }

  // The batches that reached the render drawable since the last call.
  std::vector<std::vector<float>> takeBatches();
  // The tasks the queue took since the last call, as their demangled types.
  std::vector<std::string> takePosted();
  // Width x height x 4 bytes, premultiplied; only with a picture.
  std::vector<std::uint8_t> pixels();

  Qelt::Pen& pen() { return *mPen; }
  Qelt::PenStrokeDrawableGL& drawable() { return *mDrawable; }
  QeltDesktop::RenderQueue& queue() { return mQueue; }
  QeltDesktop::PenCanvas& canvas() { return *mCanvas; }
  QeltDesktop::PenDataManager& data() { return mData; }
  QeltDesktop::CanvasLayer* layer() { return mLayer.get(); }
  // Deletes the pen, as a host does that closes its document.
  void deletePen();

 private:
  LiveStrokeOptions mOptions;
  // Written by the queue, so they outlive it.
  std::vector<std::vector<float>> mBatches;
  std::vector<std::string> mPosted;
  QeltDesktop::PluginLibrary mLibrary;
  QeltDesktop::RenderQueue mQueue;
  std::unique_ptr<QeltDesktop::CanvasLayer> mLayer;
  std::unique_ptr<QeltDesktop::PenCanvas> mCanvas;
  QeltDesktop::PenDataManager mData;
  std::unique_ptr<Qelt::Pen> mPen;
  Qelt::PenStrokeDrawableGL* mDrawable = nullptr;
  std::unique_ptr<Qelt::MotionEvent> mEvent;
  std::int64_t mTime = 0;
  Qelt::RectF mRect;
};

}  // namespace QeltTests
