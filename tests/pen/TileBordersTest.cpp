#include <gtest/gtest.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <ostream>
#include <string>
#include <vector>

#include "support/PenBoard.h"

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

constexpr int kSide = 128;  // of the layer, pixels
constexpr int kTile = 64;
constexpr float kRim = 3.0f;  // outline size

struct Case {
  Kind kind;
  int version;
  float width;  // of the stamps, stroke units; the pen is upright
  bool curve = true;
  float zoom = 1.0f;
  bool tap = false;
  bool staysDown = false;
};

std::ostream& operator<<(std::ostream& out, const Case& c) {
  return out << c.kind << ", version " << c.version << ", width " << c.width
             << (c.curve ? ", curve" : ", straight") << (c.tap ? ", tap" : "")
             << (c.staysDown ? ", stays down" : "") << ", zoom " << c.zoom;
}

// How far from the border, in pixels, strokes run so that their stamps hang over it. An outline's also lie
// where a stamp's centre, once cut, takes it over the border and its rectangle ends before it.
std::vector<float> distancesOf(const Case& c) {
  const float half = c.width / 2.0f * c.zoom;
  if (c.kind != Kind::Outline) return {0.4f * half, 0.85f * half};
  const float reach = (c.version < 4 ? half : half + 0.5f * c.zoom) + kRim * c.zoom;
  return {0.85f * reach, reach + 0.2f};
}

// Down beside the right border of the first tile, round its corner and back along its lower border; or the
// same turned by half a turn, in the last tile. Stroke units.
std::vector<Sample> besideTheBorder(const Case& c, float distance, bool turned) {
  const float border = kTile - distance;
  std::vector<Sample> samples;
  const auto add = [&](float x, float y) {
    samples.push_back({(turned ? kSide - x : x) / c.zoom, (turned ? kSide - y : y) / c.zoom, 0.8f});
  };
  if (c.tap) {
    for (int i = 0; i < 4; ++i) add(border, border);
    return samples;
  }
  for (float y = 20.37f; y < border; y += 5.0f) add(border, y);
  add(border, border);
  for (float x = border - 5.0f; x > 20.0f; x -= 5.0f) add(x, border);
  return samples;
}

// A stroke's picture, and the rectangles of the calls that placed its stamps, in pixels.
struct Picture {
  std::vector<std::uint8_t> pixels;
  std::vector<Qelt::RectF> areas;
};

// Draws a case on all its ways beside the border. Both kinds of tiles meet at the same borders and round
// alike, so that pictures can be compared byte by byte. One tile rounds corners of stamps its own way, by up
// to 1/256 of a pixel.
std::vector<Picture> drawn(const Case& c, Target target, int tile) {
  PenBoard board({.version = c.version,
                  .size = c.width,
                  .curve = c.curve,
                  .width = kSide,
                  .height = kSide,
                  .tile = tile});
  board.canvas.setTarget(target);
  board.zoom(c.zoom);
  std::vector<Picture> pictures;
  for (const float distance : distancesOf(c)) {
    for (const bool turned : {false, true}) {
      Picture& picture = pictures.emplace_back();
      board.layer->clear();
      int calls = 0;
      board.draw(c.kind, besideTheBorder(c, distance, turned), [&](const PenBoard::Call& call) {
        ++calls;
        if (c.staysDown && calls > 3) return;
        // Of a prediction only what it adds is looked at.
        if (c.kind == Kind::Prediction && calls == 4) board.layer->clear();
        call(&(board.rect = {}));
        if (board.takeFloats().empty() || (c.kind == Kind::Prediction && calls < 4)) return;
        Qelt::RectF& area = picture.areas.emplace_back(board.rect);
        for (float* edge : {&area.left, &area.top, &area.right, &area.bottom}) *edge *= c.zoom;
      });
      picture.pixels = board.pixels();
    }
  }
  return pictures;
}

