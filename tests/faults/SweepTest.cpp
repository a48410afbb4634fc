// Everything that can fail a pen from outside, made to fail at every single place: the first, the second, and
// so on until a run meets no failure; alone, then with all after it. Whatever happened, the same drawable
// draws as a fresh one afterwards, and nothing is left.

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <functional>
#include <limits>
#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "desktop/gl/CallTask.h"
#include "gl/ManagedObject.h"
#include "support/AllocationGate.h"
#include "support/LogCapture.h"
#include "support/PenBoard.h"

namespace QeltTests {
namespace {

using QeltDesktop::CanvasLayer;
using QeltDesktop::RenderQueue;
using Call = std::function<void()>;

// Makes calls on the render thread ahead of the posts of these numbers, from 1; counts the posts.
void callAhead(RenderQueue& queue, long& posts, const std::map<long, Call>& calls) {
  posts = 0;
  queue.accept = [&queue, &posts, calls, isOurs = false](const Qelt::ITask&) mutable {
    if (isOurs) return true;
    if (const auto call = calls.find(++posts); call != calls.end()) {
      isOurs = true;
      QeltDesktop::postCall(queue, call->second);
      isOurs = false;
    }
    return true;
  };
}

// What a host does while something fails.
struct Scenario {
  const char* name;
  void (*run)(PenBoard&);
  bool everyVersion = false;             // or the newest alone; of pictures, one of each render drawable
  bool picture = false;                  // or no GL
  void (*prepare)(PenBoard&) = nullptr;  // before anything fails
};

void queueAndDie(PenBoard& board, std::initializer_list<Kind> kinds) {
  board.keepsUp = false;
  for (const Kind kind : kinds) board.draw(kind);
  board.deletePen();
}

// Where a pen dies, it dies with work queued. Those with a picture: textures, shaders, buffers; loss of the
// context.
constexpr Scenario kLiveQueued{"LiveStrokeQueuedAsThePenDies",
                               [](PenBoard& board) { queueAndDie(board, {Kind::Live}); }};
constexpr Scenario kRedrawsQueued{"RedrawsQueuedAsThePenDies",
                                  [](PenBoard& board) { queueAndDie(board, {Kind::Redraw}); }};
constexpr Scenario kContextLoss{"ContextLoss",
                                [](PenBoard& board) {
                                  board.loseAndRestoreContext();
                                  board.deletePen();
                                },
                                false, true,
                                [](PenBoard& board) {
                                  board.prepareAll();
                                  board.finish();
                                }};
const Scenario kScenarios[] = {
    {"LiveStroke", [](PenBoard& board) { board.draw(Kind::Live); }, true},
    {"Redraws", [](PenBoard& board) { board.draw(Kind::Redraw); }, true},
    {"Outlines", [](PenBoard& board) { board.draw(Kind::Outline); }, true},
    {"Preview", [](PenBoard& board) { board.draw(Kind::Preview); }},
    {"Prediction", [](PenBoard& board) { board.draw(Kind::Prediction); }},
    {"Straight",
     [](PenBoard& board) {
       board.setCurve(false);
       for (const Kind kind : {Kind::Live, Kind::Redraw, Kind::Outline, Kind::Preview}) board.draw(kind);
     },
     true},
    kLiveQueued,
    kRedrawsQueued,
    {"OthersQueuedAsThePenDies",
     [](PenBoard& board) {
       queueAndDie(board, {Kind::Outline, Kind::Preview, Kind::Prediction});
     }},
    {"VersionChange",
     [](PenBoard& board) {
       board.keepsUp = false;
       for (const int version : {newestVersion(), 3, newestVersion()}) {
         board.makePen();
         if (board.pen == nullptr) return;
         board.pen->setVersion(version);
         board.draw(Kind::Live);
       }
     }},
    {"InitAndRelease",
     [](PenBoard& board) {
       board.prepareAll();
       board.deletePen();
     },
     true, true},
    {"LivePicture", [](PenBoard& board) { board.draw(Kind::Live); }, false, true},
    kContextLoss,
};
constexpr Scenario kEveryKind{"EveryKind", [](PenBoard& board) { board.drawAll(); }};
constexpr Scenario kOneOfEach{"OneOfEach", [](PenBoard& board) { board.drawOneOfEach(); }, false, true};

std::string nameOf(const testing::TestParamInfo<Scenario>& test) {
  return test.param.name;
}

// Whether a scenario is swept in a version. The sanitizers take longer, and look at one version of each kind
// of placement and of vertex.
bool isSwept(const Scenario& scenario, int version) {
  if (version == newestVersion()) return true;
  if (!scenario.everyVersion) return false;
  if (scenario.picture) {
    const std::vector<int> own = versionsOfRenderDrawables();
    return std::count(own.begin(), own.end(), version) > 0;
  }
  return !QELT_SANITIZED || version == 1 || version == 5;
}

BoardOptions pencil(int version) {
  return {.version = version, .size = 4.0f, .color = 0xFF305090u};
}

// Where a scenario is swept: a queue on the test's own thread, so that a number always means the same
// allocation or post, and a layer where there is a picture.
class SweepGround {
 public:
  // Of the plug-in's own means nobody may notice that they fail; where the host fails, its own tasks may end
  // in an exception.
  enum class Failing { PlugIn, Host };
  explicit SweepGround(const Scenario& scenario, Failing failing = Failing::PlugIn)
      : mScenario(scenario),
        mFailing(failing),
        queue(RenderQueue::Mode::Caller,
              mScenario.picture ? RenderQueue::GL::Context : RenderQueue::GL::None),
        mLayer(mScenario.picture ? std::make_unique<CanvasLayer>(queue, 160, 120, 128) : nullptr) {}

