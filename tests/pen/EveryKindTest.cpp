// What holds for whatever a pen draws: strokes, redraws, outlines, previews and predictions.

#include <GLES3/gl3.h>
#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "desktop/gl/CallTask.h"
#include "desktop/gl/GlDevice.h"
#include "support/LogCapture.h"
#include "support/PenBoard.h"
#include "support/Stamps.h"

namespace QeltTests {
namespace {

using Pixels = std::vector<std::uint8_t>;

constexpr int kWidth = 112, kHeight = 64;

// A wave under growing pressure, the pen leaning more and more.
std::vector<Sample> wave() {
  std::vector<Sample> samples;
  for (int i = 0; i <= 12; ++i) {
    const auto t = static_cast<float>(i);
    samples.push_back({16.13f + 6.4f * t, 32.39f + 14.0f * std::sin(0.7f * t), 0.3f + 0.05f * t, 0.07f * t,
                       2.5f + 0.2f * t});
  }
  return samples;
}

class EveryKind : public testing::TestWithParam<Drawing> {
 protected:
  const Kind kind = GetParam().kind;
  // The largest size that a pen offers.
  BoardOptions page() const {
    return {.version = GetParam().version, .size = 6.571f, .width = kWidth, .height = kHeight, .tile = 48};
  }
};

// The versions that bring something of their own to the render thread, or the only one that there is.
INSTANTIATE_TEST_SUITE_P(
    Drawings, EveryKind,
    testing::Values(Drawing{Kind::Live, 1}, Drawing{Kind::Live, 7}, Drawing{Kind::Live, 8},
                    Drawing{Kind::Redraw, 1}, Drawing{Kind::Redraw, 8}, Drawing{Kind::Outline, 1},
                    Drawing{Kind::Outline, 8}, Drawing{Kind::Preview, 8}, Drawing{Kind::Prediction, 8}),
    [](const auto& test) {
      return testing::PrintToString(test.param.kind) + "Version" + std::to_string(test.param.version);
    });

// --- GL state ---

// What another user of the context might leave, and the pen may as well. A tile has neither depth nor
// stencil.
void leaveState() {
  glEnable(GL_DEPTH_TEST);
  glDepthFunc(GL_NEVER);
  glDepthMask(GL_FALSE);
  glEnable(GL_CULL_FACE);
  glCullFace(GL_FRONT_AND_BACK);
  glEnable(GL_STENCIL_TEST);
  glStencilFunc(GL_NEVER, 1, 0xFF);
  glColorMask(GL_FALSE, GL_TRUE, GL_FALSE, GL_FALSE);
  glDisable(GL_BLEND);
  glBlendFunc(GL_ONE, GL_ONE);
  glEnable(GL_SCISSOR_TEST);
  glScissor(3, 3, 1, 1);
  glViewport(5, 5, 2, 2);
  glClearColor(1.0f, 0.5f, 0.25f, 1.0f);
  for (const GLenum unit : {GL_TEXTURE0, GL_TEXTURE1, GL_TEXTURE7}) {
    GLuint texture = 0;
    glGenTextures(1, &texture);
    glActiveTexture(unit);
    glBindTexture(GL_TEXTURE_2D, texture);
  }
}

// What the host puts back to GL's own defaults.
void leaveArraysAndUnpacking() {
  GLuint array = 0, store = 0;
  glGenVertexArrays(1, &array);
  glBindVertexArray(array);
  glGenBuffers(1, &store);
  glBindBuffer(GL_ARRAY_BUFFER, store);
  glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, store);
  glPixelStorei(GL_UNPACK_ALIGNMENT, 8);
  glPixelStorei(GL_UNPACK_ROW_LENGTH, 3);
  glPixelStorei(GL_UNPACK_SKIP_ROWS, 2);
  glPixelStorei(GL_UNPACK_SKIP_PIXELS, 1);
}

TEST_P(EveryKind, IsDrawnAlikeWhateverGlStateWasLeftBeforeEachTask) {
  const auto drawn = [this](void (*spread)()) {
    PenBoard board(page());
    bool spreads = false;
    board.queue.accept = [&](const Qelt::ITask&) {
      if (spread == nullptr || spreads) return true;
      spreads = true;  // its own post comes here too
      QeltDesktop::postCall(board.queue, [spread] {
        spread();
        QeltDesktop::GlDevice::live()->state().forget();
      });
      spreads = false;
      return true;
    };
    board.draw(kind, wave());
    return board.pixels();
  };
  const Pixels clean = drawn(nullptr);
  ASSERT_NE(clean, Pixels(clean.size())) << "nothing was drawn";
  EXPECT_TRUE(drawn(leaveState) == clean);
  EXPECT_TRUE(drawn(leaveArraysAndUnpacking) == clean);
}

using State = std::map<std::string, std::vector<GLint>>;

State glState() {
  State state;
  const auto look = [&state](const std::string& name, GLenum what) {
    std::vector<GLint> values(4);
    glGetIntegerv(what, values.data());
    std::vector<GLint>& all = state[name];
    all.insert(all.end(), values.begin(), values.end());
  };
  for (const auto& [name, what] : std::initializer_list<std::pair<const char*, GLenum>>{
           {"depth test", GL_DEPTH_TEST},
           {"culling", GL_CULL_FACE},
           {"stencil", GL_STENCIL_TEST},
           {"colour mask", GL_COLOR_WRITEMASK},
           {"blending", GL_BLEND},
           {"blend factors", GL_BLEND_SRC_RGB},
           {"blend factors", GL_BLEND_DST_RGB},
           {"blend equation", GL_BLEND_EQUATION_RGB},
           {"scissor test", GL_SCISSOR_TEST},
           {"viewport and scissor", GL_SCISSOR_BOX},
           {"viewport and scissor", GL_VIEWPORT},
           {"clear colour", GL_COLOR_CLEAR_VALUE},
           {"discarding", GL_RASTERIZER_DISCARD},
           {"program", GL_CURRENT_PROGRAM},
           {"vertex array and buffer", GL_VERTEX_ARRAY_BINDING},
           {"vertex array and buffer", GL_ARRAY_BUFFER_BINDING},
           {"framebuffer", GL_FRAMEBUFFER_BINDING},
           {"unpack state", GL_UNPACK_ROW_LENGTH},
           {"unpack state", GL_UNPACK_SKIP_ROWS},
           {"unpack state", GL_UNPACK_SKIP_PIXELS},
           {"unpack state", GL_PIXEL_UNPACK_BUFFER_BINDING},
           {"active unit", GL_ACTIVE_TEXTURE}}) {
    look(name, what);
  }
  for (const int unit : {0, 1, 2, 7}) {
    glActiveTexture(GL_TEXTURE0 + static_cast<GLenum>(unit));
    look("texture " + std::to_string(unit), GL_TEXTURE_BINDING_2D);
    look("texture " + std::to_string(unit), GL_SAMPLER_BINDING);
  }
  glActiveTexture(static_cast<GLenum>(state["active unit"][0]));
  return state;
}

// What is left changed is listed here: what the pen draws with, and what the host sets for a tile. The unit
// that happened to be active is where textures are filled.
TEST_P(EveryKind, LeavesNothingChangedButWhatItDrewWith) {
  PenBoard board(page());
  State before, after;
  board.queue.run([&] {
    leaveState();
    before = glState();
  });
  board.draw(kind, wave());
  board.queue.finish();
  board.queue.run([&] { after = glState(); });
  std::set<std::string> changed;
  for (const auto& [name, values] : before) {
    if (after[name] != values) changed.insert(name);
  }
  std::set<std::string> expected = {
      "active unit", "blend factors", "blending",  "clear colour", "colour mask",         "culling",
      "program",     "texture 0",     "texture 7", "scissor test", "viewport and scissor"};
  expected.insert(kind == Kind::Outline ? "depth test" : "texture 1");
  EXPECT_EQ(changed, expected);
}

// --- The view ---

// Each call under a view of its own, however far behind the render thread is.
TEST_P(EveryKind, KeepsTheViewItWasPostedUnder) {
  const auto drawn = [this](bool keepsUp) {
    PenBoard board(page());
    float zoom = 0.7f;
    board.draw(kind, wave(), [&](const PenBoard::Call& call) {
      board.canvas.setMatrix(viewOf(zoom, 9.0f, 5.0f));
      zoom += 0.15f;
      call(&board.rect);
      if (keepsUp) board.queue.finish();
    });
    board.canvas.setMatrix(viewOf(2.0f, -60.0f, -20.0f));
    return board.pixels();
  };
  EXPECT_TRUE(drawn(true) == drawn(false));
}

// --- Areas ---

// Each call is handed an area far away, as one that a host kept from before. Kept: two kinds reach further
// than they say. An outline's centres are cut to whole units after their area was taken; a prediction's area
// takes in half of each stamp and one unit.
TEST_P(EveryKind, ChangesNoPixelOutsideTheAreaItAnswers) {
  const float unsaid = kind == Kind::Outline ? 1.0f : kind == Kind::Prediction ? 2.0f : 0.0f;
  for (const bool curve : {true, false}) {
    BoardOptions options = page();
    options.curve = curve;
    PenBoard board(options);
    Pixels before = board.pixels();
    int calls = 0;
    board.draw(kind, wave(), [&](const PenBoard::Call& call) {
      SCOPED_TRACE((curve ? "curve, call " : "straight, call ") + std::to_string(++calls));
      Qelt::RectF area{-9000.0f, -9000.0f, -8990.0f, -8990.0f};
      call(&area);
      const Pixels after = board.pixels();
      int changed = 0, outside = 0;
      for (std::size_t i = 0; i < after.size(); i += 4) {
        if (std::equal(&before[i], &before[i] + 4, &after[i])) continue;
        const float x = static_cast<float>(i / 4 % kWidth) + 0.5f,
                    y = static_cast<float>(i / 4 / kWidth) + 0.5f;
        ++changed;
        outside += x < area.left - unsaid || x > area.right + unsaid || y < area.top - unsaid ||
                           y > area.bottom + unsaid
                       ? 1
                       : 0;
      }
      EXPECT_EQ(outside, 0) << "of " << changed;
      EXPECT_TRUE(changed == 0 || area.left > -100.0f) << "the old area was taken in";
      before = after;
    });
    EXPECT_GT(calls, 1);
  }
}

// --- Time ---

TEST_P(EveryKind, DoesNotLookAtTheClock) {
  const auto drawn = [this](Clock clock) {
    BoardOptions options = page();
    options.width = options.height = 0;
    options.clock = clock;
    PenBoard board(options);
    board.draw(kind, wave());
    return board.takeBuffers();
  };
  const auto usual = drawn(everyFourMilliseconds);
  ASSERT_GT(usual.size(), 1u);
  using Limits = std::numeric_limits<std::int64_t>;
  EXPECT_TRUE(drawn([](int) { return std::int64_t{7}; }) == usual) << "equal";
  EXPECT_TRUE(drawn([](int number) { return std::int64_t{-9} * number; }) == usual) << "backward";
  EXPECT_TRUE(drawn([](int number) { return number % 2 == 0 ? Limits::min() : Limits::max(); }) == usual)
      << "extreme";
}

// --- Logs ---

TEST(CutSegments, AreSaidOnceAStroke) {
  struct Case {
    Drawing drawing;
    std::vector<std::string> said;
  };
  const Case cases[] = {
      {{Kind::Live, 7}, {"Pencil2StrokeDrawableGLV7"}},
      // What is cached is not walked.
      {{Kind::Redraw, 1}, std::vector<std::string>(4, "Pencil2StrokeDrawableGLV1")},
      {{Kind::Outline, 8}, std::vector<std::string>(2, "Pencil2OutlineDrawableGLV4")},
      {{Kind::Preview, 8}, std::vector<std::string>(2, "Pencil2PreviewDrawableGL")},
      {{Kind::Prediction, 8}, {"Pencil2StrokeDrawableGLV8", "Pencil2PredictionDrawableGL"}}};
  LogCapture log;
  for (const auto& [drawing, said] : cases) {
    // Two such segments in each, or more. Predictions go on from curves only.
    PenBoard board({.version = drawing.version, .curve = drawing.kind == Kind::Prediction});
    for (int stroke = 0; stroke < 2; ++stroke) {
      log.take();
      board.draw(drawing.kind, {{0.0f, 0.0f}, {1e30f, 1e30f}, {0.0f, 0.0f}, {1e30f, 1e30f}},
                 [&](const PenBoard::Call& call) {
                   call(&board.rect);
                   board.takeBatches();
                 });
      std::vector<std::string> names;
      for (const LogLine& line : log.take()) {
        if (line.text.find("cut short") == std::string::npos) continue;
        EXPECT_THAT(line.text, testing::MatchesRegex("\\w+: a segment of length [0-9.]+ was cut short"));
        names.push_back(line.text.substr(0, line.text.find(':')));
      }
      EXPECT_EQ(names, said) << drawing.kind << ", stroke " << stroke;
    }
  }
}

// --- A pen's life ---

// A new version is a new drawable, which has not seen the pen go down: what is left of the stroke is
// ignored, and what was handed over before keeps the layout it has.
TEST(VersionChange, EndsTheStrokeUnderWay) {
  const std::vector<Sample> samples = wave();
  using Buffers = std::vector<std::vector<float>>;
  std::map<int, Buffers> whole;
  for (const int version : allVersions()) {
    PenBoard board({.version = version});
    board.stroke(samples);
    whole[version] = board.takeBuffers();
    for (const std::vector<float>& floats : whole[version]) stampsOf(floats, strideOf(version));
  }
  for (const int from : allVersions()) {
    for (const int to : allVersions()) {
      if (to == from) continue;
      SCOPED_TRACE("from " + std::to_string(from) + " to " + std::to_string(to));
      PenBoard board({.version = from});
      board.down(samples[0]);
      board.move({samples[1], samples[2], samples[3], samples[4]});
      board.pen->setVersion(to);
      EXPECT_FALSE(board.move({samples[5], samples[6]}));
      EXPECT_FALSE(board.up(samples[7]));
      EXPECT_EQ(board.rect.right, 0.0f);
      EXPECT_TRUE(board.takeBuffers() == (Buffers{whole[from][0], whole[from][1], {}, {}}));
      board.stroke(samples);
      EXPECT_TRUE(board.takeBuffers() == whole[to]);
    }
  }
}

// GL names that are alive, of whatever sort.
int liveNames() {
  int live = 0;
  for (GLuint name = 1; name <= 4096; ++name) {
    for (const auto is : {glIsTexture, glIsBuffer, glIsFramebuffer, glIsRenderbuffer, glIsVertexArray,
                          glIsProgram, glIsShader, glIsSampler}) {
      live += is(name) != GL_FALSE ? 1 : 0;
    }
  }
  return live;
}

// Zooms, versions, new pens and lost contexts, for thousands of strokes: as many names as at the start.
TEST(LongSession, KeepsNoGlNames) {
  const LogCapture log;
  PenBoard board({.size = 2.0f, .width = 96, .height = 64});
  const auto drawAll = [&](int version) {
    board.pen->setVersion(version);
    board.drawAll();
    board.takeBatches();
    board.turnPage();
  };
  const auto countNames = [&] {
    drawAll(newestVersion());
    int names = 0;
    board.queue.run([&] { names = liveNames(); });
    return names;
  };
  const int early = countNames();
  EXPECT_GT(early, 5);
  constexpr int kRounds = QELT_SANITIZED ? 40 : 240;  // ten strokes each
  for (int round = 1; round <= kRounds; ++round) {
    board.zoom(0.5f + 0.25f * static_cast<float>(round % 5));
    drawAll(1 + round % newestVersion());
    if (round % 10 == 0) {
      board.deletePen();
      board.makePen();
    }
    if (round % 20 == 5) board.loseAndRestoreContext();  // with all drawables there
  }
  EXPECT_EQ(countNames(), early);
}

}  // namespace
}  // namespace QeltTests
