#include <benchmark/benchmark.h>

#include <cmath>
#include <memory>
#include <vector>

#include "BenchPen.h"
#include "BenchStroke.h"
#include "base/RectF.h"
#include "model/ObjectStroke.h"
#include "pencommon/PenStrokeDataManager.h"
#include "pencommon/PenStrokeDrawableGL.h"

// What redrawing stored strokes costs the main thread, from the cache and without it.
namespace {

using QeltBench::BenchPen;
using QeltBench::makeStroke;

// One stroke of so many points; `cached`: its floats are in the cache.
void redraw(benchmark::State& state, bool cached) {
  BenchPen bench(8, 6.0f);
  Qelt::PenStrokeDrawableGL* drawable = bench.pen().GetStrokeDrawableGL();
  drawable->SetCanvas(&bench.canvas());
  const auto stroke = makeStroke(static_cast<int>(state.range(0)), 100.0f, 100.0f);
  auto* cache = Qelt::PenStrokeDataManager::GetInstance();
  if (cached) cache->CreateStrokeData(stroke->GetRuntimeHandle());
  Qelt::RectF rect;
  drawable->RedrawPen(stroke.get(), &rect);
  bench.drain();
  for (auto _ : state) {
    drawable->RedrawPen(stroke.get(), &rect);
    state.PauseTiming();
    bench.drain();
    state.ResumeTiming();
  }
  if (cached) cache->DropStrokeData(stroke->GetRuntimeHandle());
}

void redrawCached(benchmark::State& state) {
  redraw(state, true);
}
void redrawComputed(benchmark::State& state) {
  redraw(state, false);
}
BENCHMARK(redrawCached)->Name("redraw/cached")->Arg(1000)->Arg(10000);
BENCHMARK(redrawComputed)->Name("redraw/computed")->Arg(1000);

// A page of 2,000 strokes of 40 points.
void redrawPage(benchmark::State& state) {
  const bool cached = state.range(0) != 0;
  BenchPen bench(8, 6.0f);
  Qelt::PenStrokeDrawableGL* drawable = bench.pen().GetStrokeDrawableGL();
  drawable->SetCanvas(&bench.canvas());
  auto* cache = Qelt::PenStrokeDataManager::GetInstance();
  std::vector<std::unique_ptr<Qelt::ObjectStroke>> page;
  for (int i = 0; i < 2000; ++i) {
    page.push_back(makeStroke(40, static_cast<float>(i % 40) * 30.0f, static_cast<float>(i / 40) * 30.0f));
    if (cached) cache->CreateStrokeData(page.back()->GetRuntimeHandle());
  }
  const auto draw = [&] {
    Qelt::RectF rect;
    for (const auto& stroke : page) drawable->RedrawPen(stroke.get(), &rect);
  };
  draw();
  bench.drain();
  for (auto _ : state) {
    draw();
    state.PauseTiming();
    bench.drain();
    state.ResumeTiming();
  }
  for (const auto& stroke : page) cache->DropStrokeData(stroke->GetRuntimeHandle());
}
BENCHMARK(redrawPage)->Name("redraw/page_2000_cached")->Arg(1)->Unit(benchmark::kMillisecond);
BENCHMARK(redrawPage)->Name("redraw/page_2000_computed")->Arg(0)->Unit(benchmark::kMillisecond);

}  // namespace
