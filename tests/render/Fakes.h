#pragma once

#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "gl/IGLMsgQueue.h"
#include "gl/ITask.h"
#include "graphics/ISPBitmap.h"
#include "graphics/ISPPenCanvas.h"
#include "math/Matrix3.h"
#include "math/Matrix4.h"
#include "pencommon/PenStrokeDrawableRT.h"
#include "support/FakeLayer.h"

namespace QeltTests {

// What happened, in order.
using Events = std::vector<std::string>;

// Keeps what is posted until `run`; refuses what `refuses` says.
class FakeQueue : public Qelt::IGLMsgQueue {
 public:
  bool Post(Qelt::ITask* task) override {
    if (task == nullptr) return true;
    if (refuses && refuses(*task)) return false;
    tasks.emplace_back(task);
    return true;
  }
  void run() {
    for (const auto& task : std::exchange(tasks, {})) task->run();
  }

  std::function<bool(const Qelt::ITask&)> refuses;
  std::vector<std::unique_ptr<Qelt::ITask>> tasks;
};

class FakeCanvas : public Qelt::ISPPenCanvas {
 public:
  explicit FakeCanvas(Events& log) : events(log) {}
  Qelt::IGLMsgQueue* GetMsgQueue() override {
    events.emplace_back("queue");
    return queue;
  }
  const Qelt::Matrix3<float>& GetMatrix() override { return matrix; }
  Qelt::ISPLayer* GetLayer() override { return hasLayer ? &layer : nullptr; }
  void BeginTile(int index) override { events.push_back("begin " + std::to_string(index)); }
  void EndTile(int index) override { events.push_back("end " + std::to_string(index)); }

  Events& events;
  Qelt::IGLMsgQueue* queue = nullptr;
  FakeLayer layer;
  bool hasLayer = true;
  Qelt::Matrix3<float> matrix;
};

// A render drawable that draws nothing and tells what it was asked to.
class FakeDrawable : public Qelt::PenStrokeDrawableRT, public Qelt::IReferenceBitmapSettable {
 public:
  explicit FakeDrawable(Events& log) : PenStrokeDrawableRT(nullptr), events(log) {}
  void SetBuffer(std::vector<float>* buffer) override {
    events.push_back(buffer != nullptr ? "buffer" : "no buffer");
    PenStrokeDrawableRT::SetBuffer(buffer);
  }
  void SendDataToGPU(std::vector<float>* buffer) override {
    events.push_back("send " + std::to_string(buffer->size()));
    PenStrokeDrawableRT::SendDataToGPU(buffer);
  }
  void SetCacheBuffer(std::vector<float>* buffer) override {
    events.push_back("cache " + std::to_string(buffer->size()));
    PenStrokeDrawableRT::SetCacheBuffer(buffer);
  }
  void Update(bool useCache) override { events.emplace_back(useCache ? "update cache" : "update"); }
  void Draw(Qelt::ISPSubBitmap* tile, Qelt::Matrix4<float>&) override {
    events.push_back("draw at " + std::to_string(tile->GetX()));
    if (throws) throw std::runtime_error("out of the host");
  }
  void Clear() override { events.emplace_back("clear"); }
  Qelt::IReferenceBitmapSettable* GetReferenceBitmapSettable() override {
    return takesReference ? this : nullptr;
  }
  void SetReferenceBitmap(Qelt::ISPBitmap*) override { events.emplace_back("reference"); }
  std::vector<float>* writeBuffer() { return mWriteBuffer; }

  Events& events;
  bool takesReference = false;
  bool throws = false;
};

}  // namespace QeltTests
