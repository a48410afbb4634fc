// Every post is refused once, and all from it on are, one after the other, until a run meets no refusal; then
// refusals without a pattern.

#include <gtest/gtest.h>

#include <cstdint>
#include <random>
#include <string>

#include "AllocationGate.h"
#include "Sweep.h"
#include "gl/ITask.h"

namespace QeltTests {
namespace {

// Answers for the queue, and holds a poster to its word: a refused task is gone by the next post.
class Doorman {
 public:
  template <typename Refuses>
  void watch(QeltDesktop::RenderQueue& queue, Refuses refuses) {
    queue.accept = [this, refuses](const Qelt::ITask& task) {
      check();
      ++mPosts;
      if (!refuses(mPosts)) return true;
      ++mRefusals;
      // Tasks begin where their block does. Those of the host's own have no number.
      mRefused = dynamic_cast<const void*>(&task);
      mNumber = AllocationGate::numberOf(mRefused);
      return false;
    };
  }

  // Answers the number of refusals.
  long leave(QeltDesktop::RenderQueue& queue) {
    queue.accept = nullptr;
    check();
    mPosts = 0;
    return std::exchange(mRefusals, 0);
  }

 private:
  void check() {
    if (mNumber != 0 && AllocationGate::numberOf(mRefused) == mNumber)
      ADD_FAILURE() << "a refused task lives on";
    mNumber = 0;
  }

  long mPosts = 0;
  long mRefusals = 0;
  const void* mRefused = nullptr;
  long mNumber = 0;
};

class PostSweep : public testing::TestWithParam<Scenario> {};

TEST_P(PostSweep, LeavesThePenAsGoodAsNew) {
  SweepGround ground(GetParam().picture);
  Doorman doorman;
  RecordProperty("refusals", ground.survivesEach(
                                 GetParam(), "post",
                                 [&](long number, bool andAllAfter) {
                                   doorman.watch(ground.queue(), [=](long post) {
                                     return andAllAfter ? post >= number : post == number;
                                   });
                                 },
                                 [&](long) { return doorman.leave(ground.queue()) > 0; }));
}

TEST_P(PostSweep, SurvivesRefusalsWithoutAPattern) {
  const Scenario& scenario = GetParam();
  SweepGround ground(scenario.picture);
  for (std::uint32_t seed = 1; seed <= (scenario.picture ? 8u : 60u); ++seed) {
    // From one in sixteen to fifteen in sixteen.
    const std::uint32_t sixteenths = 1 + seed % 15;
    std::mt19937 random(seed);
    Doorman doorman;
    ground.survives(
        scenario, 8, "pattern " + std::to_string(seed),
        [&] { doorman.watch(ground.queue(), [&](long) { return random() % 16 < sixteenths; }); },
        [&] { return doorman.leave(ground.queue()) > 0; });
  }
}

INSTANTIATE_TEST_SUITE_P(Scenarios, PostSweep, testing::ValuesIn(scenarios()),
                         [](const auto& test) { return std::string(test.param.name); });

}  // namespace
}  // namespace QeltTests
