// Every allocation of the plug-in's own fails once, and all from it on fail, one after the other, until a run
// meets no failure.

#include <gtest/gtest.h>

#include <string>

#include "AllocationGate.h"
#include "Sweep.h"

namespace QeltTests {
namespace {

class AllocationSweep : public testing::TestWithParam<Scenario> {};

TEST_P(AllocationSweep, LeavesThePenAsGoodAsNew) {
  SweepGround ground(GetParam().picture);
  RecordProperty("failures",
                 ground.survivesEach(
                     GetParam(), "allocation",
                     [](long number, bool andAllAfter) { AllocationGate::fail(number, andAllAfter); },
                     [](long number) { return AllocationGate::open() >= number; }));
}

INSTANTIATE_TEST_SUITE_P(Scenarios, AllocationSweep, testing::ValuesIn(scenarios()),
                         [](const auto& test) { return std::string(test.param.name); });

}  // namespace
}  // namespace QeltTests
