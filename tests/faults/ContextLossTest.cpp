// The GL context goes before any task of the render thread and comes back before the same one, twice, or
// before a later one: what is drawn from there on is what is drawn without.

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

  const Call mRestoreAndWipe = [this] {
    mQueue.restoreContext();
    mLayer.clear();
  };
  LogCapture mLog;
  RenderQueue mQueue{RenderQueue::Mode::Caller, RenderQueue::GL::Context};
  QeltDesktop::CanvasLayer mLayer{mQueue, 160, 120, 128};
  long mPosts = 0;
};

TEST_P(ContextLoss, SparesWhatComesAfterwards) {
  const Call lose = [this] { mQueue.loseContext(); };
  const Call loseTwiceAndWipe = [&] {
    for (int i = 0; i < 2; ++i) {
      mQueue.loseContext();
      mQueue.restoreContext();
    }
    mLayer.clear();
  };
  EXPECT_NE(picture({}), std::vector<std::uint8_t>(160 * 120 * 4)) << "nothing was drawn";
  const long posts = mPosts;
  for (long back = 2; back <= posts; ++back) {
    const std::vector<std::uint8_t> expected = picture({{back, mRestoreAndWipe}});
    EXPECT_TRUE(picture({{back, loseTwiceAndWipe}}) == expected)
        << "loss before task " << back << " of " << posts;
    for (const long lost : std::set<long>{1, std::max(back - 4, 1l)}) {
      EXPECT_TRUE(picture({{lost, lose}, {back, mRestoreAndWipe}}) == expected)
          << "lost before task " << lost << ", back before task " << back << " of " << posts;
    }
  }
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
