#include <gtest/gtest.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <ostream>
#include <string>
#include <utility>
#include <vector>

#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/PenCanvas.h"
#include "pencommon/PenStrokeDataManager.h"
#include "prediction/Pencil2PredictionDrawableGL.h"
#include "preview/Pencil2PreviewDrawableGL.h"
#include "support/DrawableBoard.h"
#include "support/FakeLayer.h"
#include "support/Versions.h"

// A call draws into the tiles that its rectangle meets, and into no other:
//
//          tile 0   |   tile 1
//        +----------|--+           what a stamp of width w covers
//        |  +----+  |  |
//        |  |  * |  |  |           what the call reports around its centre
//        |  +----+  |  |
//        +----------|--+           missing: the stamp's part in tile 1
//
// How far from a stamp's centre both reach, in stroke units (p is a device pixel, r the outline's size):
//
//     drawable                   stamp              rectangle                          whole
//     stroke 1, 2, 3, 5          w / 2              at least w / 2                     always
//     stroke 4, 6, 7, preview    (w + 1) / 2        at least (w + 1) / 2               always
//     stroke 8, move             w / 2 + p / 2      w / 4 + 5                          up to w = 20
//     stroke 8, closing segment  w / 2 + p / 2      w / 4 + 1, or 6 from the segment   up to w = 12
//     stroke 8, tap              w / 2 + p / 2      w / 4, or 5 from the point         up to w = 10
//     stroke 8, redraw           w / 2 + p / 2      w / 4 + 5, a tap 10                up to w = 20
//     prediction                 w / 2 + p / 2      w / 4 + 1                          up to w = 4
//     outline, straight          its half + r       its half + r + 5                   always
//     outline, curve             its half + r       its half + r, not cut              but for 1 unit
//
// The half pixel is of no account, for a stamp draws only the pixels whose middle it covers. An outline's
// stamp lies around its centre cut to whole numbers, up to 1 unit from the one that the rectangle is around.
// The cached drawing of a stroke has the rectangle of the redraw that stored it.
namespace QeltTests {
namespace {

using PredictionBoard = DrawableBoard<Qelt::Pencil2PredictionDrawableGL>;
using PreviewBoard = DrawableBoard<Qelt::Pencil2PreviewDrawableGL>;

constexpr int kSide = 128;  // of the layer, pixels
constexpr int kTile = 64;
constexpr float kRim = 3.0f;  // outline size

// Moves: live, and the pen stays down. Stored: drawn twice, the second time from the cache.
enum class Way { Moves, Live, Event, Stored, Outline, Preview, PreviewEvent, Prediction };

struct Kind {
  Way way;
  int version;
  float width;  // of the stamps, stroke units; the pen is upright
  bool curve = true;
  float zoom = 1.0f;
  bool tap = false;
};

std::ostream& operator<<(std::ostream& out, const Kind& kind) {
  static constexpr const char* kWays[] = {"moves",   "live",    "event",         "stored",
                                          "outline", "preview", "preview event", "prediction"};
  return out << kWays[static_cast<int>(kind.way)] << ", version " << kind.version << ", width " << kind.width
             << (kind.curve ? ", curve" : ", straight") << (kind.tap ? ", tap" : "") << ", zoom "
             << kind.zoom;
}

// A tile of a layer that says it is the whole layer: every rectangle on the layer meets it.
class BoundlessTile : public FakeTile {
 public:
  explicit BoundlessTile(Qelt::ISPSubBitmap& tile) : FakeTile(0, kSide), mTile(tile) {}
  const Qelt::Matrix4<float>& GetProjection() const override { return mTile.GetProjection(); }
  void BeginRender(int mode) override { mTile.BeginRender(mode); }
  void EndRender(int mode) override { mTile.EndRender(mode); }

