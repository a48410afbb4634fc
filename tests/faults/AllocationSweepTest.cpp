// Every allocation of the plug-in's own fails once, and all from it on fail, one after the other, until a run
// meets no failure.

#include <gtest/gtest.h>

#include <string>

#include "AllocationGate.h"
#include "Sweep.h"
#include "support/Versions.h"

namespace QeltTests {
namespace {

class AllocationSweep : public testing::TestWithParam<Scenario> {};

TEST_P(AllocationSweep, LeavesThePenAsGoodAsNew) {
  const Scenario& scenario = GetParam();
  SweepGround ground(scenario.picture);
  int total = 0;
  for (const int version : allVersions()) {
    if (!isSwept(scenario, version)) continue;
    for (const bool andAllAfter : {false, true}) {
      int failures = 0;
      for (long number = 1;; ++number) {
        const bool failed = ground.survives(
            scenario, version,
            "allocation " + std::to_string(number) + (andAllAfter ? " and all after it" : " alone"),
            [&] { AllocationGate::fail(number, andAllAfter); },
            [&] { return AllocationGate::open() >= number; });
        if (!failed) break;
        ++failures;
      }
      EXPECT_GT(failures, 0) << "the plug-in allocates nothing: the sweep sees it no longer";
      total += failures;
    }
  }
  RecordProperty("failures", total);
}

INSTANTIATE_TEST_SUITE_P(Scenarios, AllocationSweep, testing::ValuesIn(scenarios()),
                         [](const auto& test) { return std::string(test.param.name); });

}  // namespace
}  // namespace QeltTests
