#pragma once

#include <vector>

#include "engine/MotionEvent.h"

namespace QeltBench {

// How the pen is held along a stroke: always the same way, as a tablet reports that knows no tilt; or turning
// and leaning a little further from sample to sample.
enum class Attitude { Still, Turning };

// A stroke drawn live along a long gentle curve with changing pressure, 10 units from sample to sample, which
// is the median of real ink: a down, then so many moves of so many samples each.
struct LiveStroke {
  LiveStroke(int moveCount, int samplesPerMove, Attitude attitude);

  Qelt::MotionEvent down;
  std::vector<Qelt::MotionEvent> moves;
};

}  // namespace QeltBench