 private:
  Qelt::ISPSubBitmap& mTile;
};

// A view of a layer that draws into all its tiles, whatever a call reports.
class BoundlessCanvas : public QeltDesktop::PenCanvas {
 public:
  explicit BoundlessCanvas(Board& board) : PenCanvas(&board.queue, board.layer) {
    Qelt::ISPBitmap& bitmap = *board.layer->GetBitmap();
    for (int i = 0; i < bitmap.GetTileCount(); ++i) mLayer.tiles.emplace_back(*bitmap.GetSubBitmap(i));
  }
  Qelt::ISPLayer* GetLayer() override { return &mLayer; }

 private:
  struct Layer : FakeLayer {
    int GetTileCount() const override { return static_cast<int>(tiles.size()); }
    Qelt::ISPSubBitmap* GetSubBitmap(int index) override { return &tiles[static_cast<std::size_t>(index)]; }
    std::vector<BoundlessTile> tiles;
  };
  Layer mLayer;
};

// How far from the border, in pixels, strokes run so that their stamps hang over it. An outline's also lie
// where a stamp's centre, once cut, takes it over the border and its rectangle ends before it.
std::vector<float> distancesOf(const Kind& kind) {
  const float half = kind.width / 2.0f * kind.zoom;
  if (kind.way != Way::Outline) return {0.4f * half, 0.85f * half};
  const float reach = (kind.version < 4 ? half : half + 0.5f * kind.zoom) + kRim * kind.zoom;
  return {0.85f * reach, reach + 0.2f};
}

// Down beside the right border of the first tile, round its corner and back along its lower border; or the
// same turned by half a turn, in the last tile. Stroke units.
std::vector<Sample> besideTheBorder(const Kind& kind, float distance, bool turned) {
  const float border = kTile - distance;
  std::vector<Sample> samples;
  const auto add = [&](float x, float y) {
    samples.push_back({(turned ? kSide - x : x) / kind.zoom, (turned ? kSide - y : y) / kind.zoom, 0.8f});
  };
  if (!kind.tap) {
    for (float y = 20.37f; y < border; y += 5.0f) add(border, y);
  }
  add(border, border);
  if (!kind.tap) {
    for (float x = border - 5.0f; x > 20.0f; x -= 5.0f) add(x, border);
  }
  return samples;
}

// A stroke's picture, and the rectangles of the calls that placed its stamps, in pixels.
struct Drawing {
  std::vector<std::uint8_t> pixels;
  std::vector<Qelt::RectF> areas;
};

// Both kinds of tiles meet at the same borders and round alike, so that pictures can be compared byte by
// byte. One tile rounds corners of stamps its own way, by up to 1/256 of a pixel.
enum class Layer { Tiles, BoundlessTiles, OneTile };

// Draws a kind of stroke on all its ways beside the border.
class Drawer {
 public:
  Drawer(const Kind& kind, Layer layer) : mKind(kind), mLayer(layer) {}

  std::vector<Drawing> draw() {
    if (mKind.way == Way::Outline) return drawOn<OutlineBoard>();
    if (mKind.way == Way::Prediction) return drawOn<PredictionBoard>();
    if (mKind.way == Way::Preview || mKind.way == Way::PreviewEvent) return drawOn<PreviewBoard>();
    return drawOn<DrawingBoard>();
  }

 private:
  template <typename SomeBoard>
  std::vector<Drawing> drawOn() {
    SomeBoard board({.version = mKind.version,
                     .size = mKind.width,
                     .curve = mKind.curve,
                     .width = kSide,
                     .height = kSide,
                     .tile = mLayer == Layer::OneTile ? QeltDesktop::CanvasLayer::kOneTile : kTile});
    BoundlessCanvas boundless(board);
    QeltDesktop::PenCanvas& canvas = mLayer == Layer::BoundlessTiles ? boundless : board.canvas;
    canvas.setMatrix(viewOf(mKind.zoom));
    board.drawable->SetCanvas(&canvas);
    std::vector<Drawing> drawings;
    for (const float distance : distancesOf(mKind)) {
      for (const bool turned : {false, true}) {
        board.layer->clear();
        drawOne(board, besideTheBorder(mKind, distance, turned));
        drawings.push_back({board.pixels(), std::exchange(mAreas, {})});
      }
    }
    return drawings;
  }

