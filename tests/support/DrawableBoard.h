#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <typeinfo>
#include <utility>
#include <vector>

#include "base/RectF.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/pencommon/BatchObserver.h"
#include "desktop/pencommon/PenDataManager.h"
#include "engine/MotionEvent.h"
#include "gl/ITask.h"
#include "pen/Pencil2Data.h"
#include "pencommon/PenOutlineDrawableRT.h"
#include "pencommon/PenPredictionDrawableRT.h"
#include "pencommon/PenPreviewDrawableRT.h"
#include "pencommon/PenSettingData.h"
#include "prediction/Pencil2PredictionDrawableRT.h"
#include "preview/Pencil2PreviewDrawableRT.h"
#include "render/Tasks.h"
#include "stroke/DrawingBoard.h"
#include "support/LiveStroke.h"

namespace QeltTests {

// As `taskName`, for the tasks of every drawable; "Batch" of an outline is a batch of two.
inline std::string drawableTaskName(const Qelt::ITask& task) {
  using namespace Qelt;
  const auto is = [&task](const std::type_info& type) { return typeid(task) == type; };
  using Floats = std::vector<float>*;
  if (is(typeid(WorkerTask::Member2<Pencil2PreviewDrawableRT,
                                    void (Pencil2PreviewDrawableRT::*)(float, float), float, float>)) ||
      is(typeid(WorkerTask::Member2<Pencil2PredictionDrawableRT,
                                    void (Pencil2PredictionDrawableRT::*)(float, float), float, float>))) {
    return "SetStartPoint";
  }
  if (is(typeid(WorkerTask::Member1<PenPreviewDrawableRT, void (PenPreviewDrawableRT::*)(Floats), Floats>)) ||
      is(typeid(
          WorkerTask::Member1<PenPredictionDrawableRT, void (PenPredictionDrawableRT::*)(Floats), Floats>)) ||
      is(typeid(WorkerTask::Member2<PenOutlineDrawableRT, void (PenOutlineDrawableRT::*)(Floats, Floats),
                                    Floats, Floats>))) {
    return "Batch";
  }
  return taskName(task);
}

// An outline, preview or prediction drawable as the code under test makes it, with settings and shared record
// within reach. Tasks run on the test's own thread, when something is asked for. One at a time.
template <typename Drawable>
class DrawableBoard {
 public:
  explicit DrawableBoard(const BoardOptions& wanted = {})
      : options(wanted),
        queue(QeltDesktop::RenderQueue::Mode::Caller,
              wanted.width > 0 ? QeltDesktop::RenderQueue::GL::Context : QeltDesktop::RenderQueue::GL::None),
        layer(wanted.width > 0 ? std::make_unique<QeltDesktop::CanvasLayer>(queue, wanted.width,
                                                                            wanted.height, wanted.tile)
                               : nullptr),
        canvas(&queue, layer.get()),
        data(&queue) {
    settings.size = options.size;
    settings.color = options.color;
    shared.mSettingData = &settings;
    shared.mCurveEnabled = options.curve;
    shared.mLastAlpha = -1.0f;
    drawable = std::make_unique<Drawable>(&shared, &data);
    drawable->SetCanvas(&canvas);
    queue.finish();
    queue.onAccepted = [this](const Qelt::ITask& task) { mPosts.push_back(drawableTaskName(task)); };
    QeltDesktop::setBatchObserver([this](QeltDesktop::Batch batch) { mBatches.push_back(std::move(batch)); });
  }

  ~DrawableBoard() {
    queue.onAccepted = nullptr;
    queue.accept = nullptr;
    drawable.reset();
    queue.finish();
    QeltDesktop::setBatchObserver(nullptr);
  }
  DrawableBoard(const DrawableBoard&) = delete;
  DrawableBoard& operator=(const DrawableBoard&) = delete;

  // One event each; of a move the last sample is the current one. The rectangle is handed in as four zeros.
  bool down(const Sample& sample) { return send(Qelt::kActionDown, {sample}); }
  bool move(const std::vector<Sample>& samples) { return send(Qelt::kActionMove, samples); }
  bool up(const Sample& sample) { return send(Qelt::kActionUp, {sample}); }
  bool send(int action, const std::vector<Sample>& samples) {
    Qelt::MotionEvent event = motionEvent(action, samples, options.tool, options.source);
    rect = {};
    return drawable->Draw(&event, &rect);
  }

  // A whole stroke packed into one event: every sample in the history, the last one current as well.
  Qelt::MotionEvent recorded(std::vector<Sample> samples) const {
    samples.push_back(samples.back());
    return motionEvent(Qelt::kActionUp, samples, options.tool, options.source);
  }

  // What reached the render drawable since the last call.
  std::vector<QeltDesktop::Batch> takeBatches() {
    queue.finish();
    return std::exchange(mBatches, {});
  }
  std::vector<float> takeFloats() {
    std::vector<float> floats;
    for (const QeltDesktop::Batch& batch : takeBatches()) {
      floats.insert(floats.end(), batch.buffers.front().begin(), batch.buffers.front().end());
    }
    return floats;
  }
  // The names of the tasks posted since the last call.
  std::vector<std::string> takePosts() { return std::exchange(mPosts, {}); }

  BoardOptions options;
  Qelt::PenSettingData settings;
  Qelt::Pencil2Data shared{};
  Qelt::RectF rect;  // of the last call
  QeltDesktop::RenderQueue queue;
  std::unique_ptr<QeltDesktop::CanvasLayer> layer;
  QeltDesktop::PenCanvas canvas;
  QeltDesktop::PenDataManager data;
  std::unique_ptr<Drawable> drawable;

 private:
  std::vector<QeltDesktop::Batch> mBatches;
  std::vector<std::string> mPosts;
};

}  // namespace QeltTests
