// What the host does to a pen: its own memory runs out, its GL calls fail, its context goes for a while, and
// between any two calls it changes canvas, view, size or option. Each once at every place there is, and from
// that place on.

#include <gtest/gtest.h>

#include <functional>
#include <limits>
#include <string>

#include "AllocationGate.h"
#include "Sweep.h"
#include "desktop/gl/CallTask.h"
#include "gl/ManagedObject.h"
#include "pencommon/IPenMorphable.h"
#include "pencommon/PenOutlineDrawableGL.h"
#include "pencommon/PenPredictionDrawableGL.h"
#include "support/HostFaults.h"

namespace QeltTests {
namespace {

using QeltDesktop::RenderQueue;

constexpr Scenario kEveryKind{"EveryKind", [](Stage& stage) { stage.everyKind(); }};
constexpr Scenario kOneOfEach{"OneOfEach", [](Stage& stage) { stage.oneOfEach(); }, false, true};

// In version 8, which has every render drawable there is.
Scenario inVersion8(const std::string& name) {
  Scenario one = scenario(name);
  one.everyVersion = false;
  return one;
}

class HostSweep : public testing::TestWithParam<Scenario> {};

TEST_P(HostSweep, OutOfMemory) {
  SweepGround ground(GetParam().picture, Failing::Host);
  RecordProperty("failures", ground.survivesEach(
                                 GetParam(), "allocation of plug-in or host",
                                 [](long number, bool andAllAfter) {
                                   AllocationGate::fail(number, andAllAfter,
                                                        AllocationGate::Whose::Everyones);
                                 },
                                 [](long number) { return AllocationGate::open() >= number; }));
}

TEST_P(HostSweep, FailingCalls) {
  SweepGround ground(GetParam().picture, Failing::Host);
  RecordProperty("failures", ground.survivesEach(GetParam(), "call of the host", HostFaults::fail,
                                                 [](long number) { return HostFaults::open() >= number; }));
}

INSTANTIATE_TEST_SUITE_P(Scenarios, HostSweep,
                         testing::Values(kEveryKind, kOneOfEach, inVersion8("LiveStrokeQueuedAsThePenDies"),
                                         inVersion8("RedrawsQueuedAsThePenDies"),
                                         inVersion8("InitAndRelease"), inVersion8("ContextLoss")),
                         [](const auto& test) { return std::string(test.param.name); });

// Loses the context as soon as there is one again.
class Relapse final : public Qelt::ManagedObject {
 public:
  explicit Relapse(RenderQueue& queue) : mQueue(queue) { Register(this); }
  void OnRelease() override {}
  void OnRestore() override { mQueue.loseContext(); }

