#include <gtest/gtest.h>

#include <map>
#include <thread>
#include <utility>
#include <vector>

#include "support/PenBoard.h"

namespace QeltTests {
namespace {

using Floats = std::vector<float>;

// What a page and a settings dialog draw, each with a pen of its own, through one render thread: the page's
// floats, then the dialog's.
std::vector<Floats> drawn(bool onTwoThreads) {
  QeltDesktop::RenderQueue queue(QeltDesktop::RenderQueue::Mode::Thread, QeltDesktop::RenderQueue::GL::None);
  PenBoard page({}, queue, nullptr), dialog({.version = 1}, queue, nullptr);
  page.makePen();
  dialog.makePen();
  std::map<const Qelt::PenDrawableRT*, Floats> all;
  QeltDesktop::setBatchObserver([&all](const QeltDesktop::Batch& batch) {
    Floats& floats = all[batch.drawable];
    floats.insert(floats.end(), batch.buffers[0].begin(), batch.buffers[0].end());
  });
  constexpr int kStrokes = 60;
  std::thread other([&dialog] {
    for (int i = 0; i < kStrokes; ++i) {
      dialog.pen->SetSize(2.0f + 0.05f * static_cast<float>(i));
      dialog.draw(Kind::Preview);
    }
  });
  if (!onTwoThreads) other.join();
  for (int i = 0; i < kStrokes; ++i) page.draw(Kind::Live);
  if (onTwoThreads) other.join();
  queue.finish();
  QeltDesktop::setBatchObserver(nullptr);
  std::vector<Floats> both;
  for (auto& [drawable, floats] : all) both.push_back(std::move(floats));
  if (both.size() == 2 && both[0].size() < both[1].size()) std::swap(both[0], both[1]);
  return both;
}

TEST(TwoPens, MayDrawOnTwoThreadsThroughOneQueue) {
  const std::vector<Floats> inTurn = drawn(false);
  ASSERT_EQ(inTurn.size(), 2u);
  ASSERT_NE(inTurn[0].size(), inTurn[1].size());
  EXPECT_TRUE(drawn(true) == inTurn);
}

}  // namespace
}  // namespace QeltTests
