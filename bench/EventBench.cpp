#include <benchmark/benchmark.h>

#include <algorithm>
#include <cmath>
#include <exception>
#include <vector>

#include "BenchPen.h"
#include "RecordedInk.h"
#include "Stopwatch.h"
#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "pencommon/PenStrokeDrawableGL.h"

// Microseconds of the main thread an event: of recorded ink, one sample each; with nothing to draw; early and
// late in a long stroke.
namespace {

using QeltBench::BenchPen;
using QeltBench::EventCosts;
using QeltBench::Stopwatch;

void recordedEvents(benchmark::State& state) {
  try {
    const auto strokes = QeltBench::recordedStrokes();
    BenchPen bench(8, 6.0f);
    EventCosts costs;
    for (auto _ : state) {
      costs.restart();
      for (const auto& stroke : strokes) QeltBench::drawRecorded(bench, stroke, costs);
    }
    state.counters["us/event"] = costs.percentile(0.5);
    state.counters["us/event p99"] = costs.percentile(0.99);
  } catch (const std::exception& error) {
    state.SkipWithError(error.what());
  }
}
BENCHMARK(recordedEvents)->Name("event/recorded");

Qelt::MotionEvent sampleEvent(int action, int time, float x, float y) {
  const Qelt::PointerProperties stylus{0, Qelt::kToolStylus};
  const Qelt::PointerCoords at{x, y, 0.6f, 0.3f, 0.2f};
  return Qelt::MotionEvent(0, time, action, 1, &stylus, &at, 0, Qelt::kSourceStylus, 0);
}

// The fixed cost of an event: a move too short to place anything is handed over all the same. So this is a
// batch with some room, four tasks and four posts.
void shortEvent(benchmark::State& state) {
  BenchPen bench(8, 6.0f);
  Qelt::PenStrokeDrawableGL* drawable = bench.pen().GetStrokeDrawableGL();
  drawable->SetCanvas(&bench.canvas());
  Qelt::RectF rect;
  const Qelt::MotionEvent down = sampleEvent(Qelt::kActionDown, 0, 100.0f, 100.0f);
  const Qelt::MotionEvent move = sampleEvent(Qelt::kActionMove, 1, 100.5f, 100.0f);
  drawable->Draw(&down, &rect);
  bench.drain();
  double fastest = 1.0;
  for (auto _ : state) {
    const Stopwatch watch;
    drawable->Draw(&move, &rect);
    const double cost = watch.seconds();
    fastest = std::min(fastest, cost);
    state.SetIterationTime(cost);
    bench.drain();
  }
  state.counters["us/event"] = fastest * 1e6;
}
BENCHMARK(shortEvent)->Name("event/fixed")->UseManualTime();

// The cost of an event must not grow with the stroke. Medians of the first and the last thousand events.
void longStroke(benchmark::State& state) {
  constexpr int kPoints = 100000;
  EventCosts early, late;
  for (auto _ : state) {
    BenchPen bench(8, 6.0f);
    Qelt::PenStrokeDrawableGL* drawable = bench.pen().GetStrokeDrawableGL();
    drawable->SetCanvas(&bench.canvas());
    early.restart();
    late.restart();
    for (int i = 0; i < kPoints; ++i) {
      const float angle = 0.02f * static_cast<float>(i % 31416);
      const Qelt::MotionEvent event =
          sampleEvent(i == 0 ? Qelt::kActionDown : Qelt::kActionMove, i, 600.0f + 500.0f * std::cos(angle),
                      600.0f + 500.0f * std::sin(angle));
      Qelt::RectF rect;
      const Stopwatch watch;
      drawable->Draw(&event, &rect);
      const double cost = watch.seconds();
      bench.drain();
      if (i >= 1000 && i < 2000) early.add(cost);
      if (i >= kPoints - 1000) late.add(cost);
    }
  }
  state.counters["us/event early"] = early.percentile(0.5);
  state.counters["us/event late"] = late.percentile(0.5);
}
BENCHMARK(longStroke)->Name("event/long_stroke")->Iterations(1);

}  // namespace
