// The GL context goes and comes back, twice, between any two tasks of the render thread: the picture at the
// end is the one drawn without it.

#include <gtest/gtest.h>

#include <string>

#include "Stage.h"
#include "gl/ITask.h"
#include "support/LogCapture.h"
#include "support/Versions.h"

namespace QeltTests {
namespace {

using QeltDesktop::RenderQueue;

class LossTask final : public Qelt::ITask {
 public:
  explicit LossTask(RenderQueue& queue) : mQueue(queue) {}
  void run() override {
    for (int i = 0; i < 2; ++i) {
      mQueue.loseContext();
      mQueue.restoreContext();
    }
  }

 private:
  RenderQueue& mQueue;
};

struct Case {
  const char* name;
  int version;
  void (*draw)(Stage&);
};

class ContextLoss : public testing::TestWithParam<Case> {
 protected:
  // Draws with a loss ahead of the given post, from 1; 0 for none.
  std::vector<std::uint8_t> picture(long lossBefore) {
    mLayer.clear();
    Stage stage(mQueue, &mLayer, GetParam().version);
    mPosts = 0;
    mQueue.accept = [this, lossBefore](const Qelt::ITask&) {
      if (++mPosts == lossBefore) mQueue.Post(new LossTask(mQueue));
      return true;
    };
    GetParam().draw(stage);
    mQueue.finish();
    mQueue.accept = nullptr;
    return mLayer.readPixels();
  }

  LogCapture mLog;
  RenderQueue mQueue{RenderQueue::Mode::Caller, RenderQueue::GL::Context};
  QeltDesktop::CanvasLayer mLayer{mQueue, 160, 120, 128};
  long mPosts = 0;
};

TEST_P(ContextLoss, LeavesThePictureAsItIsWithout) {
  const std::vector<std::uint8_t> expected = picture(0);
  const long posts = mPosts;
  ASSERT_NE(expected, std::vector<std::uint8_t>(expected.size())) << "nothing was drawn";
  for (long number = 1; number <= posts; ++number) {
    EXPECT_TRUE(picture(number) == expected) << "loss before task " << number << " of " << posts;
  }
  RecordProperty("losses", static_cast<int>(2 * posts));
}

INSTANTIATE_TEST_SUITE_P(Strokes, ContextLoss,
                         testing::Values(Case{"LiveVersion1", 1, [](Stage& stage) { stage.live(false); }},
                                         Case{"LiveVersion7", 7, [](Stage& stage) { stage.live(false); }},
                                         Case{"LiveVersion8", 8, [](Stage& stage) { stage.live(false); }},
                                         Case{"Redraws", 8, [](Stage& stage) { stage.redraw(false); }},
                                         Case{"Outlines", 8, [](Stage& stage) { stage.outline(false); }},
                                         Case{"Preview", 8, [](Stage& stage) { stage.preview(false); }},
                                         Case{"Prediction", 8, [](Stage& stage) { stage.predict(false); }}),
                         [](const auto& test) { return std::string(test.param.name); });

}  // namespace
}  // namespace QeltTests
