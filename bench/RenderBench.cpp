#include <GLES3/gl3.h>
#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <exception>
#include <functional>
#include <memory>
#include <stdexcept>
#include <vector>

#include "LiveMoves.h"
#include "base/RectF.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/pencommon/BatchObserver.h"
#include "desktop/pencommon/PenDataManager.h"
#include "pen/Pencil2.h"
#include "pencommon/PenStrokeDrawableGL.h"

// What the render thread does for a live stroke, beside its limit: the same stamps with the same program and
// state from one buffer by one draw call. Both end when the GPU, or the software renderer, is done.
namespace {

using QeltBench::LiveStroke;
using QeltDesktop::RenderQueue;

constexpr int kSide = 1024;  // pixels; one tile
constexpr int kMoves = 25, kSamplesPerMove = 4;

// A pen that draws on a layer, with the tasks run by whoever asks.
class Desk {
 public:
  explicit Desk(float size) : mPen(createPenInst()) {
    mPen->setPenDataManager(&mManager);
    mPen->setVersion(8);
    mPen->SetSize(size);
    mPen->SetColor(0xFF202020);
    mPen->SetScreenResolution(kSide, kSide);
    mPen->GetStrokeDrawableGL()->SetCanvas(&mCanvas);
  }

  // Posts the whole stroke.
  void draw(const LiveStroke& stroke) {
    Qelt::RectF rect;
    mPen->GetStrokeDrawableGL()->Draw(&stroke.down, &rect);
    for (const Qelt::MotionEvent& move : stroke.moves) mPen->GetStrokeDrawableGL()->Draw(&move, &rect);
  }
  void render() { mQueue.runPending(); }
  void run(const std::function<void()>& call) { mQueue.run(call); }

 private:
  RenderQueue mQueue{RenderQueue::Mode::Caller, RenderQueue::GL::Context};
  QeltDesktop::CanvasLayer mLayer{mQueue, kSide, kSide, QeltDesktop::CanvasLayer::kOneTile};
  QeltDesktop::PenDataManager mManager{&mQueue};
  QeltDesktop::PenCanvas mCanvas{&mQueue, &mLayer};
  std::unique_ptr<Qelt::Pen> mPen;
};

// The vertices of all the stroke's batches.
std::vector<float> verticesOf(Desk& desk, const LiveStroke& stroke) {
  std::vector<float> all;
  QeltDesktop::setBatchObserver([&all](const QeltDesktop::Batch& batch) {
    for (const auto& buffer : batch.buffers) all.insert(all.end(), buffer.begin(), buffer.end());
  });
  desk.draw(stroke);
  desk.render();
  QeltDesktop::setBatchObserver({});
  return all;
}

// The barest program: what the pen's last draw call left set up, with a buffer of its own.
class Barest {
 public:
  Barest() {
    GLint array = 0, program = 0;
    glGetIntegerv(GL_VERTEX_ARRAY_BINDING, &array);
    glGetIntegerv(GL_CURRENT_PROGRAM, &program);
    if (array == 0 || program == 0) throw std::runtime_error("the pen leaves nothing set up to draw with");
    mTheirs = static_cast<GLuint>(array);
    glGenVertexArrays(1, &mArray);
    glGenBuffers(1, &mStore);
    for (GLuint location = 0; location < kMostAttributes; ++location) {
      glBindVertexArray(mTheirs);
      GLint isOn = 0, size = 0, stride = 0;
      void* offset = nullptr;
      glGetVertexAttribiv(location, GL_VERTEX_ATTRIB_ARRAY_ENABLED, &isOn);
      glGetVertexAttribiv(location, GL_VERTEX_ATTRIB_ARRAY_SIZE, &size);
      glGetVertexAttribiv(location, GL_VERTEX_ATTRIB_ARRAY_STRIDE, &stride);
      glGetVertexAttribPointerv(location, GL_VERTEX_ATTRIB_ARRAY_POINTER, &offset);
      if (isOn == 0) continue;
      mStride = static_cast<std::size_t>(stride);
      bind();
      glEnableVertexAttribArray(location);
      glVertexAttribPointer(location, size, GL_FLOAT, GL_FALSE, stride, offset);
    }
    unbind();
  }
  ~Barest() {
    glDeleteVertexArrays(1, &mArray);
    glDeleteBuffers(1, &mStore);
  }
  Barest(const Barest&) = delete;
  Barest& operator=(const Barest&) = delete;

  void draw(const std::vector<float>& vertices) {
    bind();
    const std::size_t bytes = vertices.size() * sizeof(float);
    glBufferData(GL_ARRAY_BUFFER, static_cast<GLsizeiptr>(bytes), vertices.data(), GL_STREAM_DRAW);
    glDrawArrays(GL_TRIANGLES, 0, static_cast<GLsizei>(bytes / mStride));
    glFinish();
    unbind();
  }

 private:
  static constexpr GLuint kMostAttributes = 8;

  void bind() {
    glGetIntegerv(GL_ARRAY_BUFFER_BINDING, &mTheirStore);
    glBindVertexArray(mArray);
    glBindBuffer(GL_ARRAY_BUFFER, mStore);
  }
  // The host knows what it has bound.
  void unbind() {
    glBindVertexArray(mTheirs);
    glBindBuffer(GL_ARRAY_BUFFER, static_cast<GLuint>(mTheirStore));
  }

  GLuint mArray = 0, mStore = 0, mTheirs = 0;
  GLint mTheirStore = 0;
  std::size_t mStride = 1;
};

double secondsOf(const std::function<void()>& call) {
  const auto begin = std::chrono::steady_clock::now();
  call();
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - begin).count();
}

void besideBarest(benchmark::State& state) {
  try {
    Desk desk(static_cast<float>(state.range(0)));
    const LiveStroke stroke(kMoves, kSamplesPerMove, QeltBench::Attitude::Turning);
    const std::vector<float> vertices = verticesOf(desk, stroke);
    std::unique_ptr<Barest> barest;
    desk.run([&] { barest = std::make_unique<Barest>(); });
    double pen = 1.0, limit = 1.0;
    for (auto _ : state) {
      desk.draw(stroke);
      const double mine = secondsOf([&] {
        desk.render();
        desk.run([] { glFinish(); });
      });
      pen = std::min(pen, mine);
      limit = std::min(limit, secondsOf([&] { desk.run([&] { barest->draw(vertices); }); }));
      state.SetIterationTime(mine);
    }
    desk.run([&] { barest.reset(); });
    constexpr std::size_t kFloatsPerStamp = 66;
    const auto stamps = static_cast<double>(vertices.size() / kFloatsPerStamp);
    state.counters["us/event"] = pen * 1e6 / kMoves;
    state.counters["ns/stamp"] = pen * 1e9 / stamps;
    state.counters["ns/stamp barest"] = limit * 1e9 / stamps;
    state.counters["over barest"] = pen / limit;
  } catch (const std::exception& error) {
    state.SkipWithError(error.what());
  }
}
BENCHMARK(besideBarest)
    ->Name("render/beside_barest_size")
    ->Arg(6)
    ->Arg(16)
    ->Iterations(40)
    ->UseManualTime()
    ->Unit(benchmark::kMicrosecond);

}  // namespace
