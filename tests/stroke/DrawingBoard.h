#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "base/RectF.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/model/StoredStroke.h"
#include "desktop/pencommon/BatchObserver.h"
#include "desktop/pencommon/PenDataManager.h"
#include "engine/MotionEvent.h"
#include "gl/ITask.h"
#include "pen/Pencil2Data.h"
#include "pencommon/PenSettingData.h"
#include "stroke/Pencil2StrokeDrawableGL.h"
#include "support/LiveStroke.h"
#include "support/Stamps.h"

namespace QeltTests {

struct BoardOptions {
  int version = 8;  // rendering version
  float size = 10.0f;
  std::uint32_t color = 0xFF202020u;
  bool curve = true;
  int tool = Qelt::kToolStylus;
  int source = Qelt::kSourceStylus;
  // Pixels of the layer; 0: no layer and no GL, batches only.
  int width = 0, height = 0;
  int tile = 512;
};

// A stroke drawable as the code under test makes it, not through the loaded library, with settings and shared
// record within reach. Tasks run on the test's own thread, when something is asked for. One at a time.
class DrawingBoard {
 public:
  explicit DrawingBoard(const BoardOptions& options);
  ~DrawingBoard();
  DrawingBoard(const DrawingBoard&) = delete;
  DrawingBoard& operator=(const DrawingBoard&) = delete;

  // One event each; of a move the last sample is the current one. The answer is the drawable's; the rectangle
  // is handed in as four zeros.
  bool down(const Sample& sample) { return send(Qelt::kActionDown, {sample}); }
  bool move(const std::vector<Sample>& samples) { return send(Qelt::kActionMove, samples); }
  bool up(const Sample& sample) { return send(Qelt::kActionUp, {sample}); }
  bool send(int action, const std::vector<Sample>& samples);
  bool send(Qelt::MotionEvent& event);
  // A whole stroke: down at the first sample, the rest `batch` at a time, up at the last.
  void stroke(const std::vector<Sample>& samples, int batch = 4);
  bool redraw(const Qelt::MotionEvent& event);
  bool redraw(const Qelt::ObjectStroke& stroke);

  // A whole stroke packed into one event: every sample in the history, the last one current as well.
  Qelt::MotionEvent recorded(const std::vector<Sample>& samples) const;
  std::unique_ptr<QeltDesktop::StoredStroke> stored(const std::vector<Sample>& samples,
                                                    bool hasAngles = true) const;

  // What reached the render drawable since the last call: all stamps, or batch by batch.
  std::vector<Stamp> takeStamps();
  std::vector<QeltDesktop::Batch> takeBatches();
  // The names of the tasks posted since the last call, see `taskName`.
  std::vector<std::string> takePosts();
  std::vector<std::uint8_t> pixels() { return layer->readPixels(); }

  Qelt::Pencil2StrokeDrawableGL& drawable() { return *mDrawable; }
  // As a pen does it when it dies or its version changes.
  void deleteDrawable();

  BoardOptions options;
  Qelt::PenSettingData settings;
  Qelt::Pencil2Data shared{};
  Qelt::RectF rect;  // of the last call
  QeltDesktop::RenderQueue queue;
  std::unique_ptr<QeltDesktop::CanvasLayer> layer;
  QeltDesktop::PenCanvas canvas;
  QeltDesktop::PenDataManager data;

 private:
  std::unique_ptr<Qelt::Pencil2StrokeDrawableGL> mDrawable;
  std::vector<QeltDesktop::Batch> mBatches;
  std::vector<std::string> mPosts;
};

// One event; the last sample is the current one, those before it are its history.
Qelt::MotionEvent motionEvent(int action, const std::vector<Sample>& samples, int tool, int source);

// What a task does, in a word, told by its exact type: "SetStartPoint", "SetPenData", "SetRedrawState",
// "SetRect", "Batch" (SendDataToGPU or SetCacheBuffer), "Render", "DeleteBatch", "Unref",
// "ReleaseStrokeData", "ReleasePenData", "DeleteName", "Clear"; any other's type as it stands.
std::string taskName(const Qelt::ITask& task);

// The matrix that scales by `zoom` and moves by (dx, dy).
Qelt::Matrix3<float> viewOf(float zoom, float dx = 0.0f, float dy = 0.0f);

}  // namespace QeltTests
