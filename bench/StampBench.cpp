#include <benchmark/benchmark.h>

#include <cstddef>
#include <vector>

#include "Floor.h"
#include "base/Vector.h"
#include "outline/Pencil2OutlineDrawableRTV1.h"
#include "render/RenderDrawables.h"

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

// The inputs are hidden from the compiler, so that nothing is worked out ahead.
struct Inputs {
  Qelt::Vector2<float> point[2] = {{10.3f, 20.7f}, {-0.6f, 0.8f}};
  float size = 3.2f;
};

template <typename Appender, typename Renderer>
void addStamps(Renderer& renderer) {
  Inputs in;
  Appender(renderer, kStampsPerBatch).AddPoints(kStampsPerBatch, {0.2f, in.point[1]}, [&in](int) {
    benchmark::DoNotOptimize(in);
    return Qelt::PlacedStamp{{in.point[0].x, in.point[0].y}, in.size, 0.1f, 1};
  });
}

// (b) AddPoints alone, as the walk calls it.
template <typename Renderer>
void addPoint(benchmark::State& state) {
  Renderer renderer(nullptr);
  std::vector<float> batch;
  batch.reserve(kStampsPerBatch * Renderer::kFloatsPerStamp);
  renderer.SetBuffer(&batch);
  Inputs in;
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
  Inputs in;
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
  Inputs in;
  for (auto _ : state) {
    batch.clear();
    for (int i = 0; i < kStampsPerBatch; ++i) {
      benchmark::DoNotOptimize(in);
      renderer.AddPoint(in.point, in.size, 0.1f, 0.2f, 1);
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
