#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <numeric>
#include <vector>

#include "BenchPen.h"
#include "base/RectF.h"
#include "desktop/pencommon/BatchObserver.h"
#include "engine/MotionEvent.h"
#include "pen/RenderingVersions.h"
#include "pencommon/PenStrokeDrawableGL.h"

// Nanoseconds a stamp of a live move event, the whole road on the main thread: the pen, the host's path, the
// tasks and their posting.
namespace {

using Clock = std::chrono::steady_clock;
using QeltBench::BenchPen;

constexpr int kSamplesPerEvent = 4;
constexpr float kUnitsPerSample = 10.0f;  // the median of real ink

// A long gentle curve with changing pressure and a slightly tilted pen.
Qelt::PointerCoords sampleAt(int i) {
  const float angle = 0.02f * static_cast<float>(i);
  const float radius = kUnitsPerSample / 0.02f;
  return {600.0f + radius * std::cos(angle), 600.0f + radius * std::sin(angle),
          0.6f + 0.2f * std::sin(0.3f * static_cast<float>(i)), 0.4f, 0.5f};
}

Qelt::MotionEvent eventOf(int action, int firstSample, int samples) {
  const Qelt::PointerProperties stylus{0, Qelt::kToolStylus};
  Qelt::PointerCoords coords = sampleAt(firstSample);
  Qelt::MotionEvent event(0, firstSample, action, 1, &stylus, &coords, 0, Qelt::kSourceStylus, 0);
  for (int i = 1; i < samples; ++i) {
    coords = sampleAt(firstSample + i);
    event.AddBatch(firstSample + i, &coords);
  }
  return event;
}

// (d) for version 8; the other versions beside it.
void liveMove(benchmark::State& state) {
  BenchPen bench(static_cast<int>(state.range(0)), 6.0f);
  Qelt::PenStrokeDrawableGL* drawable = bench.pen().GetStrokeDrawableGL();
  drawable->SetCanvas(&bench.canvas());
  std::uint64_t floats = 0;
  QeltDesktop::setBatchObserver(
      [&floats](const QeltDesktop::Batch& batch) { floats += batch.buffers[0].size(); });

  constexpr int kEvents = 500;
  std::vector<Qelt::MotionEvent> events;
  for (int i = 0; i < kEvents; ++i)
    events.push_back(eventOf(Qelt::kActionMove, 1 + i * kSamplesPerEvent, kSamplesPerEvent));
  const Qelt::MotionEvent down = eventOf(Qelt::kActionDown, 0, 1);
  const auto& version = Qelt::kRenderingVersions[static_cast<std::size_t>(state.range(0) - 1)];
  const double floatsPerStamp = 6.0 * version.floatsPerVertex;

  // One round counts the stamps, which the observer's copying would disturb.
  Qelt::RectF rect;
  drawable->Draw(&down, &rect);
  for (const auto& event : events) drawable->Draw(&event, &rect);
  bench.drain();
  QeltDesktop::setBatchObserver({});
  const double stampsPerRound = static_cast<double>(floats) / floatsPerStamp;

  // Of each event the fastest round counts: whatever else runs on the machine only ever adds.
  std::vector<double> fastest(events.size(), 1.0);
  for (auto _ : state) {
    double seconds = 0.0;
    drawable->Draw(&down, &rect);
    for (std::size_t i = 0; i < events.size(); ++i) {
      const auto begin = Clock::now();
      drawable->Draw(&events[i], &rect);
      const double cost = std::chrono::duration<double>(Clock::now() - begin).count();
      fastest[i] = std::min(fastest[i], cost);
      seconds += cost;
      bench.drain();
    }
    state.SetIterationTime(seconds);
  }
  state.counters["ns/stamp"] = std::accumulate(fastest.begin(), fastest.end(), 0.0) / stampsPerRound * 1e9;
}
// Each class of stroke drawable once.
void eachStrokeClass(benchmark::internal::Benchmark* bench) {
  for (const Qelt::RenderingVersion& version : Qelt::kRenderingVersions) {
    if (version.drawnBy == version.strokeVersion) bench->Arg(version.number);
  }
}
BENCHMARK(liveMove)->Name("d/live_move_V")->Apply(eachStrokeClass)->UseManualTime();

}  // namespace
