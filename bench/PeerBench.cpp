#include <benchmark/benchmark.h>
#include <mypaint-brush.h>
#include <mypaint-fixed-tiled-surface.h>

#include <cmath>
#include <cstdint>
#include <exception>
#include <fstream>
#include <iterator>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "BenchPen.h"
#include "RecordedInk.h"
#include "Stopwatch.h"
#include "engine/MotionEvent.h"

// Our pen beside a peer's: libmypaint with its classic pencil draws the same recording, stroke by stroke in
// turns with ours. What either does to decide on its stamps (there: dabs) is taken by itself; the peer's
// drawing of them, which here is the render thread's, is a figure of its own. Built only where libmypaint and
// its brushes are installed (Debian: libmypaint-dev and mypaint-brushes).
namespace {

using QeltBench::BenchPen;
using QeltBench::EventCosts;
using QeltBench::Stopwatch;

constexpr float kWidth = 6.0f;  // stroke units, ours and the peer's
constexpr int kSurfaceSide = 1024;

class PeerPencil {
 public:
  PeerPencil()
      : mBrush(mypaint_brush_new(), mypaint_brush_unref),
        mSurface(mypaint_fixed_tiled_surface_interface(
                     mypaint_fixed_tiled_surface_new(kSurfaceSide, kSurfaceSide)),
                 mypaint_surface_unref) {
    std::ifstream file(QELT_PEER_BRUSH);
    const std::string settings{std::istreambuf_iterator<char>(file), {}};
    mypaint_brush_from_defaults(mBrush.get());
    if (!mypaint_brush_from_string(mBrush.get(), settings.c_str()))
      throw std::runtime_error("the peer cannot read its brush " QELT_PEER_BRUSH);
    mypaint_brush_set_base_value(mBrush.get(), MYPAINT_BRUSH_SETTING_RADIUS_LOGARITHMIC,
                                 std::log(kWidth / 2.0f));
  }

  void draw(const std::vector<Qelt::MotionEvent>& stroke, EventCosts& deciding, EventCosts& drawing) {
    mypaint_brush_reset(mBrush.get());
    mypaint_brush_new_stroke(mBrush.get());
    std::int64_t last = stroke.front().GetEventTime();
    for (const Qelt::MotionEvent& event : stroke) {
      const double seconds = static_cast<double>(event.GetEventTime() - last) / 1000.0;
      last = event.GetEventTime();
      mypaint_surface_begin_atomic(mSurface.get());
      const Stopwatch decidingWatch;
      mypaint_brush_stroke_to(mBrush.get(), mSurface.get(), event.GetX(0), event.GetY(0),
                              event.GetPressure(0), 0.0f, 0.0f, seconds);
      const double decided = decidingWatch.seconds();
      const Stopwatch drawingWatch;
      mypaint_surface_end_atomic(mSurface.get(), nullptr);
      const double drawn = drawingWatch.seconds();
      if (event.GetAction() != Qelt::kActionMove) continue;
      deciding.add(decided);
      drawing.add(drawn);
    }
  }

 private:
  std::unique_ptr<MyPaintBrush, void (*)(MyPaintBrush*)> mBrush;
  std::unique_ptr<MyPaintSurface, void (*)(MyPaintSurface*)> mSurface;
};

void besidePeer(benchmark::State& state) {
  try {
    const auto strokes = QeltBench::recordedStrokes();
    BenchPen bench(8, kWidth);
    PeerPencil peer;
    EventCosts ours, peers, peersDrawing;
    for (auto _ : state) {
      for (EventCosts* costs : {&ours, &peers, &peersDrawing}) costs->restart();
      for (const auto& stroke : strokes) {
        QeltBench::drawRecorded(bench, stroke, ours);
        peer.draw(stroke, peers, peersDrawing);
      }
    }
    state.counters["us/event ours"] = ours.percentile(0.5);
    state.counters["us/event ours p99"] = ours.percentile(0.99);
    state.counters["us/event peer"] = peers.percentile(0.5);
    state.counters["us/event peer p99"] = peers.percentile(0.99);
    state.counters["us/event peer draws"] = peersDrawing.percentile(0.5);
    state.counters["ours/peer"] = ours.percentile(0.5) / peers.percentile(0.5);
    state.counters["ours/peer p99"] = ours.percentile(0.99) / peers.percentile(0.99);
  } catch (const std::exception& error) {
    state.SkipWithError(error.what());
  }
}
BENCHMARK(besidePeer)->Name("event/beside_peer");

}  // namespace
