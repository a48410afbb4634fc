// A stroke of a million points: memory stays flat after a warm-up, and an event late allocates as often as an
// event early.

#include <gtest/gtest.h>
#include <unistd.h>

#include <cmath>
#include <fstream>
#include <vector>

#include "support/AllocationGate.h"
#include "support/LogCapture.h"
#include "support/PenBoard.h"

namespace QeltTests {
namespace {

// Sanitizers keep what is freed, and take their time.
constexpr int kShare = QELT_SANITIZED ? 20 : 1;
// Of the process, in KB; what may come and go without anything growing.
constexpr long kSlack = 1024;

long residentKilobytes() {
  long pages = 0, resident = 0;
  std::ifstream("/proc/self/statm") >> pages >> resident;
  return resident * (sysconf(_SC_PAGESIZE) / 1024);
}

// What the process holds and has asked for at one moment.
struct Moment {
  long resident = residentKilobytes();
  AllocationGate::Counts counts = AllocationGate::counts();
};

class LongStroke : public testing::TestWithParam<int> {};

TEST_P(LongStroke, CostsAsMuchLateAsEarly) {
  constexpr int kPoints = 1'000'000 / kShare;
  constexpr int kPointsPerEvent = 10;
  constexpr int kEvents = kPoints / kPointsPerEvent;
  // Once round in so many events, so that the same events come again.
  constexpr int kRound = 100;
  LogCapture log;
  AllocationGate::watch(PenBoard::library().path());
  PenBoard stroke({.version = GetParam()});

  const auto onCircle = [](int point) {
    const float angle = 6.2831853f * static_cast<float>(point % (kRound * kPointsPerEvent)) /
                        static_cast<float>(kRound * kPointsPerEvent);
    return Sample{300.0f + 290.0f * std::cos(angle), 300.0f + 290.0f * std::sin(angle),
                  0.5f + 0.4f * std::sin(3.0f * angle), 0.6f + 0.15f * std::cos(angle), std::sin(angle)};
  };
  ASSERT_TRUE(stroke.down(onCircle(0)));
  std::vector<Sample> batch(kPointsPerEvent);
  // What the plug-in allocates in one round, a few rounds in and at the end.
  std::vector<long> rounds;
  Moment early;
  long stamps = 0;
  for (int event = 0; event < kEvents; ++event) {
    for (int i = 0; i < kPointsPerEvent; ++i) batch[i] = onCircle(event * kPointsPerEvent + i + 1);
    ASSERT_TRUE(stroke.move(batch));
    for (const auto& floats : stroke.takeBuffers()) stamps += static_cast<long>(floats.size());
    stroke.takePosts();
    if ((event + 1) % kRound == 0) rounds.push_back(AllocationGate::counts().plugInAllocations);
    if (event + 1 == kEvents / 10) early = Moment();
  }
  const Moment late;
  EXPECT_GT(stamps, 0);
  ASSERT_GE(rounds.size(), 6u);
  EXPECT_EQ(rounds.back() - rounds[rounds.size() - 2], rounds[4] - rounds[3]) << "allocations a round";
  EXPECT_EQ(late.counts.plugInBlocks, early.counts.plugInBlocks);
  if (!QELT_SANITIZED) {
    EXPECT_LE(late.resident, early.resident + kSlack) << "KB";
  }
}

INSTANTIATE_TEST_SUITE_P(Versions, LongStroke, testing::Values(1, 8),
                         [](const auto& test) { return std::to_string(test.param); });

}  // namespace
}  // namespace QeltTests
