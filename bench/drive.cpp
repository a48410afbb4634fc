#include <cstdint>
#include <cstdio>
#include <cstring>
#include <exception>
#include <memory>
#include <string>

#include "BenchPen.h"
#include "Floor.h"
#include "LiveMoves.h"
#include "base/RectF.h"
#include "desktop/pencommon/BatchObserver.h"
#include "engine/MotionEvent.h"
#include "pencommon/PenStrokeDrawableGL.h"

// Runs one of the benchmarks' subjects a fixed number of times, without a clock, for a tool that counts
// instructions (bench/count-instructions), and prints how many events and stamps that were.
namespace {

using QeltBench::Attitude;
using QeltBench::BenchPen;
using QeltBench::LiveStroke;

constexpr int kEvents = 2000;
constexpr int kSamplesPerEvent = 4;

// Whatever is to be counted runs inside a function of this name.
template <typename Call>
[[gnu::noinline]] void counted(Call&& call) {
  call();
  // Keeps the call from being the last thing done, and so this function on the stack.
  asm volatile("" ::: "memory");
}

void report(int events, std::uint64_t stamps) {
  std::printf("events %d stamps %llu\n", events, static_cast<unsigned long long>(stamps));
}

// Live moves of version 8; the render thread's share runs outside what is counted.
void drawMoves(int samplesPerEvent, Attitude attitude) {
  BenchPen bench(8, 6.0f);
  Qelt::PenStrokeDrawableGL* drawable = bench.pen().GetStrokeDrawableGL();
  drawable->SetCanvas(&bench.canvas());
  const LiveStroke stroke(kEvents, samplesPerEvent, attitude);
  Qelt::RectF rect;
  drawable->Draw(&stroke.down, &rect);
  bench.drain();
  const std::uint64_t before = QeltDesktop::writtenBytes();
  for (const Qelt::MotionEvent& move : stroke.moves) {
    counted([&] { drawable->Draw(&move, &rect); });
    bench.drain();
  }
  report(kEvents, (QeltDesktop::writtenBytes() - before) / (QeltBench::kStampFloats * sizeof(float)));
}

// Moves too short to place anything: what is left is what any event costs.
void drawNothing() {
  BenchPen bench(8, 6.0f);
  Qelt::PenStrokeDrawableGL* drawable = bench.pen().GetStrokeDrawableGL();
  drawable->SetCanvas(&bench.canvas());
  const LiveStroke stroke(0, 1, Attitude::Still);
  const Qelt::PointerProperties stylus{0, Qelt::kToolStylus};
  const Qelt::PointerCoords at{stroke.down.GetX(0) + 0.5f, stroke.down.GetY(0), 0.6f, 0.4f, 0.5f};
  const Qelt::MotionEvent move(0, 1, Qelt::kActionMove, 1, &stylus, &at, 0, Qelt::kSourceStylus, 0);
  Qelt::RectF rect;
  drawable->Draw(&stroke.down, &rect);
  bench.drain();
  for (int i = 0; i < kEvents; ++i) {
    counted([&] { drawable->Draw(&move, &rect); });
    bench.drain();
  }
  report(kEvents, 0);
}

void walkTheFloor() {
  std::uint64_t stamps = 0;
  for (int i = 0; i < kEvents; ++i) {
    counted([&] { stamps += QeltBench::walkCheaply(); });
  }
  report(kEvents, stamps);
}

}  // namespace

int main(int argc, char** argv) {
  const std::string what = argc == 2 ? argv[1] : "";
  try {
    if (what == "moves") {
      drawMoves(kSamplesPerEvent, Attitude::Still);
    } else if (what == "turning") {
      drawMoves(kSamplesPerEvent, Attitude::Turning);
    } else if (what == "single") {
      drawMoves(1, Attitude::Still);
    } else if (what == "empty") {
      drawNothing();
    } else if (what == "cheap") {
      walkTheFloor();
    } else {
      std::fprintf(stderr, "usage: qelt-bench-drive moves|turning|single|empty|cheap\n");
      return 2;
    }
  } catch (const std::exception& error) {
    std::fprintf(stderr, "%s\n", error.what());
    return 1;
  }
  return 0;
}
