#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <numeric>
#include <vector>

#include "BenchPen.h"
#include "LiveMoves.h"
#include "Stopwatch.h"
#include "base/RectF.h"
#include "desktop/pencommon/BatchObserver.h"
#include "pen/RenderingVersions.h"
#include "pencommon/PenStrokeDrawableGL.h"

// Nanoseconds a stamp of a live move event, the whole road on the main thread: the pen, the host's path, the
// tasks and their posting; and what of that every event costs, however little it draws.
namespace {

using QeltBench::Attitude;
using QeltBench::BenchPen;
using QeltBench::LiveStroke;
using QeltBench::Stopwatch;

constexpr int kEvents = 500;
constexpr int kSamplesPerEvent = 4;

struct MoveCost {
  double seconds;  // of all moves, each in its fastest round
  double stamps;
};

// Draws the stroke again and again. Of each move the fastest round counts: whatever else runs on the machine
// only ever adds. The tasks run outside the clock.
MoveCost drawAgain(benchmark::State& state, int version, const LiveStroke& stroke) {
  BenchPen bench(version, 6.0f);
  Qelt::PenStrokeDrawableGL* drawable = bench.pen().GetStrokeDrawableGL();
  drawable->SetCanvas(&bench.canvas());
  std::vector<double> fastest(stroke.moves.size(), 1.0);
  const std::uint64_t before = QeltDesktop::writtenBytes();
  Qelt::RectF rect;
  for (auto _ : state) {
    double seconds = 0.0;
    drawable->Draw(&stroke.down, &rect);
    bench.drain();
    for (std::size_t i = 0; i < stroke.moves.size(); ++i) {
      const Stopwatch watch;
      drawable->Draw(&stroke.moves[i], &rect);
      const double cost = watch.seconds();
      fastest[i] = std::min(fastest[i], cost);
      seconds += cost;
      bench.drain();
    }
    state.SetIterationTime(seconds);
  }
  const auto bytes = static_cast<double>(QeltDesktop::writtenBytes() - before);
  const auto& row = Qelt::kRenderingVersions[static_cast<std::size_t>(version - 1)];
  return {std::accumulate(fastest.begin(), fastest.end(), 0.0),
          bytes / static_cast<double>(state.iterations()) /
              (6.0 * row.floatsPerVertex * static_cast<double>(sizeof(float)))};
}

// (d) for version 8; the other versions beside it.
void liveMove(benchmark::State& state, Attitude attitude) {
  const LiveStroke stroke(kEvents, kSamplesPerEvent, attitude);
  const MoveCost cost = drawAgain(state, static_cast<int>(state.range(0)), stroke);
  state.counters["ns/stamp"] = cost.seconds / cost.stamps * 1e9;
}
// Each class of stroke drawable once.
void eachStrokeClass(benchmark::internal::Benchmark* bench) {
  for (const Qelt::RenderingVersion& version : Qelt::kRenderingVersions) {
    if (version.drawnBy == version.strokeVersion) bench->Arg(version.number);
  }
}
BENCHMARK_CAPTURE(liveMove, still, Attitude::Still)->Name("d/live_move_V")->Apply(eachStrokeClass)->UseManualTime();
BENCHMARK_CAPTURE(liveMove, turning, Attitude::Turning)->Name("d/turning_move_V")->Arg(8)->UseManualTime();

// The fixed cost of an event: the pen is up, so that a move places nothing and is handed over all the same:
// an empty batch, four tasks, four posts.
void emptyEvent(benchmark::State& state) {
  BenchPen bench(8, 6.0f);
  Qelt::PenStrokeDrawableGL* drawable = bench.pen().GetStrokeDrawableGL();
  drawable->SetCanvas(&bench.canvas());
  const LiveStroke stroke(1, 1, Attitude::Still);
  double fastest = 1.0;
  Qelt::RectF rect;
  for (auto _ : state) {
    const Stopwatch watch;
    drawable->Draw(&stroke.moves.front(), &rect);
    const double cost = watch.seconds();
    fastest = std::min(fastest, cost);
    state.SetIterationTime(cost);
    bench.drain();
  }
  state.counters["ns/event"] = fastest * 1e9;
}
BENCHMARK(emptyEvent)->Name("event/empty")->UseManualTime();

}  // namespace
