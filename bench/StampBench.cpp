#include <benchmark/benchmark.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <vector>

#include "Floor.h"
#include "base/Vector.h"
#include "graphics/SmPath.h"
#include "outline/Pencil2OutlineDrawableRTV1.h"
#include "render/RenderDrawables.h"
#include "stroke/placing/StampWalk.h"

// Nanoseconds a stamp for what surrounds the walk: the bytes alone, and the pen's vertices.
namespace {

constexpr int kStampsPerBatch = 100;  // about a move event's

void countStamps(benchmark::State& state) {
  state.counters["ns/stamp"] =
      benchmark::Counter(static_cast<double>(state.iterations()) * kStampsPerBatch * 1e-9,
                         benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
}

// (a) Appending 66 prepared floats to a batch reserved once.
void appendPreparedStamps(benchmark::State& state) {
  std::vector<float> batch;
  batch.reserve(kStampsPerBatch * QeltBench::kStampFloats);
  QeltBench::Stamp stamp;
  stamp.fill(1.5f);
  for (auto _ : state) {
    batch.clear();
    for (int i = 0; i < kStampsPerBatch; ++i) {
      benchmark::DoNotOptimize(stamp);
      QeltBench::appendPrepared(batch, stamp);
    }
    benchmark::ClobberMemory();
  }
  countStamps(state);
}
BENCHMARK(appendPreparedStamps)->Name("a/append_prepared");

template <typename Appender, typename Renderer>
void addStamps(Renderer& renderer) {
  constexpr int kAtOnce = Qelt::kStampsAtOnce;
  std::array<Qelt::SmPoint, kAtOnce> centres;
  std::array<float, kAtOnce> sizes, alphas;
  centres.fill({10.3f, 20.7f});
  sizes.fill(3.2f);
  alphas.fill(0.1f);
  Appender appender(renderer, kStampsPerBatch);
  for (int i = 0; i < kStampsPerBatch; i += kAtOnce) {
    const int count = std::min(kAtOnce, kStampsPerBatch - i);
    // Hidden from the compiler, so that nothing is worked out ahead.
    benchmark::DoNotOptimize(centres);
    benchmark::DoNotOptimize(sizes);
    benchmark::DoNotOptimize(alphas);
    appender.AddPoints({count, centres.data(), sizes.data(), alphas.data(), 1}, {0.2f, {-0.6f, 0.8f}});
  }
}

// (b) AddPoints alone, as the walk calls it.
template <typename Renderer>
void addPoint(benchmark::State& state) {
  Renderer renderer(nullptr);
  std::vector<float> batch;
  batch.reserve(kStampsPerBatch * Renderer::kFloatsPerStamp);
  renderer.SetBuffer(&batch);
  for (auto _ : state) {
    batch.clear();
    addStamps<typename Renderer::Appender>(renderer);
    benchmark::ClobberMemory();
  }
  countStamps(state);
}
BENCHMARK(addPoint<Qelt::Pencil2StrokeDrawableRTV1>)->Name("b/AddPoint_RTV1");
BENCHMARK(addPoint<Qelt::Pencil2StrokeDrawableRTV2>)->Name("b/AddPoint_RTV2");
BENCHMARK(addPoint<Qelt::Pencil2StrokeDrawableRTV3>)->Name("b/AddPoint_RTV3");
BENCHMARK(addPoint<Qelt::Pencil2PreviewDrawableRT>)->Name("b/AddPoint_preview");
BENCHMARK(addPoint<Qelt::Pencil2PredictionDrawableRT>)->Name("b/AddPoint_prediction");

// The outline's stamps go into two streams.
void addOutlinePoint(benchmark::State& state) {
  Qelt::Pencil2OutlineDrawableRTV1 renderer(nullptr);
  std::vector<float> inner, outer;
  inner.reserve(kStampsPerBatch * 6 * Qelt::kOutlineVertex.floats());
  outer.reserve(inner.capacity());
  renderer.SetBuffer(&inner, &outer);
  renderer.SetOutlineSize(3.0f);
  for (auto _ : state) {
    inner.clear();
    outer.clear();
    addStamps<Qelt::Pencil2OutlineDrawableRTV1::Appender>(renderer);
    benchmark::ClobberMemory();
  }
  countStamps(state);
}
BENCHMARK(addOutlinePoint)->Name("b/AddPoint_outline");

// One call a stamp, each appending to the batch at once.
void addPointOneByOne(benchmark::State& state) {
  Qelt::Pencil2StrokeDrawableRTV3 renderer(nullptr);
  std::vector<float> batch;
  batch.reserve(kStampsPerBatch * QeltBench::kStampFloats);
  renderer.SetBuffer(&batch);
  const Qelt::Vector2<float> point[] = {{10.3f, 20.7f}, {-0.6f, 0.8f}};
  float size = 3.2f;
  for (auto _ : state) {
    batch.clear();
    for (int i = 0; i < kStampsPerBatch; ++i) {
      benchmark::DoNotOptimize(point);
      benchmark::DoNotOptimize(size);
      renderer.AddPoint(point, size, 0.1f, 0.2f, 1);
    }
    benchmark::ClobberMemory();
  }
  countStamps(state);
}
BENCHMARK(addPointOneByOne)->Name("b/AddPoint_RTV3_one_by_one");

// (c) The cheapest honest walk, on segments of a typical event's length.
void cheapWalk(benchmark::State& state) {
  std::size_t stamps = 0;
  for (auto _ : state) stamps += QeltBench::walkCheaply();
  state.counters["ns/stamp"] = benchmark::Counter(static_cast<double>(stamps) * 1e-9,
                                                  benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
}
BENCHMARK(cheapWalk)->Name("c/cheap_walk");

}  // namespace