  // Runs a scenario between `arm` and `disarm`, then draws with the same pen and compares; `disarm` returns
  // false when nothing failed. Checks that nothing threw, leaked or was deleted twice. Returns `disarm`'s.
  template <typename Arm, typename Disarm>
  bool survives(int version, const std::string& what, Arm&& arm, Disarm&& disarm) {
    SCOPED_TRACE(mScenario.name + (", version " + std::to_string(version)) + ", " + what);
    const Drawn& expected = fresh(version);
    const AllocationGate::Counts before = settle();
    bool failed = false;
    {
      PenBoard board(pencil(version), queue, mLayer.get());
      board.keepsUp = true;
      if (mScenario.prepare != nullptr) mScenario.prepare(board);
      arm(board);
      try {
        mScenario.run(board);
        board.finish();
      } catch (const std::exception& error) {
        disarm();
        ADD_FAILURE() << "let out " << error.what();
      }
      failed = disarm();
      board.beforeCall = nullptr;
      for (const LogLine& line : mLog.take()) {
        if (mFailing == Failing::PlugIn && line.text.find("threw") != std::string::npos)
          ADD_FAILURE() << line.text;
      }
      expectAlike(board.drawEverything(), expected);
      EXPECT_LE(board.refusedBatches(), AllocationGate::counts().thrownFailures - before.thrownFailures)
          << "threw, and no batch had failed to grow";
    }
    const AllocationGate::Counts after = settle();
    EXPECT_EQ(after.plugInBlocks, before.plugInBlocks) << "blocks of the plug-in's left";
    if (!testing::Test::HasFailure()) {
      EXPECT_EQ(after.hostBlocks, before.hostBlocks) << "blocks of the host's left";
      if (mLayer == nullptr) {
        EXPECT_EQ(after.allBlocks, before.allBlocks) << "blocks left";
      }
    }
    EXPECT_EQ(after.badDeletions, before.badDeletions) << "deleted twice";
    return failed;
  }

  // The same in every version that is swept, with the first `thing` failing, the second, and so on until
  // nothing fails; alone, then with all after it. Notes the number of failures.
  template <typename Arm, typename Disarm>
  void survivesEach(const std::string& thing, Arm&& arm, Disarm&& disarm) {
    int total = 0;
    for (const int version : allVersions()) {
      if (!isSwept(mScenario, version)) continue;
      {
        // What the host makes once and for all is there from here on.
        PenBoard board(pencil(version), queue, mLayer.get());
        mScenario.run(board);
      }
      for (const bool andAllAfter : {false, true}) {
        long number = 1;
        while (survives(
            version, thing + " " + std::to_string(number) + (andAllAfter ? " and all after it" : " alone"),
            [&](PenBoard&) { arm(number, andAllAfter); }, [&] { return disarm(number); })) {
          ++number;
        }
        EXPECT_GT(number, 1) << "no " << thing << ": the sweep sees the plug-in no longer";
        total += static_cast<int>(number - 1);
      }
    }
    testing::Test::RecordProperty("failures", total);
  }