 private:
  RenderQueue& mQueue;
};

TEST(ContextSweep, LostForAWhile) {
  SweepGround ground(true);
  RenderQueue& queue = ground.queue();
  int losses = 0;
  for (const int tasks : {1, 4}) {
    long posts = 0;
    losses += ground.survivesEach(
        kOneOfEach, "loss for " + std::to_string(tasks) + " tasks",
        [&](long number, bool andAllAfter) {
          posts = 0;
          queue.accept = [&, number, andAllAfter, tasks](const Qelt::ITask&) {
            ++posts;
            const auto accept = std::exchange(queue.accept, nullptr);
            if (posts == number) QeltDesktop::postCall(queue, [&] { queue.loseContext(); });
            if (posts == number + tasks && !andAllAfter) {
              QeltDesktop::postCall(queue, [&] {
                {
                  const Relapse relapse(queue);
                  queue.restoreContext();
                }
                queue.restoreContext();
              });
            }
            queue.accept = accept;
            return true;
          };
        },
        [&](long number) {
          queue.accept = nullptr;
          queue.restoreContext();
          return posts >= number;
        });
  }
  RecordProperty("losses", losses);
}

struct Change {
  const char* name;
  std::function<void(Stage&, Qelt::PenDrawableGL&)> make;
};

std::vector<Change> changes() {
  using Limits = std::numeric_limits<float>;
  std::vector<Change> all;
  constexpr float kNaN = Limits::quiet_NaN();
  for (const float size : {0.0f, -3.0f, kNaN, Limits::infinity(), -Limits::infinity(), 1e30f, 40.0f}) {
    all.push_back({"size", [size](Stage& stage, Qelt::PenDrawableGL&) { stage.pen()->SetSize(size); }});
  }
  for (const float size : {-3.0f, kNaN, Limits::infinity()}) {
    all.push_back({"outline size or opacity", [size](Stage&, Qelt::PenDrawableGL& drawable) {
                     if (auto* const outline = dynamic_cast<Qelt::PenOutlineDrawableGL*>(&drawable))
                       outline->SetOutlineSize(size);
                     if (auto* const ahead = dynamic_cast<Qelt::IPenPredictionDrawableGL*>(&drawable))
                       ahead->SetOpacity(size);
                   }});
  }
  for (const float size : {0.0f, kNaN}) {
    all.push_back({"fixed width", [size](Stage& stage, Qelt::PenDrawableGL&) {
                     stage.pen()->GetMorphable()->SetFixedWidthEnabled(true);
                     stage.pen()->GetMorphable()->SetFixedWidth(size);
                   }});
    all.push_back({"view", [size](Stage& stage, Qelt::PenDrawableGL&) { stage.zoom(size); }});
  }
  for (const Target target : {Target::NoLayer, Target::NoBitmap, Target::NoTiles}) {
    all.push_back({"canvas", [target](Stage& stage, Qelt::PenDrawableGL& drawable) {
                     drawable.SetCanvas(stage.canvas(target));
                   }});
  }
  all.push_back({"no canvas", [](Stage&, Qelt::PenDrawableGL& drawable) { drawable.SetCanvas(nullptr); }});
  all.push_back({"no curve", [](Stage& stage, Qelt::PenDrawableGL&) {
                   stage.pen()->GetMorphable()->SetCurveEnabled(false);
                 }});
  all.push_back({"no colour", [](Stage& stage, Qelt::PenDrawableGL&) { stage.pen()->SetColor(0); }});
  all.push_back(
      {"no screen", [](Stage& stage, Qelt::PenDrawableGL&) { stage.pen()->SetScreenResolution(0, -1); }});
  return all;
}

class ChangeSweep : public testing::TestWithParam<int> {};

TEST_P(ChangeSweep, LeavesThePenAsGoodAsNew) {
  SweepGround ground(false);
  const Scenario all{"Changes", [](Stage& stage) {
                       stage.everyKind();
                       stage.straight();
                     }};
  int number = 0;
  for (const Change& change : changes()) {
    for (const bool stays : {false, true}) {
      long calls = 0;
      long at = 1;
      const auto arm = [&] {
        calls = 0;
        Stage::watchBatches();
        Stage::beforeCall = [&](Stage& stage, Qelt::PenDrawableGL& drawable) {
          ++calls;
          if (calls == at || (stays && calls > at)) change.make(stage, drawable);
          if (calls == at + 1 && !stays) stage.setUsual(drawable);
        };
      };
      const auto disarm = [&] {
        Stage::beforeCall = nullptr;
        return calls >= at;
      };
      while (ground.survives(all, GetParam(),
                             std::string("change of ") + change.name + ", the " + std::to_string(++number) +
                                 "th, before call " + std::to_string(at) + (stays ? " and after" : ""),
                             arm, disarm)) {
        ++at;
      }
    }
  }
  RecordProperty("changes", number);
}

INSTANTIATE_TEST_SUITE_P(Versions, ChangeSweep,
                         testing::ValuesIn(QELT_SANITIZED ? std::vector<int>{4, 8}
                                                          : std::vector<int>{1, 4, 5, 8}),
                         versionName);

// Another pen draws everything between any two calls of the first, in another view, on a page of its own and
// on the first one's; both draw what they draw alone.
TEST(ViewsInTurns, DrawWhatEachDrawsAlone) {
  constexpr float kOtherZoom = 3.0f;
  for (const bool sharesPage : {false, true}) {
    for (const int version : {5, 8}) {
      RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::None);
      const auto draw = [&](float zoom) { return Stage(queue, nullptr, version).drawEverything(zoom); };
      Drawn alone = draw(1.0f);
      const Drawn otherAlone = draw(kOtherZoom);
      Stage stage(queue, nullptr, version);
      Stage other(queue, nullptr, version);
      std::string differs;
      Stage::beforeCall = [&](Stage& caller, Qelt::PenDrawableGL&) {
        if (&caller != &stage) return;
        const std::string found = difference(other.drawEverything(kOtherZoom), otherAlone);
        if (differs.empty()) differs = found;
        if (sharesPage) {
          EXPECT_TRUE(other.redrawsLastOf(stage)) << "a drawing for another view";
        }
        other.turnPage();
      };
      Drawn drawn = stage.drawEverything(1.0f);
      Stage::beforeCall = nullptr;
      // One cache holds one drawing of a stroke: views that share a page take it from each other.
      if (sharesPage) drawn.cached = alone.cached;
      EXPECT_EQ(difference(drawn, alone), "") << "version " << version << ", shared page " << sharesPage;
      EXPECT_EQ(differs, "") << "other view, version " << version << ", shared page " << sharesPage;
    }
  }
}

}  // namespace
}  // namespace QeltTests
