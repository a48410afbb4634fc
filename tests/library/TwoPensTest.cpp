#include <gtest/gtest.h>

#include <map>
#include <memory>
#include <thread>
#include <vector>

#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/pencommon/BatchObserver.h"
#include "desktop/pencommon/PenDataManager.h"
#include "pencommon/Pen.h"
#include "pencommon/PenPreviewDrawableGL.h"
#include "pencommon/PenStrokeDrawableGL.h"
#include "support/Board.h"

namespace QeltTests {
namespace {

using Floats = std::vector<float>;

constexpr int kStrokes = 60;

// A page and a settings dialog, each with a pen of its own on a thread of its own, share a render thread.
class TwoPens : public testing::Test {
 protected:
  struct Desk {
    explicit Desk(Qelt::IGLMsgQueue& queue, int version) : canvas(&queue, nullptr), data(&queue) {
      static const QeltDesktop::PluginLibrary library(QELT_PLUGIN_PATH);
      pen.reset(library.createPen());
      pen->setPenDataManager(&data);
      pen->setVersion(version);
      pen->SetSize(5.0f);
    }
    template <typename Drawable>
    void draw(Drawable* drawable, float y) {
      drawable->SetCanvas(&canvas);
      Qelt::RectF rect;
      const Sample samples[] = {{10.0f, y}, {30.0f, y + 5.0f}, {55.0f, y - 5.0f}};
      const int actions[] = {Qelt::kActionDown, Qelt::kActionMove, Qelt::kActionUp};
      for (int i = 0; i < 3; ++i) {
        const Qelt::MotionEvent event = motionEvent(actions[i], {samples[i]});
        drawable->Draw(&event, &rect);
      }
    }

    QeltDesktop::PenCanvas canvas;
    QeltDesktop::PenDataManager data;
    std::unique_ptr<Qelt::Pen> pen;
  };

  // What each of them drew: the page's floats, then the dialog's.
  std::vector<Floats> drawn(bool atOnce) {
    QeltDesktop::RenderQueue queue(QeltDesktop::RenderQueue::Mode::Thread,
                                   QeltDesktop::RenderQueue::GL::None);
    Desk page(queue, 8), dialog(queue, 1);
    std::map<const Qelt::PenDrawableRT*, Floats> all;
    QeltDesktop::setBatchObserver([&all](const QeltDesktop::Batch& batch) {
      Floats& floats = all[batch.drawable];
      floats.insert(floats.end(), batch.buffers[0].begin(), batch.buffers[0].end());
    });
    const auto write = [&page] {
      for (int i = 0; i < kStrokes; ++i) page.draw(page.pen->GetStrokeDrawableGL(), 10.0f + 0.5f * i);
    };
    const auto choose = [&dialog] {
      for (int i = 0; i < kStrokes; ++i) {
        dialog.pen->SetSize(2.0f + 0.05f * i);
        dialog.draw(dialog.pen->GetPreviewDrawableGL(), 20.0f);
      }
    };
    if (atOnce) {
      std::thread other(choose);
      write();
      other.join();
    } else {
      write();
      choose();
    }
    queue.finish();
    QeltDesktop::setBatchObserver(nullptr);
    std::vector<Floats> both;
    for (auto& [drawable, floats] : all) both.push_back(std::move(floats));
    if (both.size() == 2 && both[0].size() < both[1].size()) std::swap(both[0], both[1]);
    page.pen.reset();
    dialog.pen.reset();
    queue.finish();
    return both;
  }
};

TEST_F(TwoPens, MayDrawOnTwoThreadsThroughOneQueue) {
  const std::vector<Floats> inTurn = drawn(false);
  ASSERT_EQ(inTurn.size(), 2u);
  ASSERT_NE(inTurn[0].size(), inTurn[1].size());
  EXPECT_TRUE(drawn(true) == inTurn);
}

}  // namespace
}  // namespace QeltTests