 private:
  // What a fresh pen of a version draws.
  const Drawn& fresh(int version) {
    Drawn& drawn = mFresh[version];
    if (drawn.batches.empty()) drawn = PenBoard(pencil(version), queue, mLayer.get()).drawEverything();
    return drawn;
  }
  AllocationGate::Counts settle() {
    queue.finish();
    mLog.take();
    return AllocationGate::counts();
  }

  const Scenario mScenario;
  const Failing mFailing;
  // The gate knows plug-in and host before the ground makes anything of theirs.
  struct Watch {
    Watch() { AllocationGate::watch(PenBoard::library().path()); }
  } mWatch;
  LogCapture mLog;

 public:
  RenderQueue queue;

 private:
  std::unique_ptr<CanvasLayer> mLayer;
  std::map<int, Drawn> mFresh;
};

// --- The plug-in's own means ---

class PlugInSweep : public testing::TestWithParam<Scenario> {};
INSTANTIATE_TEST_SUITE_P(Scenarios, PlugInSweep, testing::ValuesIn(kScenarios), nameOf);

TEST_P(PlugInSweep, OutOfMemory) {
  SweepGround ground(GetParam());
  ground.survivesEach(
      "allocation", [](long number, bool andAllAfter) { AllocationGate::fail(number, andAllAfter); },
      [](long number) { return AllocationGate::open() >= number; });
}

TEST_P(PlugInSweep, RefusedPosts) {
  SweepGround ground(GetParam());
  long posts = 0;
  ground.survivesEach(
      "post",
      [&](long number, bool andAllAfter) {
        posts = 0;
        ground.queue.accept = [=, &posts](const Qelt::ITask&) {
          ++posts;
          return posts < number || (posts > number && !andAllAfter);
        };
      },
      [&](long number) {
        ground.queue.accept = nullptr;
        return posts >= number;
      });
}

// --- The host's ---

class HostSweep : public testing::TestWithParam<Scenario> {};
INSTANTIATE_TEST_SUITE_P(Scenarios, HostSweep,
                         testing::Values(kEveryKind, kOneOfEach, kLiveQueued, kRedrawsQueued, kContextLoss),
                         nameOf);

TEST_P(HostSweep, OutOfMemory) {
  SweepGround ground(GetParam(), SweepGround::Failing::Host);
  ground.survivesEach(
      "allocation of plug-in or host",
      [](long number, bool andAllAfter) {
        AllocationGate::fail(number, andAllAfter, AllocationGate::Whose::Everyones);
      },
      [](long number) { return AllocationGate::open() >= number; });
}

TEST_P(HostSweep, FailingCalls) {
  Scenario scenario = GetParam();
  if (scenario.prepare != nullptr) {
    // A context that comes back asks for nothing that may fail: what was prepared with failures loses it.
    scenario.prepare = nullptr;
    scenario.run = [](PenBoard& board) {
      kContextLoss.prepare(board);
      kContextLoss.run(board);
    };
  }
  SweepGround ground(scenario, SweepGround::Failing::Host);
  ground.survivesEach("call of the host", HostFaults::fail,
                      [](long number) { return HostFaults::open() >= number; });
}

// --- The GL context's ---

class ContextLoss : public testing::TestWithParam<Drawing> {};
INSTANTIATE_TEST_SUITE_P(Drawings, ContextLoss, testing::ValuesIn(drawings(versionsOfRenderDrawables())),
                         drawingName);

// The context goes and comes back, at once or later, between any two tasks of the render thread: the layer
// comes back empty, and from there on it is drawn into as into one that was cleared there.
TEST_P(ContextLoss, EmptiesTheLayerAndSparesWhatIsDrawnAfterwards) {
  LogCapture log;
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context);
  CanvasLayer layer(queue, 160, 120, 128);
  const auto empty = layer.readPixels();
  long posts = 0;
  const auto picture = [&](const std::map<long, Call>& calls) {
    layer.clear();
    PenBoard board({.version = GetParam().version, .size = 4.0f}, queue, &layer);
    callAhead(queue, posts, calls);
    board.draw(GetParam().kind);
    queue.finish();
    queue.accept = nullptr;
    queue.restoreContext();
    return layer.readPixels();
  };
  const Call lose = [&] { queue.loseContext(); };
  const Call restore = [&] { queue.restoreContext(); };
  const Call loseAndRestore = [&] {
    lose();
    restore();
  };
  const auto whole = picture({});
  const long all = posts;
  ASSERT_NE(whole, empty) << "nothing was drawn";
  for (long back = 1; back <= all; ++back) {
    SCOPED_TRACE("back before task " + std::to_string(back) + " of " + std::to_string(all));
    const auto expected = picture({{back, [&] { layer.clear(); }}});
    EXPECT_TRUE(picture({{back, loseAndRestore}}) == expected) << "lost there";
    for (const long lost : {1L, back - 4}) {
      if (lost < 1 || lost == back) continue;
      EXPECT_TRUE(picture({{lost, lose}, {back, restore}}) == expected) << "lost before task " << lost;
    }
  }
  EXPECT_TRUE(picture({{1, lose}}) == empty) << "lost for good";
  EXPECT_TRUE(picture({}) == whole) << "drawn again";
}

// Loses the context as soon as there is one again.
class Relapse final : public Qelt::ManagedObject {
 public:
  explicit Relapse(RenderQueue& queue) : mQueue(queue) { Register(this); }
  void OnRelease() override {}
  void OnRestore() override { mQueue.loseContext(); }

