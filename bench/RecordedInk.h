#pragma once

#include <string>
#include <vector>

#include "BenchPen.h"
#include "engine/MotionEvent.h"

namespace QeltBench {

// Which ink file the benchmarks of recorded events draw; the program's option --ink sets it.
std::string& inkPath();

// The strokes of the ink file as a person draws them, one sample an event. Throws std::runtime_error when the
// ink cannot be read.
std::vector<std::vector<Qelt::MotionEvent>> recordedStrokes();

// What each move event of a recording costs, in its fastest round: whatever else runs on the machine only
// ever adds.
class EventCosts {
 public:
  // Begins the next round.
  void restart() { mNext = 0; }
  void add(double seconds);
  // Of all events; `share`: 0.5 is the median. Microseconds.
  double percentile(double share) const;

 private:
  std::vector<double> mFastest;
  std::size_t mNext = 0;
};

// Draws a stroke live with the pen and notes what its moves cost the main thread. The tasks run outside the
// clock.
void drawRecorded(BenchPen& bench, const std::vector<Qelt::MotionEvent>& stroke, EventCosts& costs);

}  // namespace QeltBench
