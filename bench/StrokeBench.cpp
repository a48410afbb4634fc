#include <benchmark/benchmark.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <numeric>
#include <vector>

#include "BenchPen.h"
#include "LiveMoves.h"
#include "Stopwatch.h"
#include "base/PointF.h"
#include "base/RectF.h"
#include "desktop/pencommon/BatchObserver.h"
#include "graphics/SmPath.h"
#include "pen/RenderingVersions.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "stroke/placing/SegmentPath.h"
#include "stroke/placing/StampWalk.h"

// Nanoseconds a stamp of a live move event, the whole road on the main thread: the pen, the host's path, the
// tasks and their posting.
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
BENCHMARK_CAPTURE(liveMove, still, Attitude::Still)
    ->Name("d/live_move_V")
    ->Apply(eachStrokeClass)
    ->UseManualTime();
BENCHMARK_CAPTURE(liveMove, turning, Attitude::Turning)->Name("d/turning_move_V")->Arg(8)->UseManualTime();

// What of (d) is the host's: its path alone, built and asked for the places of the same stamps.
void hostPath(benchmark::State& state) {
  struct NoStamps {
    std::array<Qelt::SmPoint, Qelt::kStampsAtOnce> at;
    Qelt::SmPoint* places() { return at.data(); }
    void place(int) {}
    void passOver(float) {}
  };
  constexpr float kSpacing = 0.4f;
  const LiveStroke stroke(kEvents, kSamplesPerEvent, Attitude::Still);
  std::vector<double> fastest(stroke.moves.size(), 1.0);
  std::int64_t stamps = 0;
  for (auto _ : state) {
    Qelt::SegmentPath path;
    path.start({stroke.down.GetX(0), stroke.down.GetY(0)});
    float carried = kSpacing;
    NoStamps run;
    double seconds = 0.0;
    for (std::size_t i = 0; i < stroke.moves.size(); ++i) {
      const Qelt::MotionEvent& move = stroke.moves[i];
      const Stopwatch watch;
      for (int sample = 0; sample < kSamplesPerEvent; ++sample) {
        const bool isLast = sample + 1 == kSamplesPerEvent;
        const Qelt::PointF to = isLast
                                    ? Qelt::PointF{move.GetX(0), move.GetY(0)}
                                    : Qelt::PointF{move.GetHistoricalX(sample), move.GetHistoricalY(sample)};
        const float length = path.extend(to, Qelt::Smoothing::Curve);
        const Qelt::WalkResult walk =
            Qelt::walkSpaced(path.path(), carried, kSpacing, length, Qelt::kMostStampsPerSegment, run);
        path.setLast(to);
        carried = walk.carry;
        stamps += walk.stamps;
        benchmark::DoNotOptimize(run);
      }
      const double cost = watch.seconds();
      fastest[i] = std::min(fastest[i], cost);
      seconds += cost;
    }
    state.SetIterationTime(seconds);
  }
  state.counters["ns/stamp"] = std::accumulate(fastest.begin(), fastest.end(), 0.0) * 1e9 *
                               static_cast<double>(state.iterations()) / static_cast<double>(stamps);
}
BENCHMARK(hostPath)->Name("d/host_path_alone")->UseManualTime();

}  // namespace
