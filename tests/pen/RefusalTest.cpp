// What every kind of drawing refuses or makes good, in every version that has one of its own: arguments that
// are missing, numbers that are NaN, sizes that are not positive or not finite, strokes without points.

#include <gmock/gmock.h>

#include <cmath>
#include <functional>
#include <utility>
#include <vector>

#include "base/Error.h"
#include "base/List.h"
#include "support/LogCapture.h"
#include "support/PenBoard.h"

namespace QeltTests {
namespace {

using Qelt::Error;
using Qelt::MotionEvent;
using QeltDesktop::StoredStroke;
using testing::Each;
using testing::IsEmpty;

constexpr float kNoSizes[] = {0.0f, -3.0f, NAN, INFINITY, -INFINITY};

// Moves that no size drops.
const std::vector<Sample> kStroke = {{10.0f, 10.0f, 0.3f},
                                     {18.0f, 11.0f, 0.5f, 0.3f, 0.2f},
                                     {26.0f, 11.5f, 0.9f, 0.77f, 0.4f},
                                     {30.0f, 19.0f, 0.4f, 0.2f, 0.1f},
                                     {41.0f, 24.0f, 0.6f}};

class Refusals : public testing::TestWithParam<Drawing> {
 protected:
  const Kind kind = GetParam().kind;
  const int version = GetParam().version;
  BoardOptions page(bool curve = true) const { return {.version = version, .size = 6.0f, .curve = curve}; }

  // All that is drawn of a stroke.
  std::vector<float> drawn(const std::vector<Sample>& samples, bool curve = true, float size = 6.0f) {
    BoardOptions options = page(curve);
    options.size = size;
    PenBoard board(options);
    board.draw(kind, samples);
    std::vector<float> all;
    for (const auto& buffer : board.takeBuffers()) all.insert(all.end(), buffer.begin(), buffer.end());
    return all;
  }