// What the borders of tiles do to a stroke, in pixels.
struct Effect {
  int inked = 0;
  int overBorder = 0;   // inked and outside the tile that the stroke runs in
  int missing = 0;      // other than on boundless tiles
  int unexplained = 0;  // of these, in tiles that every call's rectangle meets
  int shifted = 0;      // far from what one tile shows: grain that does not meet
};

Effect effectOf(const Case& c) {
  const std::vector<Picture> tiled = drawn(c, Target::Whole, kTile);
  const std::vector<Picture> whole = drawn(c, Target::BoundlessTiles, kTile);
  const std::vector<Picture> one = drawn(c, Target::Whole, QeltDesktop::CanvasLayer::kOneTile);
  Effect effect;
  for (std::size_t i = 0; i < whole.size(); ++i) {
    const int home = i % 2 == 0 ? 0 : 3;
    for (int at = 0; at < kSide * kSide; ++at) {
      const int column = at % kSide / kTile, row = at / kSide / kTile;
      const auto alpha = [at](const Picture& p) { return p.pixels[static_cast<std::size_t>(at) * 4 + 3]; };
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

TEST(TileBorders, CutNothingThatTheRectanglesReach) {
  std::vector<Case> cases;
  for (const bool curve : {true, false}) {
    for (const int version : allVersions()) {
      cases.push_back({Kind::Live, version, version == 8 ? 12.0f : 9.0f, curve});
      cases.push_back({Kind::Redraw, version, version == 8 ? 20.0f : 9.0f, curve});
    }
    cases.push_back({Kind::Preview, 8, 9.0f, curve});
  }
  for (const float zoom : {0.5f, 1.0f, 2.0f})
    cases.push_back({Kind::Live, 8, 18.0f, true, zoom, false, true});
  cases.push_back({Kind::Live, 8, 20.0f, true, 1.0f, false, true});
  for (const Qelt::RenderingVersion& row : Qelt::kRenderingVersions) {
    if (row.outlineVersion == row.number) cases.push_back({Kind::Outline, row.number, 2.6f, false, 4.0f});
  }
  for (const float zoom : {1.0f, 4.0f}) cases.push_back({Kind::Prediction, 8, 4.0f, true, zoom});
  cases.push_back({Kind::Live, 1, 9.0f, true, 1.0f, true});
  cases.push_back({Kind::Live, 8, 10.0f, true, 1.0f, true});
  cases.push_back({Kind::Redraw, 8, 20.0f, true, 1.0f, true});
  cases.push_back({Kind::Preview, 8, 9.0f, true, 1.0f, true});
  for (const Case& c : cases) {
    SCOPED_TRACE(testing::PrintToString(c));
    const Effect effect = effectOf(c);
    EXPECT_GT(effect.overBorder, 40);
    EXPECT_EQ(effect.missing, 0);
    EXPECT_LE(effect.shifted, effect.inked / 50);
  }
}

// Kept: the rectangles are promised, so what is too wide for them is cut at the borders of tiles.
TEST(TileBorders, CutWhatHangsOutOfTheRectangles) {
  std::vector<Case> cases{
      {Kind::Prediction, 8, 6.571f, true, 4.0f},                                // upright
      {Kind::Prediction, 8, 11.499f, true, 4.0f},                               // the same pen laid down
      {Kind::Live, 8, 40.0f, true, 1.0f, false, true}, {Kind::Live, 8, 18.0f},  // its closing segment
      {Kind::Live, 8, 18.0f, true, 1.0f, true},        {Kind::Redraw, 8, 40.0f},
  };
  for (const Qelt::RenderingVersion& row : Qelt::kRenderingVersions) {
    if (row.outlineVersion == row.number) cases.push_back({Kind::Outline, row.number, 2.6f, true, 4.0f});
  }
  for (const Case& c : cases) {
    SCOPED_TRACE(testing::PrintToString(c));
    const Effect effect = effectOf(c);
    EXPECT_GT(effect.missing, 10);
    EXPECT_EQ(effect.unexplained, 0);
  }
}

}  // namespace
}  // namespace QeltTests