  void drawOne(OutlineBoard& board, const std::vector<Sample>& way) {
    board.drawable->SetOutlineSize(kRim);
    board.drawable->SetOutlineColor(static_cast<int>(0xFF2060C0u));
    board.outline(way);
    note(board);
  }

  void drawOne(PredictionBoard& board, const std::vector<Sample>& way) {
    Qelt::Pencil2Data& live = board.shared;
    live.mStartX = live.mStartY = 3.3f;
    live.mLastStampX = way[0].x;
    live.mLastStampY = way[0].y;
    live.mLastX = way[1].x;
    live.mLastY = way[1].y;
    live.mLastWidth = mKind.width;
    live.mLastAlpha = 0.6f;
    live.mHasLastStroke = true;
    board.move({way.begin() + 2, way.end()});
    note(board);
  }

  void drawOne(PreviewBoard& board, const std::vector<Sample>& way) {
    if (mKind.way == Way::Preview) return drawLive(board, way);
    board.redraw(board.recorded(way));
    note(board);
  }

  void drawOne(DrawingBoard& board, const std::vector<Sample>& way) {
    if (mKind.way == Way::Stored) return drawStored(board, way);
    if (mKind.way != Way::Event) return drawLive(board, way);
    board.redraw(board.recorded(way));
    note(board);
  }

  void drawLive(Board& board, const std::vector<Sample>& way) {
    board.down(way.front());
    if (!mKind.tap) {
      board.move({way.begin() + 1, way.end()});
      note(board);
    }
    if (mKind.way == Way::Moves) return;
    board.up(way.back());
    note(board);
  }

  void drawStored(DrawingBoard& board, const std::vector<Sample>& way) {
    const auto stroke = board.stored(way);
    Qelt::PenStrokeDataManager& cache = *Qelt::PenStrokeDataManager::GetInstance();
    cache.CreateStrokeData(stroke->GetRuntimeHandle());
    for (int i = 0; i < 2; ++i) {
      board.takePosts();
      board.redraw(*stroke);
      note(board);
    }
    const std::vector<std::string> posts = board.takePosts();
    EXPECT_EQ(std::count(posts.begin(), posts.end(), "Unref"), 1) << "not from the cache";
    board.queue.finish();
    cache.DropStrokeData(stroke->GetRuntimeHandle());
  }

  void note(const Board& board) {
    Qelt::RectF area = board.rect;
    for (float* edge : {&area.left, &area.top, &area.right, &area.bottom}) *edge *= mKind.zoom;
    mAreas.push_back(area);
  }

