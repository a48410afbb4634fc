#include "support/LiveStroke.h"

#include <cxxabi.h>

#include <cstdlib>
#include <stdexcept>
#include <typeinfo>
#include <utility>

#include "desktop/pencommon/BatchObserver.h"
#include "gl/ITask.h"
#include "pencommon/IPenMorphable.h"

namespace QeltTests {

using QeltDesktop::Batch;
using QeltDesktop::CanvasLayer;
using QeltDesktop::PenCanvas;
using QeltDesktop::RenderQueue;

namespace {

constexpr std::int64_t kMillisecondsBetweenSamples = 4;

std::string typeName(const Qelt::ITask& task) {
  int status = 0;
  const std::unique_ptr<char, void (*)(void*)> name(
      abi::__cxa_demangle(typeid(task).name(), nullptr, nullptr, &status), std::free);
  return status == 0 ? name.get() : typeid(task).name();
}

Qelt::PointerCoords coordsOf(const Sample& sample) {
  return {sample.x, sample.y, sample.pressure, sample.tilt, sample.orientation};
}

}  // namespace

LiveStroke::LiveStroke(const LiveStrokeOptions& options)
    : mOptions(options),
      mLibrary(QELT_PLUGIN_PATH),
      mQueue(options.thread ? RenderQueue::Mode::Thread : RenderQueue::Mode::Caller,
             options.picture ? RenderQueue::GL::Context : RenderQueue::GL::None),
      mData(&mQueue) {
  mQueue.onAccepted = [this](const Qelt::ITask& task) { mPosted.push_back(typeName(task)); };
  if (options.picture) {
    mLayer = std::make_unique<CanvasLayer>(mQueue, options.width, options.height, options.tile);
  }
  mCanvas = std::make_unique<PenCanvas>(&mQueue, mLayer.get());
  // The observer runs on the render thread; what it keeps is read after `finish`.
  QeltDesktop::setBatchObserver([this](const Batch& batch) {
    for (const std::vector<float>& buffer : batch.buffers) mBatches.push_back(buffer);
  });

  mPen.reset(mLibrary.createPen());
  if (mPen == nullptr) throw std::runtime_error("no pen");
  mPen->setPenDataManager(&mData);
  mPen->setVersion(options.renderingVersion);
  mPen->SetScreenResolution(options.width, options.height);
  mPen->SetSize(options.size);
  mPen->SetColor(static_cast<int>(options.color));
  mPen->GetMorphable()->SetCurveEnabled(options.curve);
  mDrawable = mPen->GetStrokeDrawableGL();
  if (mDrawable == nullptr) throw std::runtime_error("no stroke drawable");
  mDrawable->SetCanvas(mCanvas.get());
  mQueue.finish();
  mPosted.clear();
  mBatches.clear();
}

LiveStroke::~LiveStroke() {
  deletePen();
  QeltDesktop::setBatchObserver(nullptr);
}

void LiveStroke::deletePen() {
  mDrawable = nullptr;
  mPen.reset();
  mQueue.finish();
}

bool LiveStroke::draw(int action, const std::vector<Sample>& samples) {
  const Qelt::PointerProperties pointer{0, mOptions.toolType};
  mEvent.reset();
  for (const Sample& sample : samples) {
    const Qelt::PointerCoords coords = coordsOf(sample);
    mTime += kMillisecondsBetweenSamples;
    if (mEvent == nullptr) {
      mEvent =
          std::make_unique<Qelt::MotionEvent>(0, mTime, action, 1, &pointer, &coords, 0, mOptions.source, 0);
    } else {
      mEvent->AddBatch(mTime, &coords);
    }
  }
  mRect = {};
  const bool drawn = mDrawable->Draw(mEvent.get(), &mRect);
  mQueue.finish();
  return drawn;
}

bool LiveStroke::down(const Sample& sample) {
  return draw(Qelt::kActionDown, {sample});
}

bool LiveStroke::move(const std::vector<Sample>& samples) {
  return draw(Qelt::kActionMove, samples);
}

bool LiveStroke::up(const Sample& sample) {
  return draw(Qelt::kActionUp, {sample});
}

std::vector<std::vector<float>> LiveStroke::takeBatches() {
  mQueue.finish();
  return std::exchange(mBatches, {});
}

std::vector<std::string> LiveStroke::takePosted() {
  return std::exchange(mPosted, {});
}

std::vector<std::uint8_t> LiveStroke::pixels() {
  return mLayer->readPixels();
}

}  // namespace QeltTests
