// How much GL a drawing costs, call by call. The numbers are exact: what the host tells GL follows from what
// the pen asks for, and from nothing else.

#include <gmock/gmock.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <set>
#include <string>
#include <vector>

#include "desktop/pencommon/BatchObserver.h"
#include "support/Command.h"
#include "support/PenBoard.h"
#include "traffic/GlCalls.h"

namespace QeltTests {
namespace {

using testing::AnyOf;
using testing::Contains;
using testing::IsSupersetOf;
using testing::Not;
using testing::StartsWith;

using Calls = std::vector<std::string>;

constexpr int kTile = 64;

// A batch's upload and its draw on the tile that was drawn on before.
const Calls kOneTile = {"glBufferData", "glDrawArrays"};
// What each further tile adds, and the first where it is another one.
const Calls kAnotherTile = {"glViewport", "glScissor", "glUniformMatrix4fv", "glDrawArrays"};

Calls operator+(Calls calls, const Calls& more) {
  calls.insert(calls.end(), more.begin(), more.end());
  return calls;
}

class Traffic : public testing::Test {
 protected:
  // Two tiles beside each other.
  PenBoard board{{.width = 2 * kTile, .height = kTile, .tile = kTile}};

  Calls callsOf(const std::function<void()>& draw) {
    board.queue.finish();
    takeGlCalls();
    draw();
    board.queue.finish();
    Calls calls = takeGlCalls();
#ifndef NDEBUG
    std::erase(calls, "glGetError");  // which a debug build asks after every call
#endif
    return calls;
  }
  // The calls of each of a kind's drawings, the second time round: everything they need was made.
  std::vector<Calls> callsOfKind(Kind kind) {
    const std::vector<Sample> samples = {{20, 20}, {24, 22}, {28, 24}, {32, 26}};
    board.draw(kind, samples);
    std::vector<Calls> all;
    board.draw(kind, samples,
               [&](const PenBoard::Call& call) { all.push_back(callsOf([&] { call(&board.rect); })); });
    return all;
  }
};

TEST_F(Traffic, OfALiveStroke) {
  EXPECT_THAT(callsOf([&] { board.down({20, 20}); }), Not(Contains("glDrawArrays")));
  // All state is set once, for a layer that nobody drew into before.
  const Calls first = callsOf([&] { board.move({{24, 22}, {28, 24}}); });
  EXPECT_LE(first.size(), 22u) << testing::PrintToString(first);
  EXPECT_EQ(callsOf([&] { board.move({{32, 26}, {36, 30}}); }), kOneTile);
  EXPECT_EQ(callsOf([&] { board.move({{60, 34}, {80, 36}}); }), kOneTile + kAnotherTile);
}

TEST_F(Traffic, OfEveryKind) {
  struct {
    Kind kind;
    std::size_t drawings;  // that draw anything
    std::size_t most;      // calls of each
  } const expected[] = {{Kind::Live, 3, 2},
                        {Kind::Redraw, 5, 2},
                        // Two batches, each with a colour, a width and a way of blending; and what is done
                        // with a tile's depth.
                        {Kind::Outline, 2, 15},
                        {Kind::Preview, 4, 2},
                        // The live stroke that it continues draws in between, with textures of its own.
                        {Kind::Prediction, 3, 9}};
  for (const auto& [kind, drawings, most] : expected) {
    SCOPED_TRACE(testing::PrintToString(kind));
    std::size_t drawn = 0;
    for (const Calls& calls : callsOfKind(kind)) {
      if (calls.empty()) continue;
      SCOPED_TRACE(testing::PrintToString(calls));
      ++drawn;
      EXPECT_LE(calls.size(), most);
      EXPECT_THAT(calls,
                  Not(Contains(AnyOf(StartsWith("glGet"), "glBindFramebuffer", "glCheckFramebufferStatus"))));
    }
    EXPECT_EQ(drawn, drawings);
  }
}

// Another layer costs one binding, and whatever somebody else did to the context is set right again.
TEST_F(Traffic, OfAnotherLayerAndAnotherUser) {
  board.down({20, 20});
  board.move({{24, 22}, {28, 24}});
  QeltDesktop::CanvasLayer other(board.queue, kTile, kTile, kTile);
  board.queue.finish();
  board.queue.run([] {});
  const Calls calls = callsOf([&] { board.move({{32, 26}, {36, 30}}); });
  EXPECT_EQ(std::count(calls.begin(), calls.end(), "glBindFramebuffer"), 1) << testing::PrintToString(calls);
  EXPECT_LE(calls.size(), 20u) << testing::PrintToString(calls);
  EXPECT_EQ(callsOf([&] { board.move({{38, 30}, {40, 32}}); }), kOneTile);
}

// The GPU is waited for in time, however much is drawn at once: what it has not drawn takes memory. The
// browser forbids such waits, so a host without a thread makes none.
TEST(TrafficOfALongStroke, StaysNearTheGpu) {
  for (const bool thread : {true, false}) {
    PenBoard board({.width = kTile, .height = kTile, .tile = kTile, .thread = thread});
    board.queue.finish();
    takeGlCalls();
    constexpr int kMoves = 40, kFar = 2000;
    const std::uint64_t before = QeltDesktop::writtenBytes();
    board.down({0, 0});
    for (int i = 1; i <= kMoves; ++i) board.move({{i % 2 == 0 ? 0.0f : float{kFar}, static_cast<float>(i)}});
    board.queue.finish();
    const auto megabytes = static_cast<int>((QeltDesktop::writtenBytes() - before) >> 20);
    EXPECT_GT(megabytes, 20);
    const Calls calls = takeGlCalls();
    const auto count = [&](const char* name) {
      return static_cast<int>(std::count(calls.begin(), calls.end(), name));
    };
    // A batch here is one megabyte and more: three reach the next point.
    EXPECT_GE(count("glFenceSync"), thread ? megabytes / 4 : 0);
    EXPECT_GE(count("glClientWaitSync"), count("glFenceSync") - 2);
    EXPECT_EQ(count("glFenceSync") > 0, thread);
  }
}

// A call that is not noted would make every number above too small.
TEST(TrafficOfTheHost, IsNotedWhole) {
  std::set<std::string> used;
  for (const std::string& line : linesOf(QELT_NM " -D --undefined-only " QELT_HOST_LIBRARIES)) {
    const std::size_t name = line.find(" gl");
    if (name != std::string::npos) used.insert(line.substr(name + 1, line.find('@') - name - 1));
  }
  EXPECT_GT(used.size(), 50u);
  EXPECT_THAT(countedGlCalls(), IsSupersetOf(used));
}

}  // namespace
}  // namespace QeltTests