  // A call of the kind with its input, or with null.
  using Way = std::function<bool(bool hasInput, Qelt::RectF*)>;
  template <typename Input, typename Drawable>
  static Way way(Drawable* drawable, bool (Drawable::*call)(const Input*, Qelt::RectF*), const Input& input) {
    return [=, &input](bool has, auto* area) { return (drawable->*call)(has ? &input : nullptr, area); };
  }
  // The drawable of the kind, and what can be called with an event or a stroke.
  std::pair<Qelt::PenDrawableGL*, std::vector<Way>> ways(PenBoard& board, const MotionEvent& event,
                                                         const Qelt::ObjectStroke& stroke) {
    using Stroke = Qelt::PenStrokeDrawableGL;
    using Outline = Qelt::PenOutlineDrawableGL;
    using Preview = Qelt::PenPreviewDrawableGL;
    using Prediction = Qelt::IPenPredictionDrawableGL;
    const auto of = [&](auto* drawable, const auto&... some) {
      drawable->SetCanvas(&board.canvas);
      return std::pair<Qelt::PenDrawableGL*, std::vector<Way>>(drawable, {some...});
    };
    Stroke* const live = board.pen->GetStrokeDrawableGL();
    if (kind == Kind::Live) return of(live, way(live, &Stroke::Draw, event));
    if (kind == Kind::Redraw)
      return of(live, way(live, &Stroke::RedrawPen, event), way(live, &Stroke::RedrawPen, stroke));
    if (kind == Kind::Outline) {
      Outline* const outline = board.pen->GetOutlineDrawableGL();
      return of(outline, way(outline, &Outline::DrawOutline, event),
                way(outline, &Outline::DrawOutline, stroke));
    }
    if (kind == Kind::Preview) {
      Preview* const preview = board.pen->GetPreviewDrawableGL();
      return of(preview, way(preview, &Preview::RedrawPen, event), way(preview, &Preview::Draw, event));
    }
    // A prediction needs a stroke to go on from.
    board.down(kStroke[0]);
    board.move({kStroke[1], kStroke[2]});
    Prediction* const ahead = board.pen->GetPredictionStrokeDrawableGL();
    return of(ahead, way(ahead, &Prediction::Draw, event));
  }
};
INSTANTIATE_TEST_SUITE_P(Drawings, Refusals, testing::ValuesIn(drawings(allVersions())), drawingName);

TEST_P(Refusals, OfNullAreErrorsAndOfNoCanvasAreSilent) {
  PenBoard board(page());
  const MotionEvent event = board.recorded(kStroke);
  const auto stroke = board.stored(kStroke);
  const auto [drawable, all] = ways(board, event, *stroke);
  board.takePosts();
  for (const Way& call : all) {
    EXPECT_TRUE(isRefused([&] { return call(false, &board.rect); }));
    EXPECT_TRUE(isRefused([&] { return call(true, nullptr); }));
    Error::SetError(0);
    drawable->SetCanvas(nullptr);
    EXPECT_FALSE(call(true, &board.rect));
    EXPECT_EQ(Error::GetError(), 0u);
    drawable->SetCanvas(&board.canvas);
  }
  EXPECT_THAT(board.takePosts(), IsEmpty());
  // Lists are taken and left alone.
  if (auto* const listed = dynamic_cast<Qelt::IPenListRedrawable*>(drawable)) {
    Qelt::List list;
    list.Add(stroke.get());
    board.rect = {};
    EXPECT_TRUE(listed->RedrawPen(&list, &board.rect));
    EXPECT_TRUE(listed->RedrawPen(static_cast<const Qelt::List*>(nullptr), nullptr));
    EXPECT_THAT(board.takePosts(), IsEmpty());
    EXPECT_EQ(board.rect.right, 0.0f);
  }
}

// Kept: of whole strokes curved, the call returns true all the same; straight, the replay's answer counts. No
// point that a stroke could start from is no point at all.
TEST_P(Refusals, OfStrokesWithoutPointsHandEmptyBatchesOver) {
  for (const bool curve : {true, false}) {
    SCOPED_TRACE(curve ? "curve" : "straight");
    PenBoard board(page(curve));
    const std::vector<Sample> nowhere = {{NAN, 1.0f}, {1.0f, NAN}};
    const MotionEvent events[] = {motionEvent(Qelt::kActionUp, {{1.0f, 1.0f}}), board.recorded(nowhere)};
    const StoredStroke none(Qelt::kToolStylus);
    const auto unplaced = board.stored(nowhere);
    const StoredStroke* const strokes[] = {&none, unplaced.get()};
    for (const int i : {0, 1}) {
      const auto [drawable, all] = ways(board, events[i], *strokes[i]);
      board.takeBuffers();
      const bool isWhole = kind != Kind::Live && kind != Kind::Prediction;
      for (std::size_t call = 0; call < all.size(); ++call) {
        Error::SetError(0);
        const bool answer = all[call](true, &board.rect);
        const bool isLive = !isWhole || (kind == Kind::Preview && call == 1);
        if (!isLive) {
          EXPECT_EQ(answer, curve);
          EXPECT_EQ(Error::GetError(), Error::kInvalidArgument);
        } else {
          EXPECT_FALSE(answer);
        }
        EXPECT_THAT(board.takeBuffers(), Each(IsEmpty()));
      }
    }
  }
}

TEST_P(Refusals, OfPointsThatAreNotFiniteAreAsIfTheyHadNotBeen) {
  std::vector<Sample> broken = kStroke;
  broken.insert(broken.begin() + 2, {NAN, 3.0f, 0.9f, 0.5f, 1.0f});
  broken.insert(broken.end() - 1, {3.0f, -INFINITY, 0.9f, 0.5f, 1.0f});
  broken.insert(broken.end() - 1, {-INFINITY, NAN});
  for (const bool curve : {true, false}) {
    EXPECT_EQ(drawn(broken, curve), drawn(kStroke, curve)) << (curve ? "curve" : "straight");
  }
  // All that is drawn of whole strokes. A live stroke cannot begin nowhere, nor goes it on from there.
  const auto whole = [this](const std::vector<Sample>& samples) {
    PenBoard board(page());
    board.draw(kind, samples);
    EXPECT_TRUE(board.rect.left <= board.rect.right);
    std::vector<std::vector<float>> buffers = board.takeBuffers();
    if (kind == Kind::Preview) buffers.erase(buffers.begin(), buffers.end() - 1);
    return buffers;
  };
  if (kind == Kind::Redraw || kind == Kind::Outline || kind == Kind::Preview) {
    broken = kStroke;
    broken.insert(broken.begin(), {NAN, 1.0f, 0.9f, 0.5f, 1.0f});
    EXPECT_EQ(whole(broken), whole(kStroke));
    // At the very end there is no point to close to.
    broken = kStroke;
    broken.push_back({NAN, NAN});
    EXPECT_LT(whole(broken).back().size(), whole(kStroke).back().size());
  }
  if (kind == Kind::Live) {
    PenBoard board(page());
    EXPECT_FALSE(board.down({NAN, 10.0f}));
    EXPECT_FALSE(board.move({kStroke[1]}));  // nothing has begun
    board.down(kStroke[0]);
    board.move({kStroke[2]});
    board.takeFloats();
    EXPECT_TRUE(board.up({NAN, NAN}));
    EXPECT_THAT(board.takeFloats(), IsEmpty());
    EXPECT_TRUE(board.rect.left <= board.rect.right);
  }
}

TEST_P(Refusals, OfPressureAndAnglesThatAreNotFiniteTakeTheVersionsOwn) {
  std::vector<Sample> broken = kStroke, plain = kStroke;
  for (std::size_t i = 0; i < kStroke.size(); ++i) {
    const bool isStroke = kind != Kind::Preview && kind != Kind::Outline;
    plain[i] = {kStroke[i].x, kStroke[i].y, isStroke ? expectedOf(version).unknownPressure : 0.5f};
    broken[i] = {kStroke[i].x, kStroke[i].y, NAN, i % 2 == 0 ? INFINITY : NAN, i % 2 == 0 ? NAN : -INFINITY};
  }
  EXPECT_EQ(drawn(broken), drawn(plain));
}

TEST_P(Refusals, OfSizesThatAreNotPositiveOrNotFinitePlaceNothing) {
  const LogCapture log;
  for (const float size : kNoSizes) {
    for (const bool curve : {true, false}) {
      EXPECT_THAT(drawn(kStroke, curve, size), IsEmpty()) << size;
      EXPECT_THAT(drawn(std::vector(4, kStroke[0]), curve, size), IsEmpty()) << size;
    }
  }
}

// Such a size as the pen goes down gives way to the first that is one, in strokes and taps alike.
TEST_P(Refusals, BegunAtNoSizeTakesTheFirstThatIsOne) {
  if (kind != Kind::Live && kind != Kind::Preview) return;
  const auto begunAt = [this](float size, std::size_t moves) {
    PenBoard board(page(kind == Kind::Live));  // of a preview curves have no spacing to be walked at then
    const auto draw = [&](int action, const Sample& sample) {
      const MotionEvent event = board.eventOf(action, {sample});
      auto* const preview = board.pen->GetPreviewDrawableGL();
      preview->SetCanvas(&board.canvas);
      kind == Kind::Live ? board.send(event) : preview->Draw(&event, &board.rect);
    };
    board.pen->SetSize(size);
    draw(Qelt::kActionDown, kStroke[0]);
    board.pen->SetSize(6.0f);
    for (std::size_t i = 1; i <= moves; ++i) draw(Qelt::kActionMove, kStroke[i]);
    draw(Qelt::kActionUp, kStroke[moves]);
    return board.takeFloats();
  };
  if (kind == Kind::Live && expectedOf(version).spacingFollowsSize) {
    EXPECT_THAT(begunAt(0.0f, 4), IsEmpty());
    return;
  }
  for (const float size : kNoSizes) {
    EXPECT_EQ(begunAt(size, 0), begunAt(6.0f, 0)) << size;
    // A fifth of infinity is a minimum move that nothing reaches.
    if (size != INFINITY) {
      EXPECT_EQ(begunAt(size, 4), begunAt(6.0f, 4)) << size;
    }
  }
}

}  // namespace
}  // namespace QeltTests
