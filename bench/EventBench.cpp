#include "EventBench.h"

#include <algorithm>
#include <chrono>
#include <cmath>
#include <cstddef>
#include <cstdio>
#include <vector>

#include "BenchPen.h"
#include "base/RectF.h"
#include "engine/MotionEvent.h"
#include "ink/Ink.h"
#include "ink/InkmlReader.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "play/StrokeFeeder.h"

namespace QeltBench {
namespace {

using Clock = std::chrono::steady_clock;

double microseconds(Clock::duration duration) {
  return std::chrono::duration<double, std::micro>(duration).count();
}

double percentile(std::vector<double> values, double share) {
  const auto at = static_cast<std::ptrdiff_t>(share * static_cast<double>(values.size() - 1));
  std::nth_element(values.begin(), values.begin() + at, values.end());
  return values[static_cast<std::size_t>(at)];
}

}  // namespace

void reportEvents(const std::string& inkPath) {
  const QeltDesktop::Page page = QeltDesktop::readInkmlFile(inkPath);
  std::vector<double> costs;
  for (int round = 0; round < 20; ++round) {
    BenchPen bench(8, 6.0f);
    Qelt::PenStrokeDrawableGL* drawable = bench.pen().GetStrokeDrawableGL();
    drawable->SetCanvas(&bench.canvas());
    for (const auto& stroke : page.strokes) {
      const auto pointer = QeltDesktop::pointerFor(stroke, {}, {});
      QeltDesktop::feedLive(stroke, pointer, 1, false, [&](QeltDesktop::LiveEvent& live) {
        Qelt::RectF rect;
        const auto begin = Clock::now();
        drawable->Draw(&live.event, &rect);
        const auto end = Clock::now();
        bench.drain();
        // The first round warms up.
        if (round > 0 && live.event.GetAction() == Qelt::kActionMove)
          costs.push_back(microseconds(end - begin));
      });
    }
  }
  std::printf("move events of %s, one sample each: median %.2f us, p99 %.2f us (%zu events)\n",
              inkPath.c_str(), percentile(costs, 0.5), percentile(costs, 0.99), costs.size());
}

void reportLongStroke() {
  constexpr int kPoints = 100000;
  BenchPen bench(8, 6.0f);
  Qelt::PenStrokeDrawableGL* drawable = bench.pen().GetStrokeDrawableGL();
  drawable->SetCanvas(&bench.canvas());
  const Qelt::PointerProperties stylus{0, Qelt::kToolStylus};
  std::vector<double> costs;
  for (int i = 0; i < kPoints; ++i) {
    const float angle = 0.02f * static_cast<float>(i % 31416);
    const Qelt::PointerCoords at{600.0f + 500.0f * std::cos(angle), 600.0f + 500.0f * std::sin(angle), 0.6f,
                                 0.3f, 0.2f};
    const Qelt::MotionEvent event(0, i, i == 0 ? Qelt::kActionDown : Qelt::kActionMove, 1, &stylus, &at, 0,
                                  Qelt::kSourceStylus, 0);
    Qelt::RectF rect;
    const auto begin = Clock::now();
    drawable->Draw(&event, &rect);
    costs.push_back(microseconds(Clock::now() - begin));
    bench.drain();
  }
  const std::vector<double> early(costs.begin() + 1000, costs.begin() + 2000);
  const std::vector<double> late(costs.end() - 1000, costs.end());
  std::printf("a stroke of %d points: an early event %.2f us, a late one %.2f us (medians of 1000)\n",
              kPoints, percentile(early, 0.5), percentile(late, 0.5));
}

}  // namespace QeltBench
