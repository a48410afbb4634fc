#include <benchmark/benchmark.h>

#include <cstdint>

#include "BenchPen.h"
#include "BenchStroke.h"
#include "base/RectF.h"
#include "desktop/pencommon/BatchObserver.h"
#include "engine/MotionEvent.h"
#include "pen/RenderingVersions.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenStrokeDrawableGL.h"

// Nanoseconds a stamp of whole calls of the other drawables, the main thread's share.
namespace {

using QeltBench::BenchPen;

constexpr int kPoints = 400;

// A waving line, 10 units from sample to sample, all but the last of it history.
Qelt::MotionEvent recorded(int action, int points) {
  const auto stroke = QeltBench::makeStroke(points, 600.0f, 600.0f);
  const Qelt::PointerProperties stylus{0, Qelt::kToolStylus};
  const auto coords = [&](int i) {
    return Qelt::PointerCoords{stroke->GetPoint()[i].x, stroke->GetPoint()[i].y, stroke->GetPressure()[i],
                               stroke->GetTilt()[i], stroke->GetOrientation()[i]};
  };
  Qelt::PointerCoords at = coords(0);
  Qelt::MotionEvent event(0, 0, action, 1, &stylus, &at, 0, Qelt::kSourceStylus, 0);
  for (int i = 1; i < points; ++i) {
    at = coords(i);
    event.AddBatch(4 * i, &at);
  }
  return event;
}

// Calls draw() again and again; the tasks run outside the clock. `floatsPerVertex`: of the first buffer.
template <typename Draw>
void measure(benchmark::State& state, BenchPen& bench, int floatsPerVertex, Draw&& draw) {
  std::uint64_t floats = 0;
  QeltDesktop::setBatchObserver(
      [&floats](const QeltDesktop::Batch& batch) { floats += batch.buffers[0].size(); });
  draw();
  bench.drain();
  const auto once = static_cast<double>(floats);
  QeltDesktop::setBatchObserver({});
  for (auto _ : state) {
    draw();
    state.PauseTiming();
    bench.drain();
    state.ResumeTiming();
  }
  const double stamps = static_cast<double>(state.iterations()) * once / (6 * floatsPerVertex);
  state.counters["ns/stamp"] =
      benchmark::Counter(stamps * 1e-9, benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
}

// One outline of a recorded stroke; the argument is the rendering version.
void outline(benchmark::State& state) {
  BenchPen bench(static_cast<int>(state.range(0)), 6.0f);
  Qelt::PenOutlineDrawableGL* drawable = bench.pen().GetOutlineDrawableGL();
  drawable->SetCanvas(&bench.canvas());
  drawable->SetOutlineSize(3.0f);
  const Qelt::MotionEvent event = recorded(Qelt::kActionUp, kPoints);
  measure(state, bench, Qelt::kOutlineFloatsPerVertex, [&] {
    Qelt::RectF rect;
    drawable->DrawOutline(&event, &rect);
  });
}
// Each class of outline drawable once.
void eachOutlineClass(benchmark::internal::Benchmark* bench) {
  for (const Qelt::RenderingVersion& version : Qelt::kRenderingVersions) {
    if (version.outlineVersion == version.number) bench->Arg(version.number);
  }
}
BENCHMARK(outline)->Name("outline_V")->Apply(eachOutlineClass);

// The sample stroke of the settings panel.
void preview(benchmark::State& state) {
  BenchPen bench(8, 6.0f);
  Qelt::PenPreviewDrawableGL* drawable = bench.pen().GetPreviewDrawableGL();
  drawable->SetCanvas(&bench.canvas());
  const Qelt::MotionEvent event = recorded(Qelt::kActionUp, kPoints);
  measure(state, bench, Qelt::kPreviewFloatsPerVertex, [&] {
    Qelt::RectF rect;
    drawable->RedrawPen(&event, &rect);
  });
}
BENCHMARK(preview)->Name("preview");

// A prediction of six samples after a live move, whose own cost is not counted.
void prediction(benchmark::State& state) {
  BenchPen bench(8, 6.0f);
  Qelt::PenStrokeDrawableGL* stroke = bench.pen().GetStrokeDrawableGL();
  Qelt::IPenPredictionDrawableGL* drawable = bench.pen().GetPredictionStrokeDrawableGL();
  stroke->SetCanvas(&bench.canvas());
  drawable->SetCanvas(&bench.canvas());
  const Qelt::MotionEvent down = recorded(Qelt::kActionDown, 1);
  const Qelt::MotionEvent move = recorded(Qelt::kActionMove, 8);
  const Qelt::MotionEvent ahead = recorded(Qelt::kActionMove, 6);
  const auto draw = [&](bool predicts) {
    Qelt::RectF rect;
    if (predicts) {
      drawable->Draw(&ahead, &rect);
    } else {
      stroke->Draw(&down, &rect);
      stroke->Draw(&move, &rect);
    }
  };
  draw(false);
  bench.drain();
  std::uint64_t floats = 0;
  QeltDesktop::setBatchObserver(
      [&floats](const QeltDesktop::Batch& batch) { floats += batch.buffers[0].size(); });
  draw(true);
  bench.drain();
  QeltDesktop::setBatchObserver({});
  for (auto _ : state) {
    state.PauseTiming();
    draw(false);
    bench.drain();
    state.ResumeTiming();
    draw(true);
    state.PauseTiming();
    bench.drain();
    state.ResumeTiming();
  }
  const double stamps = static_cast<double>(state.iterations()) * static_cast<double>(floats) /
                        (6 * Qelt::kPredictionFloatsPerVertex);
  state.counters["ns/stamp"] =
      benchmark::Counter(stamps * 1e-9, benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
}
BENCHMARK(prediction)->Name("prediction");

}  // namespace
