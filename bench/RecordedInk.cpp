#include "RecordedInk.h"

#include <algorithm>
#include <cstddef>

#include "Stopwatch.h"
#include "base/RectF.h"
#include "ink/Ink.h"
#include "ink/InkmlReader.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "play/StrokeFeeder.h"

namespace QeltBench {

std::string& inkPath() {
  static std::string path = QELT_SAMPLE_INK;
  return path;
}

std::vector<std::vector<Qelt::MotionEvent>> recordedStrokes() {
  std::vector<std::vector<Qelt::MotionEvent>> strokes;
  for (const auto& stroke : QeltDesktop::readInkmlFile(inkPath()).strokes) {
    auto& events = strokes.emplace_back();
    QeltDesktop::feedLive(stroke, QeltDesktop::pointerFor(stroke, {}, {}), 1, false,
                          [&events](QeltDesktop::LiveEvent& live) { events.push_back(live.event); });
  }
  return strokes;
}

void EventCosts::add(double seconds) {
  if (mNext == mFastest.size()) mFastest.push_back(seconds);
  mFastest[mNext] = std::min(mFastest[mNext], seconds);
  ++mNext;
}

double EventCosts::percentile(double share) const {
  if (mFastest.empty()) return 0.0;
  std::vector<double> costs = mFastest;
  const auto at = static_cast<std::ptrdiff_t>(share * static_cast<double>(costs.size() - 1));
  std::nth_element(costs.begin(), costs.begin() + at, costs.end());
  return costs[static_cast<std::size_t>(at)] * 1e6;
}

void drawRecorded(BenchPen& bench, const std::vector<Qelt::MotionEvent>& stroke, EventCosts& costs) {
  Qelt::PenStrokeDrawableGL* drawable = bench.pen().GetStrokeDrawableGL();
  drawable->SetCanvas(&bench.canvas());
  Qelt::RectF rect;
  for (const Qelt::MotionEvent& event : stroke) {
    const Stopwatch watch;
    drawable->Draw(&event, &rect);
    const double cost = watch.seconds();
    bench.drain();
    if (event.GetAction() == Qelt::kActionMove) costs.add(cost);
  }
}

}  // namespace QeltBench
