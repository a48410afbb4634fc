#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "AllocationGate.h"
#include "Scenarios.h"
#include "Stage.h"
#include "support/LogCapture.h"
#include "support/Versions.h"

namespace QeltTests {

// Whether a scenario is swept in a version. The sanitizers take longer, and look at one version of each kind
// of placement and of vertex.
inline bool isSwept(const Scenario& scenario, int version) {
  if (version == 8) return true;
  if (!scenario.everyVersion) return false;
  if (scenario.picture) return version == 1 || version == 7;  // with 8 all that draw
  return !QELT_SANITIZED || version == 1 || version == 5;
}

// Who fails in a sweep: the plug-in's own means, which must not be noticed; or the host, whose own tasks may
// end in an exception then.
enum class Failing { PlugIn, Host };

// Where the sweeps run: a queue on the test's own thread, so that a number always means the same allocation
// or post, and a layer where there is a picture.
class SweepGround {
 public:
  explicit SweepGround(bool picture, Failing failing = Failing::PlugIn);
  ~SweepGround();

  QeltDesktop::RenderQueue& queue() { return mQueue; }
  QeltDesktop::CanvasLayer* layer() { return mLayer.get(); }
  // What a fresh pen of a version draws.
  const Drawn& fresh(int version);

  // Runs a scenario between `arm` and `disarm`, then draws with the same pen and compares; `disarm` answers
  // false when nothing failed. Checks that nothing threw, leaked or was deleted twice, and every
  // batch where `arm` has had them watched, which takes memory. Answers `disarm`'s.
  template <typename Arm, typename Disarm>
  bool survives(const Scenario& scenario, int version, const std::string& what, Arm&& arm, Disarm&& disarm);

  // The same in every version that is swept, with the first `thing` failing, the second, and so on until
  // nothing fails; alone, then with all after it. Answers the number of failures.
  template <typename Arm, typename Disarm>
  int survivesEach(const Scenario& scenario, const std::string& thing, Arm&& arm, Disarm&& disarm);

 private:
  struct Counts {
    long plugIn, host, all, bad;
  };
  Counts settle();

  const Failing mFailing;
  LogCapture mLog;
  QeltDesktop::RenderQueue mQueue;
  std::unique_ptr<QeltDesktop::CanvasLayer> mLayer;
  std::vector<Drawn> mFresh;
};

template <typename Arm, typename Disarm>
bool SweepGround::survives(const Scenario& scenario, int version, const std::string& what, Arm&& arm,
                           Disarm&& disarm) {
  const std::string where = std::string(scenario.name) + ", version " + std::to_string(version) + ", " + what;
  fresh(version);
  const Counts before = settle();
  const long number = AllocationGate::watchedAllocations();
  const long thrown = AllocationGate::thrownFailures();
  bool failed = false;
  {
    Stage stage(mQueue, mLayer.get(), version);
    arm();
    try {
      scenario.run(stage);
      stage.finish();
    } catch (const std::exception& error) {
      disarm();
      ADD_FAILURE() << where << ": let out " << error.what();
    }
    failed = disarm();
    for (const LogLine& line : mLog.take()) {
      if (mFailing == Failing::PlugIn && line.text.find("threw") != std::string::npos)
        ADD_FAILURE() << where << ": " << line.text;
    }
    // Whatever the scenario left, the same drawable draws as a fresh one.
    const std::string differs = difference(stage.drawEverything(), fresh(version));
    if (!differs.empty()) ADD_FAILURE() << where << ": draws differently afterwards: " << differs;
    EXPECT_LE(stage.refusedBatches(), AllocationGate::thrownFailures() - thrown)
        << where << ": threw, and no batch had failed to grow";
    const std::string wrong = Stage::watchBatches();
    Stage::watchNoBatches();
    if (!wrong.empty()) ADD_FAILURE() << where << ": " << wrong;
  }
  const Counts after = settle();
  if (after.plugIn != before.plugIn) {
    ADD_FAILURE() << where << ": " << after.plugIn - before.plugIn << " blocks of the plug-in's left,"
                  << AllocationGate::livingSince(number);
  } else if (!testing::Test::HasFailure() && after.host != before.host) {
    ADD_FAILURE() << where << ": " << after.host - before.host << " blocks of the host's left,"
                  << AllocationGate::livingSince(number);
  } else if (mLayer == nullptr && !testing::Test::HasFailure() && after.all != before.all) {
    ADD_FAILURE() << where << ": " << after.all - before.all << " blocks left";
  }
  EXPECT_EQ(after.bad, before.bad) << where << ": deleted twice";
  return failed;
}

template <typename Arm, typename Disarm>
int SweepGround::survivesEach(const Scenario& scenario, const std::string& thing, Arm&& arm,
                              Disarm&& disarm) {
  int total = 0;
  for (const int version : allVersions()) {
    if (!isSwept(scenario, version)) continue;
    // What the host makes once and for all is there from here on.
    scenario.run(*std::make_unique<Stage>(mQueue, mLayer.get(), version));
    for (const bool andAllAfter : {false, true}) {
      long number = 1;
      while (survives(
          scenario, version,
          thing + " " + std::to_string(number) + (andAllAfter ? " and all after it" : " alone"),
          [&] { arm(number, andAllAfter); }, [&] { return disarm(number); })) {
        ++number;
      }
      EXPECT_GT(number, 1) << "no " << thing << ": the sweep sees the plug-in no longer";
      total += static_cast<int>(number - 1);
    }
  }
  return total;
}

}  // namespace QeltTests
