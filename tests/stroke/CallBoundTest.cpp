// No call places more than 4,194,304 stamps, whatever it is handed. Of what is beyond, each kind of drawable
// says one line, and goes on as if it had been placed.

#include <gmock/gmock.h>

#include <cstdint>
#include <string>
#include <vector>

#include "desktop/pencommon/BatchObserver.h"
#include "prediction/Pencil2PredictionDrawableGL.h"
#include "preview/Pencil2PreviewDrawableGL.h"
#include "support/DrawableBoard.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;

constexpr int kPoints = 20;

// A zigzag of segments so long that each is cut to 262,144 stamps; 16 of them are as many as a call may
// place.
std::vector<Sample> farZigzag() {
  std::vector<Sample> samples;
  for (int i = 0; i <= kPoints; ++i) {
    samples.push_back({i % 2 == 0 ? 0.0f : 600000.0f, static_cast<float>(i)});
  }
  return samples;
}

// What a call places is told by its bytes: nobody looks at the batch, which is never copied.
template <typename Board, typename Call>
void expectBounded(Board& board, int streams, const std::string& name, Call&& call) {
  board.unwatch();
  LogCapture log;
  const std::uint64_t before = QeltDesktop::writtenBytes();
  call();
  EXPECT_EQ(
      QeltDesktop::writtenBytes() - before,
      std::uint64_t{4194304} * 6 * static_cast<std::uint64_t>(board.stride() * streams) * sizeof(float));
  std::vector<std::string> lines;
  for (const LogLine& line : log.take()) {
    if (line.text.find("left out") != std::string::npos) lines.push_back(line.text);
  }
  EXPECT_THAT(lines, ElementsAre(HasSubstr(name + ": a call placed 4194304 stamps")));
}

// Whether a later call, of a short line, places any stamp.
template <typename Call>
bool placesMore(Call&& call) {
  const std::uint64_t before = QeltDesktop::writtenBytes();
  call(std::vector<Sample>{{0.0f, 0.0f}, {30.0f, 0.0f}});
  return QeltDesktop::writtenBytes() > before;
}

TEST(CallBound, HoldsForEveryKindOfDrawable) {
  if (QELT_SANITIZED || *QELT_EMULATOR != '\0') GTEST_SKIP() << "a gigabyte each";
  const std::vector<Sample> samples = farZigzag();
  const std::vector<Sample> rest(samples.begin() + 1, samples.end());
  {
    DrawingBoard board({.version = 7, .size = 6.0f, .curve = false});
    const auto stroke = board.stored(samples);
    expectBounded(board, 1, "Pencil2StrokeDrawableGLV7", [&] { board.redraw(*stroke); });
    EXPECT_TRUE(placesMore([&](const auto& line) { board.redraw(*board.stored(line)); }));
  }
  {
    DrawingBoard board;
    board.down(samples.front());
    expectBounded(board, 1, "Pencil2StrokeDrawableGLV8", [&] { board.move(rest); });
    // The record tells the prediction of every stamp, and of the last one that the whole walk comes to,
    // between the mid points of the last three points.
    EXPECT_EQ(board.shared.mStampCount, kPoints * 262144);
    EXPECT_NEAR(board.shared.mLastStampY, 19.0f, 0.5f);
    // The next call may place as many again: one long segment, and then 40 units, a stamp every 0.4.
    const auto stampsOfMove = [&board](const Sample& to) {
      const std::uint64_t before = QeltDesktop::writtenBytes();
      board.move({to});
      return static_cast<double>(QeltDesktop::writtenBytes() - before) / (6 * 11 * sizeof(float));
    };
    EXPECT_EQ(stampsOfMove({40.0f, 20.0f}), 262144.0);
    EXPECT_NEAR(stampsOfMove({80.0f, 20.0f}), 100.0, 1.0);
  }
  {
    OutlineBoard board({.version = 4, .size = 6.0f});
    expectBounded(board, 2, "Pencil2OutlineDrawableGLV4", [&] { board.outline(samples); });
    EXPECT_TRUE(placesMore([&](const auto& line) { board.outline(line); }));
  }
  {
    DrawableBoard<Qelt::Pencil2PreviewDrawableGL> board({.size = 6.0f});
    const Qelt::MotionEvent event = board.recorded(samples);
    expectBounded(board, 1, "Pencil2PreviewDrawableGL", [&] { board.redraw(event); });
    EXPECT_TRUE(placesMore([&](const auto& line) { board.stroke(line); }));
  }
  {
    DrawableBoard<Qelt::Pencil2PredictionDrawableGL> board({.size = 6.0f});
    board.shared.mHasLastStroke = true;
    board.shared.mLastWidth = 6.0f;
    expectBounded(board, 1, "Pencil2PredictionDrawableGL", [&] { board.move(rest); });
    board.shared.mHasLastStroke = true;
    EXPECT_TRUE(placesMore([&](const auto& line) { board.move(line); }));
  }
}

}  // namespace
}  // namespace QeltTests
