#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <random>
#include <string>
#include <tuple>
#include <vector>

#include "support/DrawableBoard.h"
#include "support/Versions.h"

// What holds for every stroke, seen on strokes drawn by lot.
namespace QeltTests {
namespace {

using testing::Combine;
using testing::ValuesIn;

// A stroke of a wandering hand: steps from well below the minimum move to well above every skip distance,
// pressure and angles that drift, the orientation once around.
std::vector<Sample> strokeByLot(unsigned seed) {
  std::mt19937 random(seed);
  const auto between = [&random](float low, float high) {
    return low + (high - low) * static_cast<float>(random() % 10000) / 9999.0f;
  };
  std::vector<Sample> samples;
  const int count = 2 + static_cast<int>(random() % 40);
  Sample pen{between(50.0f, 250.0f), between(50.0f, 250.0f), between(0.0f, 1.2f), between(0.0f, 1.3f),
             between(-3.1f, 3.1f)};
  float heading = between(0.0f, 6.28f);
  for (int i = 0; i < count; ++i) {
    samples.push_back(pen);
    const float step = random() % 4 == 0   ? between(0.0f, 1.5f)
                       : random() % 5 == 0 ? between(15.0f, 70.0f)
                                           : between(1.0f, 9.0f);
    heading += between(-0.9f, 0.9f);
    pen.x += step * std::cos(heading);
    pen.y += step * std::sin(heading);
    pen.pressure = std::fabs(pen.pressure + between(-0.2f, 0.2f));
    pen.tilt = std::fabs(pen.tilt + between(-0.2f, 0.2f));
    pen.orientation = std::remainder(pen.orientation + between(0.0f, 0.6f), 6.2831855f);
  }
  return samples;
}

struct Hand {
  int tool, source;
  const char* name;
};

constexpr Hand kHands[] = {{Qelt::kToolStylus, Qelt::kSourceStylus, "Stylus"},
                           {Qelt::kToolFinger, Qelt::kSourceTouchScreen, "Finger"},
                           {Qelt::kToolMouse, Qelt::kSourceMouse, "Mouse"}};

class StrokesByLot : public testing::TestWithParam<std::tuple<int, bool, Hand>> {
 protected:
  BoardOptions options() const {
    const auto& [version, curve, hand] = GetParam();
    return {.version = version, .size = 6.0f, .curve = curve, .tool = hand.tool, .source = hand.source};
  }
};

// Live, recorded and stored, one stroke is fed the same way to the same code: the first sample begins it, the
// others are drawn to, and the last one, once more, ends it. (A live up event repeats the last point, a
// recorded event's current sample does, and a stored stroke's last point counts twice by design.) So every
// stamp is the same, with one exception: an up event forgets the alpha of the last segment, so that the
// closing segment has the end pressure's alpha throughout; a replay keeps it, and ramps.
TEST_P(StrokesByLot, AreTheSameLiveRecordedAndStored) {
  const auto stride = static_cast<std::size_t>(strideOf(options().version));
  DrawingBoard board(options());
  for (unsigned seed = 1; seed <= 12; ++seed) {
    SCOPED_TRACE("seed " + std::to_string(seed));
    const std::vector<Sample> samples = strokeByLot(seed);
    board.stroke(samples);
    std::vector<float> live = board.takeFloats();
    board.redraw(board.recorded(samples));
    std::vector<float> recorded = board.takeFloats();
    board.redraw(*board.stored(samples));
    EXPECT_EQ(recorded, board.takeFloats());
    ASSERT_EQ(live.size(), recorded.size());
    // Every finger presses alike.
    const bool looksAtAlpha = options().tool != Qelt::kToolStylus;
    for (std::size_t i = 4; i < live.size() && !looksAtAlpha; i += stride) live[i] = recorded[i] = 0.0f;
    EXPECT_EQ(live, recorded);
  }
}

std::string nameOf(const testing::TestParamInfo<std::tuple<int, bool, Hand>>& stroke) {
  const auto& [version, curve, hand] = stroke.param;
  return "Version" + std::to_string(version) + (curve ? "Curve" : "Straight") + hand.name;
}

INSTANTIATE_TEST_SUITE_P(All, StrokesByLot,
                         Combine(ValuesIn(allVersions()), testing::Bool(), ValuesIn(kHands)), nameOf);

}  // namespace
}  // namespace QeltTests
