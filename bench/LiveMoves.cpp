#include "LiveMoves.h"

#include <cmath>

namespace QeltBench {
namespace {

constexpr float kUnitsPerSample = 10.0f;

Qelt::PointerCoords sampleAt(int i, Attitude attitude) {
  const auto at = static_cast<float>(i);
  const float angle = 0.02f * at;
  const float radius = kUnitsPerSample / 0.02f;
  const float swing = attitude == Attitude::Turning ? std::sin(0.05f * at) : 0.0f;
  return {600.0f + radius * std::cos(angle), 600.0f + radius * std::sin(angle),
          0.6f + 0.2f * std::sin(0.3f * at), (attitude == Attitude::Turning ? 0.77f : 0.4f) + 0.02f * swing,
          0.5f + 0.1f * swing};
}

Qelt::MotionEvent eventOf(int action, int firstSample, int samples, Attitude attitude) {
  const Qelt::PointerProperties stylus{0, Qelt::kToolStylus};
  Qelt::PointerCoords coords = sampleAt(firstSample, attitude);
  Qelt::MotionEvent event(0, firstSample, action, 1, &stylus, &coords, 0, Qelt::kSourceStylus, 0);
  for (int i = 1; i < samples; ++i) {
    coords = sampleAt(firstSample + i, attitude);
    event.AddBatch(firstSample + i, &coords);
  }
  return event;
}

}  // namespace

LiveStroke::LiveStroke(int moveCount, int samplesPerMove, Attitude attitude)
    : down(eventOf(Qelt::kActionDown, 0, 1, attitude)) {
  for (int i = 0; i < moveCount; ++i)
    moves.push_back(eventOf(Qelt::kActionMove, 1 + i * samplesPerMove, samplesPerMove, attitude));
}

}  // namespace QeltBench