 private:
  RenderQueue& mQueue;
};

// For two tasks, and then for good.
TEST(ContextSweep, LostForAWhile) {
  SweepGround ground(kOneOfEach);
  RenderQueue& queue = ground.queue;
  long posts = 0;
  ground.survivesEach(
      "loss",
      [&](long number, bool andAllAfter) {
        std::map<long, Call> calls = {{number, [&] { queue.loseContext(); }}};
        if (!andAllAfter) {
          calls[number + 2] = [&] {
            auto relapse = std::make_unique<Relapse>(queue);
            queue.restoreContext();
            relapse.reset();
            queue.restoreContext();
          };
        }
        callAhead(queue, posts, calls);
      },
      [&](long number) {
        queue.accept = nullptr;
        queue.restoreContext();
        return posts >= number;
      });
}

// What the host could not make for a drawable it makes in the next context, with nobody asking again; unless
// it threw, or lied about a uniform.
TEST(ContextSweep, OutlinesDrawInTheContextAfterOneInWhichCallsFailed) {
  LogCapture log;
  int healed = 0;
  bool failed = true;
  for (long number = 1; failed; ++number) {
    PenBoard board({.size = 6.0f, .width = 96, .height = 64});
    auto* const outline = board.pen->GetOutlineDrawableGL();
    outline->SetOutlineSize(6.0f);
    outline->SetCanvas(&board.canvas);
    HostFaults::fail(number, false);
    board.finish();
    failed = HostFaults::open() >= number;
    const std::vector<LogLine> lines = log.take();
    if (std::any_of(lines.begin(), lines.end(),
                    [](const LogLine& line) { return line.text.find("threw") != std::string::npos; }))
      continue;
    board.loseAndRestoreContext();
    const Qelt::MotionEvent event = board.recorded(PenBoard::usualStroke());
    outline->DrawOutline(&event, &board.rect);
    const std::vector<std::uint8_t> pixels = board.pixels();
    EXPECT_GT(std::count(pixels.begin(), pixels.end(), 255), 100) << "call " << number;
    healed += failed ? 1 : 0;
  }
  EXPECT_GT(healed, 4);
}

// --- What the host may change ---

// Between any two calls the host changes canvas, view, size or option, until the next call or for good.
using Change = std::function<void(PenBoard&, Qelt::PenDrawableGL&)>;

std::vector<std::pair<const char*, Change>> changes() {
  using Limits = std::numeric_limits<float>;
  std::vector<std::pair<const char*, Change>> all;
  for (const float size : {0.0f, -3.0f, NAN, Limits::infinity(), -Limits::infinity(), 1e30f, 40.0f})
    all.emplace_back("size", [size](PenBoard& board, auto&) { board.pen->SetSize(size); });
  for (const float size : {-3.0f, NAN, Limits::infinity()}) {
    all.emplace_back("outline size or opacity", [size](PenBoard&, Qelt::PenDrawableGL& drawable) {
      if (auto* const outline = dynamic_cast<Qelt::PenOutlineDrawableGL*>(&drawable))
        outline->SetOutlineSize(size);
      if (auto* const ahead = dynamic_cast<Qelt::IPenPredictionDrawableGL*>(&drawable))
        ahead->SetOpacity(size);
    });
  }
  for (const float size : {0.0f, NAN}) {
    all.emplace_back("fixed width", [size](PenBoard& board, auto&) {
      board.pen->GetMorphable()->SetFixedWidthEnabled(true);
      board.pen->GetMorphable()->SetFixedWidth(size);
    });
    all.emplace_back("view", [size](PenBoard& board, auto&) { board.zoom(size); });
  }
  for (const Target target : {Target::NoLayer, Target::NoBitmap, Target::NoTiles})
    all.emplace_back("canvas", [target](PenBoard& board, auto&) { board.canvas.setTarget(target); });
  all.emplace_back("no canvas",
                   [](PenBoard&, Qelt::PenDrawableGL& drawable) { drawable.SetCanvas(nullptr); });
  all.emplace_back("no curve", [](PenBoard& board, auto&) { board.setCurve(false); });
  all.emplace_back("no colour", [](PenBoard& board, auto&) { board.pen->SetColor(0); });
  all.emplace_back("no screen", [](PenBoard& board, auto&) { board.pen->SetScreenResolution(0, -1); });
  return all;
}

// One version of each way to place stamps, and of each way to widen them.
class ChangeSweep : public testing::TestWithParam<int> {};
INSTANTIATE_TEST_SUITE_P(Versions, ChangeSweep,
                         testing::ValuesIn(QELT_SANITIZED ? std::vector{4, newestVersion()}
                                                          : std::vector{1, 4, 5, newestVersion()}),
                         versionName);

TEST_P(ChangeSweep, LeavesThePenAsGoodAsNew) {
  SweepGround ground({"Changes", [](PenBoard& board) {
                        board.drawAll();
                        board.setCurve(false);
                        for (const Kind kind : {Kind::Live, Kind::Outline, Kind::Preview}) board.draw(kind);
                      }});
  for (const auto& [name, change] : changes()) {
    for (const bool stays : {false, true}) {
      long calls = 0, at = 1;
      const auto arm = [&, &make = change](PenBoard& board) {
        calls = 0;
        board.watch();
        board.beforeCall = [&](Qelt::PenDrawableGL& drawable) {
          ++calls;
          if (calls == at || (stays && calls > at)) make(board, drawable);
          if (calls == at + 1 && !stays) {
            board.setUsual(drawable);
            board.canvas.setTarget(Target::Whole);
          }
        };
      };
      const auto what = [&, of = name] {
        return std::string("change of ") + of + " before call " + std::to_string(at) +
               (stays ? " and after" : "");
      };
      while (ground.survives(GetParam(), what(), arm, [&] { return calls >= at; })) ++at;
    }
  }
}

// Another pen draws everything between any two calls of the first, in another view; both draw what they draw
// alone.
TEST(ViewsInTurns, DrawWhatEachDrawsAlone) {
  constexpr float kOtherZoom = 3.0f;
  for (const int version : {5, newestVersion()}) {
    SCOPED_TRACE("version " + std::to_string(version));
    RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::None);
    const Drawn alone = PenBoard(pencil(version), queue, nullptr).drawEverything();
    const Drawn otherAlone = PenBoard(pencil(version), queue, nullptr).drawEverything(kOtherZoom);
    PenBoard board(pencil(version), queue, nullptr), other(pencil(version), queue, nullptr);
    board.beforeCall = [&](Qelt::PenDrawableGL&) {
      expectAlike(other.drawEverything(kOtherZoom), otherAlone);
      other.turnPage();
      board.watch();
    };
    expectAlike(board.drawEverything(), alone);
  }
}

}  // namespace
}  // namespace QeltTests
