// No call places more than 4,194,304 stamps, whatever it is handed. Of what is beyond, each kind of drawable
// says one line, and goes on as if it had been placed.

#include <gmock/gmock.h>

#include <cstddef>
#include <string>
#include <vector>

#include "prediction/Pencil2PredictionDrawableGL.h"
#include "preview/Pencil2PreviewDrawableGL.h"
#include "support/DrawableBoard.h"
#include "support/LogCapture.h"

namespace QeltTests {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;

constexpr std::size_t kMost = 4194304;
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

// Floats of the one batch, or an outline's two; and what was said about it.
template <typename Board>
void expectBounded(Board& board, LogCapture& log, std::size_t floatsPerStamp, const std::string& name) {
  for (const std::vector<float>& floats : board.takeBuffers())
    EXPECT_EQ(floats.size(), kMost * floatsPerStamp);
  std::vector<std::string> lines;
  for (const LogLine& line : log.take()) {
    if (line.text.find("left out") != std::string::npos) lines.push_back(line.text);
  }
  EXPECT_THAT(lines, ElementsAre(HasSubstr(name + ": a call placed 4194304 stamps")));
}

TEST(CallBound, HoldsForEveryKindOfDrawable) {
  if (QELT_SANITIZED || *QELT_EMULATOR != '\0') GTEST_SKIP() << "a gigabyte each";
  LogCapture log;
  const std::vector<Sample> samples = farZigzag();
  const std::vector<Sample> rest(samples.begin() + 1, samples.end());
  {
    DrawingBoard board({.version = 7, .size = 6.0f, .curve = false});
    board.redraw(*board.stored(samples));
    expectBounded(board, log, 54, "Pencil2StrokeDrawableGLV7");
  }
  {
    DrawingBoard board;
    board.down(samples.front());
    board.takeBatches();
    board.move(rest);
    expectBounded(board, log, 66, "Pencil2StrokeDrawableGLV8");
    // The record tells the prediction of every stamp, and of the last one that the whole walk comes to,
    // between the mid points of the last three points.
    EXPECT_EQ(board.shared.mStampCount, kPoints * 262144);
    EXPECT_NEAR(board.shared.mLastStampY, 19.0f, 0.5f);
    board.move({{40.0f, 20.0f}});  // the next call may place as many again
    EXPECT_EQ(board.takeFloats().size(), 262144u * 66);
  }
  {
    OutlineBoard board({.version = 4, .size = 6.0f});
    board.outline(samples);
    expectBounded(board, log, 42, "Pencil2OutlineDrawableGLV4");
  }
  {
    DrawableBoard<Qelt::Pencil2PreviewDrawableGL> board({.size = 6.0f});
    board.redraw(board.recorded(samples));
    expectBounded(board, log, 54, "Pencil2PreviewDrawableGL");
  }
  {
    DrawableBoard<Qelt::Pencil2PredictionDrawableGL> board({.size = 6.0f});
    board.shared.mHasLastStroke = true;
    board.shared.mLastWidth = 6.0f;
    board.move(rest);
    expectBounded(board, log, 66, "Pencil2PredictionDrawableGL");
  }
}

}  // namespace
}  // namespace QeltTests
