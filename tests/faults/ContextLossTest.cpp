// The GL context goes and comes back, at once or later, between any two tasks of the render thread. The layer
// comes back empty, and from there on it is drawn into as into one that was cleared there.

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <map>
#include <set>
#include <string>
#include <utility>

#include "desktop/gl/CallTask.h"
#include "gl/ITask.h"
#include "support/LogCapture.h"
#include "support/PenBoard.h"

namespace QeltTests {
namespace {

using QeltDesktop::RenderQueue;

struct Case {
  Kind kind;
  int version;
};

class ContextLoss : public testing::TestWithParam<Case> {
 protected:
  // What is drawn with a call made on the render thread ahead of one post or another, from 1.
  using Call = std::function<void()>;
  std::vector<std::uint8_t> picture(std::map<long, Call> calls) {
    mLayer.clear();
    PenBoard board({.version = GetParam().version, .size = 4.0f}, mQueue, &mLayer);
    mPosts = 0;
    mQueue.accept = [&](const Qelt::ITask&) {
      if (const auto call = calls.find(++mPosts); call != calls.end()) {
        const auto accept = std::exchange(mQueue.accept, nullptr);
        QeltDesktop::postCall(mQueue, call->second);
        mQueue.accept = accept;
      }
      return true;
    };
    board.draw(GetParam().kind);
    mQueue.finish();
    mQueue.accept = nullptr;
    mQueue.restoreContext();
    return mLayer.readPixels();
  }

  const Call mClear = [this] { mLayer.clear(); };
  const Call mLose = [this] { mQueue.loseContext(); };
  const Call mRestore = [this] {
    const int before = mLayer.timesEmptied();
    mQueue.restoreContext();
    EXPECT_EQ(mLayer.timesEmptied(), before + 1);
    EXPECT_TRUE(mLayer.readPixels() == mEmpty);
  };
  const Call mLoseTwice = [this] {
    for (int i = 0; i < 2; ++i) {
      mLose();
      mRestore();
    }
  };
  LogCapture mLog;
  RenderQueue mQueue{RenderQueue::Mode::Caller, RenderQueue::GL::Context};
  QeltDesktop::CanvasLayer mLayer{mQueue, 160, 120, 128};
  const std::vector<std::uint8_t> mEmpty = mLayer.readPixels();
  long mPosts = 0;
};

TEST_P(ContextLoss, EmptiesTheLayerAndSparesWhatIsDrawnAfterwards) {
  const std::vector<std::uint8_t> whole = picture({});
  const long posts = mPosts;
  ASSERT_NE(whole, mEmpty) << "nothing was drawn";
  int losses = 0;
  for (long back = 1; back <= posts; ++back) {
    const std::vector<std::uint8_t> expected = picture({{back, mClear}});
    EXPECT_TRUE(picture({{back, mLoseTwice}}) == expected) << "lost before task " << back << " of " << posts;
    losses += 2;
    for (const long lost : std::set<long>{1, std::max(back - 4, 1l)}) {
      if (lost == back) continue;
      EXPECT_TRUE(picture({{lost, mLose}, {back, mRestore}}) == expected)
          << "lost before task " << lost << ", back before task " << back << " of " << posts;
    }
  }
  EXPECT_TRUE(picture({{1, mLose}}) == mEmpty) << "lost for good";
  EXPECT_TRUE(picture({}) == whole) << "drawn again";
  RecordProperty("losses", losses);
}

INSTANTIATE_TEST_SUITE_P(Strokes, ContextLoss,
                         testing::Values(Case{Kind::Live, 1}, Case{Kind::Live, 7}, Case{Kind::Live, 8},
                                         Case{Kind::Redraw, 8}, Case{Kind::Outline, 8},
                                         Case{Kind::Preview, 8}, Case{Kind::Prediction, 8}),
                         [](const auto& test) {
                           return testing::PrintToString(test.param.kind) + "Version" +
                                  std::to_string(test.param.version);
                         });

}  // namespace
}  // namespace QeltTests
