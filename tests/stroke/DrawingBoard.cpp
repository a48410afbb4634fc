#include "stroke/DrawingBoard.h"

#include <algorithm>
#include <cstddef>
#include <typeinfo>
#include <utility>

#include "base/String.h"
#include "math/Matrix3.h"
#include "pen/DrawableFactory.h"
#include "pen/VersionTable.h"
#include "pencommon/PenDrawableRT.h"
#include "pencommon/PenStrokeDataManager.h"
#include "render/PenGLRenderMsg.h"
#include "render/Pencil2StrokeDrawableRTV1.h"
#include "render/Pencil2StrokeDrawableRTV2.h"
#include "render/Pencil2StrokeDrawableRTV3.h"
#include "render/Tasks.h"
#include "support/Versions.h"

namespace QeltTests {

using namespace Qelt;
using QeltDesktop::Batch;
using QeltDesktop::RenderQueue;
using QeltDesktop::StoredStroke;

namespace {

PointerCoords coordsOf(const Sample& sample) {
  return {sample.x, sample.y, sample.pressure, sample.tilt, sample.orientation};
}

template <typename Drawable>
using StartPointTask = WorkerTask::Member2<Drawable, void (Drawable::*)(float, float), float, float>;
template <typename T, typename A, typename R = void>
using Task1 = WorkerTask::Member1<T, R (T::*)(A), A>;

}  // namespace

DrawingBoard::DrawingBoard(const BoardOptions& wanted)
    : options(wanted),
      queue(RenderQueue::Mode::Caller, wanted.width > 0 ? RenderQueue::GL::Context : RenderQueue::GL::None),
      layer(wanted.width > 0
                ? std::make_unique<QeltDesktop::CanvasLayer>(queue, wanted.width, wanted.height, wanted.tile)
                : nullptr),
      canvas(&queue, layer.get()),
      data(&queue) {
  settings.size = options.size;
  settings.color = options.color;
  shared.mSettingData = &settings;
  shared.mCurveEnabled = options.curve;
  shared.mLastAlpha = -1.0f;
  mDrawable.reset(createStrokeDrawable(versionTable[versionRow(options.version)][0], &shared, &data));
  mDrawable->SetCanvas(&canvas);
  queue.finish();
  queue.onAccepted = [this](const ITask& task) { mPosts.push_back(taskName(task)); };
  QeltDesktop::setBatchObserver([this](Batch batch) { mBatches.push_back(std::move(batch)); });
}

DrawingBoard::~DrawingBoard() {
  queue.onAccepted = nullptr;
  queue.accept = nullptr;
  deleteDrawable();
  QeltDesktop::setBatchObserver(nullptr);
}

void DrawingBoard::deleteDrawable() {
  mDrawable.reset();
  queue.finish();
}

bool DrawingBoard::send(int action, const std::vector<Sample>& samples) {
  MotionEvent event = motionEvent(action, samples, options.tool, options.source);
  return send(event);
}

bool DrawingBoard::send(MotionEvent& event) {
  rect = {};
  return mDrawable->Draw(&event, &rect);
}

void DrawingBoard::stroke(const std::vector<Sample>& samples, int batch) {
  down(samples.front());
  for (std::size_t next = 1; next < samples.size();) {
    const std::size_t end = std::min(next + static_cast<std::size_t>(batch), samples.size());
    move({samples.begin() + static_cast<std::ptrdiff_t>(next),
          samples.begin() + static_cast<std::ptrdiff_t>(end)});
    next = end;
  }
  up(samples.back());
}

bool DrawingBoard::redraw(const MotionEvent& event) {
  rect = {};
  return mDrawable->RedrawPen(&event, &rect);
}

bool DrawingBoard::redraw(const ObjectStroke& stroke) {
  rect = {};
  return mDrawable->RedrawPen(&stroke, &rect);
}

MotionEvent DrawingBoard::recorded(const std::vector<Sample>& samples) const {
  std::vector<Sample> all = samples;
  all.push_back(samples.back());
  return motionEvent(kActionUp, all, options.tool, options.source);
}

std::unique_ptr<StoredStroke> DrawingBoard::stored(const std::vector<Sample>& samples, bool hasAngles) const {
  auto stroke = std::make_unique<StoredStroke>(options.tool, hasAngles);
  std::int64_t time = 0;
  for (const Sample& s : samples) stroke->addPoint({s.x, s.y}, time += 4, s.pressure, s.tilt, s.orientation);
  return stroke;
}

std::vector<Stamp> DrawingBoard::takeStamps() {
  std::vector<Stamp> stamps;
  for (const Batch& batch : takeBatches()) {
    const std::vector<Stamp> some = stampsOf(batch.buffers.front(), strideOf(options.version));
    stamps.insert(stamps.end(), some.begin(), some.end());
  }
  return stamps;
}

std::vector<Batch> DrawingBoard::takeBatches() {
  queue.finish();
  return std::exchange(mBatches, {});
}

std::vector<std::string> DrawingBoard::takePosts() {
  return std::exchange(mPosts, {});
}

MotionEvent motionEvent(int action, const std::vector<Sample>& samples, int tool, int source) {
  const PointerProperties pointer{0, tool};
  std::int64_t time = 4;
  PointerCoords coords = coordsOf(samples.front());
  MotionEvent event(0, time, action, 1, &pointer, &coords, 0, source, 0);
  for (std::size_t i = 1; i < samples.size(); ++i) {
    coords = coordsOf(samples[i]);
    event.AddBatch(time += 4, &coords);
  }
  return event;
}

std::string taskName(const ITask& task) {
  const auto is = [&task](const std::type_info& type) { return typeid(task) == type; };
  if (is(typeid(StartPointTask<Pencil2StrokeDrawableRTV1>)) ||
      is(typeid(StartPointTask<Pencil2StrokeDrawableRTV2>)) ||
      is(typeid(StartPointTask<Pencil2StrokeDrawableRTV3>))) {
    return "SetStartPoint";
  }
  if (is(typeid(WorkerTask::Member2<PenDrawableRT, void (PenDrawableRT::*)(float, int), float, int>))) {
    return "SetPenData";
  }
  if (is(typeid(Task1<PenDrawableRT, bool>))) return "SetRedrawState";
  if (is(typeid(Task1<PenDrawableRT, RectF>))) return "SetRect";
  if (is(typeid(Task1<PenStrokeDrawableRT, std::vector<float>*>))) return "Batch";
  if (is(typeid(PenGLRenderMsg))) return "Render";
  if (is(typeid(WorkerTask::Delete<std::vector<float>>))) return "DeleteBatch";
  if (is(typeid(WorkerTask::Member0<RefCount, void (RefCount::*)()>))) return "Unref";
  if (is(typeid(Task1<PenStrokeDataManager, int>))) return "ReleaseStrokeData";
  if (is(typeid(Task1<PenGLDataManager, String*, bool>))) return "ReleasePenData";
  if (is(typeid(WorkerTask::Delete<String>))) return "DeleteName";
  if (is(typeid(WorkerTask::Member0<PenDrawableRT, void (PenDrawableRT::*)()>))) return "Clear";
  return typeid(task).name();
}

Matrix3<float> viewOf(float zoom, float dx, float dy) {
  const float elements[9] = {zoom, 0.0f, 0.0f, 0.0f, zoom, 0.0f, dx, dy, 1.0f};
  return Matrix3<float>(elements);
}

}  // namespace QeltTests
