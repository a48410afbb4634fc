#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "base/RectF.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/model/StoredStroke.h"
#include "desktop/pencommon/BatchObserver.h"
#include "desktop/pencommon/PenDataManager.h"
#include "engine/MotionEvent.h"
#include "gl/ITask.h"
#include "math/Matrix3.h"
#include "support/FaultyCanvas.h"
#include "support/Versions.h"

namespace QeltTests {

// A point of the stroke under way; pressure 0 to 1, angles in radians.
struct Sample {
  float x, y;
  float pressure = 0.5f;
  float tilt = 0.0f;
  float orientation = 0.0f;
};

struct BoardOptions {
  int version = kUsualVersion;  // rendering version
  float size = 10.0f;
  std::uint32_t color = 0xFF202020u;
  bool curve = true;
  int tool = Qelt::kToolStylus;
  int source = Qelt::kSourceStylus;
  // Pixels of the layer; 0: no layer and no GL, batches only.
  int width = 0, height = 0;
  int tile = 512;
  // A render thread; without, tasks run on the test's own, when something is asked for.
  bool thread = false;
};

// One event; the last sample is the current one, those before it are its history.
Qelt::MotionEvent motionEvent(int action, const std::vector<Sample>& samples, int tool = Qelt::kToolStylus,
                              int source = Qelt::kSourceStylus);

// What a task does, in a word, told by its type: "SetStartPoint", "SetPenData", "SetRedrawState", "SetRect",
// "Batch" (SendDataToGPU or SetCacheBuffer), "Render", "DeleteBatch", "Unref", "ReleaseStrokeData",
// "ReleasePenData", "DeleteName", "Clear"; any other's type as it stands.
std::string taskName(const Qelt::ITask& task);

// The matrix that scales by `zoom` and moves by (dx, dy).
Qelt::Matrix3<float> viewOf(float zoom, float dx = 0.0f, float dy = 0.0f);

// Whether a call answers false and leaves the error of a wrong argument.
bool isRefused(const std::function<bool()>& call);

// What a host sets up to draw with: a queue, a layer, a canvas, what it keeps of pens. Whoever derives from
// this brings what draws. Main thread.
class Board {
 public:
  virtual ~Board();
  Board(const Board&) = delete;
  Board& operator=(const Board&) = delete;

  // One event each; of a move the last sample is the current one. Returns the drawable's answer; the
  // rectangle is handed in as four zeros.
  bool down(const Sample& sample) { return send(Qelt::kActionDown, {sample}); }
  bool move(const std::vector<Sample>& samples) { return send(Qelt::kActionMove, samples); }
  bool up(const Sample& sample) { return send(Qelt::kActionUp, {sample}); }
  bool send(int action, const std::vector<Sample>& samples) { return send(eventOf(action, samples)); }
  bool send(const Qelt::MotionEvent& event);
  // A whole stroke: down at the first sample, the rest `batch` at a time, up at the last.
  void stroke(const std::vector<Sample>& samples, int batch = 4);

  Qelt::MotionEvent eventOf(int action, const std::vector<Sample>& samples) const;
  // A whole stroke packed into one event: every sample in the history, the last one current as well.
  Qelt::MotionEvent recorded(std::vector<Sample> samples) const;
  std::unique_ptr<QeltDesktop::StoredStroke> stored(const std::vector<Sample>& samples,
                                                    bool hasAngles = true) const;

  // What reached the render drawables since the last call: hand-over by hand-over, buffer by buffer, or the
  // first buffers in one.
  std::vector<QeltDesktop::Batch> takeBatches();
  std::vector<std::vector<float>> takeBuffers();
  std::vector<float> takeFloats();
  // The names of the tasks posted since the last call, see `taskName`.
  std::vector<std::string> takePosts();
  // Width x height x 4 bytes, premultiplied; only with a layer.
  std::vector<std::uint8_t> pixels() { return layer->readPixels(); }

  // Posts and batches are noted from here on, and every batch is looked at for what no pen may hand over. One
  // board at a time: the observer of batches belongs to the process.
  void watch();
  // Nothing is noted or refused any more.
  void unwatch();

  const BoardOptions options;

 private:
  const std::unique_ptr<QeltDesktop::RenderQueue> mOwnQueue;
  const std::unique_ptr<QeltDesktop::CanvasLayer> mOwnLayer;

 public:
  Qelt::RectF rect;  // of the last call
  QeltDesktop::RenderQueue& queue;
  QeltDesktop::CanvasLayer* const layer;  // null without
  FaultyCanvas canvas;
  QeltDesktop::PenDataManager data;

 protected:
  // With a queue of its own, and a layer where the options have pixels; without, the canvas has none either,
  // which spares the tests of batches the render messages' walk.
  explicit Board(const BoardOptions& wanted);
  // On what others own.
  Board(const BoardOptions& wanted, QeltDesktop::RenderQueue& itsQueue, QeltDesktop::CanvasLayer* itsLayer);
  virtual bool draw(const Qelt::MotionEvent& event) = 0;

 private:
  bool mWatches = false;
  std::vector<QeltDesktop::Batch> mBatches;
  std::vector<std::string> mPosts;
};

}  // namespace QeltTests
