#include <gtest/gtest.h>

#include <cstddef>
#include <cstdint>
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

using Picture = std::vector<std::uint8_t>;

// Draws a case on all its ways beside the border. Both kinds of tiles meet at the same borders and round
// alike, so that pictures can be compared byte by byte.
std::vector<Picture> drawn(const Case& c, Target target) {
  PenBoard board({.version = c.version,
                  .size = c.width,
                  .curve = c.curve,
                  .width = kSide,
                  .height = kSide,
                  .tile = kTile});
  board.canvas.setTarget(target);
  board.zoom(c.zoom);
  std::vector<Picture> pictures;
  for (const float distance : distancesOf(c)) {
    for (const bool turned : {false, true}) {
      board.layer->clear();
      int calls = 0;
      board.draw(c.kind, besideTheBorder(c, distance, turned), [&](const PenBoard::Call& call) {
        ++calls;
        if (c.staysDown && calls > 3) return;
        // Of a prediction only what it adds is looked at.
        if (c.kind == Kind::Prediction && calls == 4) board.layer->clear();
        call(&board.rect);
      });
      pictures.push_back(board.pixels());
    }
  }
  return pictures;
}

// What the borders of tiles do to a stroke, in pixels.
struct Effect {
  int overBorder = 0;  // inked and outside the tile that the stroke runs in
  int missing = 0;     // other than on boundless tiles
};

Effect effectOf(const Case& c) {
  const std::vector<Picture> tiled = drawn(c, Target::Whole), whole = drawn(c, Target::BoundlessTiles);
  Effect effect;
  for (std::size_t i = 0; i < whole.size(); ++i) {
    const int home = i % 2 == 0 ? 0 : 3;
    for (int pixel = 0; pixel < kSide * kSide; ++pixel) {
      const int tile = pixel / kSide / kTile * 2 + pixel % kSide / kTile;
      const std::size_t alpha = static_cast<std::size_t>(pixel) * 4 + 3;
      effect.overBorder += whole[i][alpha] != 0 && tile != home ? 1 : 0;
      effect.missing += tiled[i][alpha] != whole[i][alpha] ? 1 : 0;
    }
  }
  return effect;
}

TEST(TileBorders, CutNothingThatTheRectanglesReach) {
  std::vector<Case> cases = {{Kind::Live, 8, 20.0f, true, 1.0f, false, true},
                             {Kind::Live, 8, 18.0f, true, 0.5f, false, true},
                             {Kind::Live, 8, 18.0f, true, 2.0f, false, true},
                             {Kind::Live, 8, 10.0f, true, 1.0f, true},
                             {Kind::Redraw, 8, 20.0f, true, 1.0f, true},
                             {Kind::Preview, 8, 9.0f, true, 1.0f, true},
                             {Kind::Prediction, 8, 4.0f},
                             {Kind::Prediction, 8, 4.0f, true, 4.0f}};
  for (const bool curve : {true, false}) {
    for (const int version : allVersions()) {
      cases.push_back({Kind::Live, version, expectedOf(version).widestLive, curve});
      cases.push_back({Kind::Redraw, version, expectedOf(version).widestRedraw, curve});
    }
    cases.push_back({Kind::Preview, 8, 9.0f, curve});
  }
  for (const int version : outlineVersions()) cases.push_back({Kind::Outline, version, 2.6f, false, 4.0f});
  for (const Case& c : cases) {
    const Effect effect = effectOf(c);
    EXPECT_GT(effect.overBorder, 40) << "case " << &c - cases.data();
    EXPECT_EQ(effect.missing, 0) << "case " << &c - cases.data();
  }
}

// Kept: the rectangles are promised, so what is too wide for them is cut at the borders of tiles.
TEST(TileBorders, CutWhatHangsOutOfTheRectangles) {
  std::vector<Case> cases = {
      {Kind::Prediction, 8, 6.571f, true, 4.0f},                                // upright
      {Kind::Prediction, 8, 11.499f, true, 4.0f},                               // the same pen laid down
      {Kind::Live, 8, 40.0f, true, 1.0f, false, true}, {Kind::Live, 8, 18.0f},  // its closing segment
      {Kind::Live, 8, 18.0f, true, 1.0f, true},        {Kind::Redraw, 8, 40.0f}};
  for (const int version : outlineVersions()) cases.push_back({Kind::Outline, version, 2.6f, true, 4.0f});
  for (const Case& c : cases) EXPECT_GT(effectOf(c).missing, 10) << "case " << &c - cases.data();
}

}  // namespace
}  // namespace QeltTests
