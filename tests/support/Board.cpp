#include "support/Board.h"

#include <cxxabi.h>

#include <algorithm>
#include <cstddef>
#include <cstdlib>
#include <typeinfo>
#include <utility>

#include "base/Error.h"
#include "support/BatchCheck.h"

namespace QeltTests {

using Qelt::MotionEvent;
using QeltDesktop::Batch;
using QeltDesktop::RenderQueue;
using QeltDesktop::StoredStroke;

Board::Board(const BoardOptions& wanted)
    : options(wanted),
      mOwnQueue(
          std::make_unique<RenderQueue>(wanted.thread ? RenderQueue::Mode::Thread : RenderQueue::Mode::Caller,
                                        wanted.width > 0 ? RenderQueue::GL::Context : RenderQueue::GL::None)),
      mOwnLayer(wanted.width > 0 ? std::make_unique<QeltDesktop::CanvasLayer>(*mOwnQueue, wanted.width,
                                                                              wanted.height, wanted.tile)
                                 : nullptr),
      queue(*mOwnQueue),
      layer(mOwnLayer.get()),
      canvas(&queue, layer, wanted.width > 0 ? Target::Whole : Target::NoLayer),
      data(&queue) {}

Board::Board(const BoardOptions& wanted, RenderQueue& itsQueue, QeltDesktop::CanvasLayer* itsLayer)
    : options(wanted), queue(itsQueue), layer(itsLayer), canvas(&queue, layer), data(&queue) {}

Board::~Board() {
  queue.finish();
  if (mWatches) QeltDesktop::setBatchObserver(nullptr);
}

void Board::watch() {
  queue.finish();
  mWatches = true;
  queue.onAccepted = [this](const Qelt::ITask& task) { mPosts.push_back(taskName(task)); };
  QeltDesktop::setBatchObserver([this](Batch batch) {
    if (const char* const fault = faultOf(batch); fault != nullptr) ADD_FAILURE() << fault;
    mBatches.push_back(std::move(batch));
  });
}

void Board::unwatch() {
  queue.onAccepted = nullptr;
  queue.accept = nullptr;
  if (std::exchange(mWatches, false)) {
    queue.finish();
    QeltDesktop::setBatchObserver(nullptr);
  }
}

bool Board::send(const MotionEvent& event) {
  rect = {};
  return draw(event);
}

MotionEvent Board::eventOf(int action, const std::vector<Sample>& samples) const {
  return motionEvent(action, samples, options.tool, options.source);
}

void Board::stroke(const std::vector<Sample>& samples, int batch) {
  down(samples.front());
  for (auto next = samples.begin() + 1; next < samples.end();) {
    const auto end = next + std::min<std::ptrdiff_t>(batch, samples.end() - next);
    move({next, end});
    next = end;
  }
  up(samples.back());
}

MotionEvent Board::recorded(std::vector<Sample> samples) const {
  samples.push_back(samples.back());
  return eventOf(Qelt::kActionUp, samples);
}

std::unique_ptr<StoredStroke> Board::stored(const std::vector<Sample>& samples, bool hasAngles) const {
  auto stroke = std::make_unique<StoredStroke>(options.tool, hasAngles);
  int number = 0;
  for (const Sample& s : samples) {
    stroke->addPoint({s.x, s.y}, 4 * ++number, s.pressure, s.tilt, s.orientation);
  }
  return stroke;
}

std::vector<Batch> Board::takeBatches() {
  queue.finish();
  return std::exchange(mBatches, {});
}

std::vector<std::vector<float>> Board::takeBuffers() {
  std::vector<std::vector<float>> buffers;
  for (Batch& batch : takeBatches())
    std::move(batch.buffers.begin(), batch.buffers.end(), back_inserter(buffers));
  return buffers;
}

std::vector<float> Board::takeFloats() {
  std::vector<float> floats;
  for (const Batch& batch : takeBatches()) {
    floats.insert(floats.end(), batch.buffers.front().begin(), batch.buffers.front().end());
  }
  return floats;
}

std::vector<std::string> Board::takePosts() {
  return std::exchange(mPosts, {});
}

MotionEvent motionEvent(int action, const std::vector<Sample>& samples, int tool, int source) {
  const auto coordsOf = [](const Sample& s) {
    return Qelt::PointerCoords{s.x, s.y, s.pressure, s.tilt, s.orientation};
  };
  const Qelt::PointerProperties pointer{0, tool};
  int number = 0;
  Qelt::PointerCoords coords = coordsOf(samples.front());
  MotionEvent event(0, 4 * ++number, action, 1, &pointer, &coords, 0, source, 0);
  for (std::size_t i = 1; i < samples.size(); ++i) {
    coords = coordsOf(samples[i]);
    event.AddBatch(4 * ++number, &coords);
  }
  return event;
}

std::string taskName(const Qelt::ITask& task) {
  int status = 0;
  const char* const mangled = typeid(task).name();
  const std::unique_ptr<char, void (*)(void*)> demangled(
      abi::__cxa_demangle(mangled, nullptr, nullptr, &status), std::free);
  const std::string type = status == 0 ? demangled.get() : mangled;
  // What the type says, and whom it concerns; the first that fits.
  static constexpr const char* kNames[][2] = {{"PenGLRenderMsg", "Render"},
                                              {"Delete<std::", "DeleteBatch"},
                                              {"Delete<Qelt::String>", "DeleteName"},
                                              {"RefCount::*)()", "Unref"},
                                              {"PenStrokeDataManager::*)(int)", "ReleaseStrokeData"},
                                              {"PenGLDataManager::*)(Qelt::String*)", "ReleasePenData"},
                                              {"::*)(float, float)", "SetStartPoint"},
                                              {"PenDrawableRT::*)(float, int)", "SetPenData"},
                                              {"PenDrawableRT::*)(bool)", "SetRedrawState"},
                                              {"PenDrawableRT::*)(Qelt::RectF)", "SetRect"},
                                              {"DrawableRT::*)(std::", "Batch"},
                                              {"PenDrawableRT::*)()", "Clear"}};
  for (const auto& [part, name] : kNames) {
    if (type.find(part) != std::string::npos) return name;
  }
  return type;
}

bool isRefused(const std::function<bool()>& call) {
  Qelt::Error::SetError(0);
  return !call() && Qelt::Error::GetError() == Qelt::Error::kInvalidArgument;
}

Qelt::Matrix3<float> viewOf(float zoom, float dx, float dy) {
  const float elements[9] = {zoom, 0.0f, 0.0f, 0.0f, zoom, 0.0f, dx, dy, 1.0f};
  return Qelt::Matrix3<float>(elements);
}

}  // namespace QeltTests