  const Kind mKind;
  const Layer mLayer;
  std::vector<Qelt::RectF> mAreas;
};

// What the borders of tiles do to a kind of stroke, in pixels.
struct Effect {
  int inked = 0;
  int overBorder = 0;   // inked and outside the tile that the stroke runs in
  int missing = 0;      // other than on boundless tiles
  int unexplained = 0;  // of these, in tiles that every call's rectangle meets
  int shifted = 0;      // far from what one tile shows: grain that does not meet
};

Effect effectOf(const Kind& kind) {
  const std::vector<Drawing> tiled = Drawer(kind, Layer::Tiles).draw();
  const std::vector<Drawing> whole = Drawer(kind, Layer::BoundlessTiles).draw();
  const std::vector<Drawing> one = Drawer(kind, Layer::OneTile).draw();
  Effect effect;
  for (std::size_t i = 0; i < whole.size(); ++i) {
    const int home = i % 2 == 0 ? 0 : 3;
    for (int at = 0; at < kSide * kSide; ++at) {
      const int column = at % kSide / kTile, row = at / kSide / kTile;
      const auto alpha = [at](const Drawing& d) { return d.pixels[static_cast<std::size_t>(at) * 4 + 3]; };
      if (std::abs(alpha(one[i]) - alpha(whole[i])) > 40) ++effect.shifted;
      if (alpha(whole[i]) != 0) {
        ++effect.inked;
        if (row * 2 + column != home) ++effect.overBorder;
      }
      if (alpha(tiled[i]) == alpha(whole[i])) continue;
      ++effect.missing;
      Qelt::RectF tile;
      tile.Set(static_cast<float>(column * kTile), static_cast<float>(row * kTile),
               static_cast<float>((column + 1) * kTile), static_cast<float>((row + 1) * kTile));
      const auto meets = [&](const Qelt::RectF& area) { return tile.IsIntersect(area); };
      if (std::all_of(tiled[i].areas.begin(), tiled[i].areas.end(), meets)) ++effect.unexplained;
    }
  }
  return effect;
}

std::vector<Kind> wholeKinds() {
  std::vector<Kind> kinds;
  for (const bool curve : {true, false}) {
    for (const int version : allVersions()) {
      kinds.push_back({Way::Live, version, version == 8 ? 12.0f : 9.0f, curve});
      kinds.push_back({Way::Event, version, version == 8 ? 20.0f : 9.0f, curve});
      kinds.push_back({Way::Stored, version, version == 8 ? 20.0f : 9.0f, curve});
    }
    kinds.push_back({Way::Preview, 8, 9.0f, curve});
    kinds.push_back({Way::PreviewEvent, 8, 9.0f, curve});
  }
  for (const float zoom : {0.5f, 1.0f, 2.0f}) kinds.push_back({Way::Moves, 8, 18.0f, true, zoom});
  kinds.push_back({Way::Moves, 8, 20.0f});
  for (const int version : outlineVersions()) kinds.push_back({Way::Outline, version, 2.6f, false, 4.0f});
  for (const float zoom : {1.0f, 4.0f}) kinds.push_back({Way::Prediction, 8, 4.0f, true, zoom});
  kinds.push_back({Way::Live, 1, 9.0f, true, 1.0f, true});
  kinds.push_back({Way::Live, 8, 10.0f, true, 1.0f, true});
  kinds.push_back({Way::Stored, 8, 20.0f, true, 1.0f, true});
  kinds.push_back({Way::Preview, 8, 9.0f, true, 1.0f, true});
  return kinds;
}

TEST(TileBorders, CutNothingThatTheRectanglesReach) {
  for (const Kind& kind : wholeKinds()) {
    SCOPED_TRACE(testing::PrintToString(kind));
    const Effect effect = effectOf(kind);
    EXPECT_GT(effect.overBorder, 40);
    EXPECT_EQ(effect.missing, 0);
    EXPECT_LE(effect.shifted, effect.inked / 50);
  }
}

// Kept: the rectangles are promised, so what is too wide for them is cut at the borders of tiles.
TEST(TileBorders, CutWhatHangsOutOfTheRectangles) {
  std::vector<Kind> kinds{
      {Way::Prediction, 8, 6.571f, true, 4.0f},   // upright
      {Way::Prediction, 8, 11.499f, true, 4.0f},  // the same pen laid down
      {Way::Moves, 8, 40.0f},
      {Way::Live, 8, 18.0f},  // its closing segment
      {Way::Live, 8, 18.0f, true, 1.0f, true},
      {Way::Event, 8, 40.0f},
      {Way::Stored, 8, 40.0f},
  };
  for (const int version : outlineVersions()) kinds.push_back({Way::Outline, version, 2.6f, true, 4.0f});
  for (const Kind& kind : kinds) {
    SCOPED_TRACE(testing::PrintToString(kind));
    const Effect effect = effectOf(kind);
    EXPECT_GT(effect.missing, 10);
    EXPECT_EQ(effect.unexplained, 0);
  }
}

}  // namespace
}  // namespace QeltTests
