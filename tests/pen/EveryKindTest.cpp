// What holds for whatever a pen draws: strokes, redraws, outlines, previews and predictions.

#include <GLES3/gl3.h>
#include <gmock/gmock.h>

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <set>
#include <string>
#include <vector>

#include "desktop/gl/CallTask.h"
#include "desktop/gl/GlDevice.h"
#include "support/AllocationGate.h"
#include "support/LogCapture.h"
#include "support/PenBoard.h"

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

INSTANTIATE_TEST_SUITE_P(Drawings, EveryKind, testing::ValuesIn(drawings(versionsOfRenderDrawables())),
                         drawingName);

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

// Kept: only preview and prediction note how they are set up; all note their end.
TEST(RenderDrawables, NoteTheirSetupAndTheirEnd) {
  LogCapture log;
  for (const int version : versionsOfRenderDrawables()) {
    {
      PenBoard board({.version = version, .width = 16, .height = 16});
      board.prepareAll();
    }
    std::multiset<std::string> noted, expected;
    for (const LogLine& line : log.take()) {
      if (line.text.rfind("virtual void", 0) == 0) noted.insert(line.text.substr(0, line.text.find('(')));
    }
    const auto expect = [&](const std::string& name, const std::vector<std::string>& operations) {
      for (const std::string& operation : operations)
        expected.insert("virtual void Qelt::Pencil2" + name + "::" + operation);
    };
    expect("StrokeDrawableRTV" + std::to_string(expectedOf(version).renderDrawable), {"Release"});
    expect("OutlineDrawableRTV1", {"Release"});
    expect("PreviewDrawableRT", {"CreatePenCanvas", "Init", "Release"});
    if (rowOf(version).predicts) expect("PredictionDrawableRT", {"CreatePenCanvas", "Init", "Release"});
    EXPECT_EQ(noted, expected) << version;
  }
}

// --- A pen's life ---

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

// Zooms, versions, new pens and lost contexts, for thousands of strokes: as many names and blocks as at the
// start.
TEST(LongSession, KeepsNeitherGlNamesNorMemory) {
  LogCapture log;
  AllocationGate::watch(PenBoard::library().path());
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
  const AllocationGate::Counts earlyBlocks = AllocationGate::counts();
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
  EXPECT_EQ(AllocationGate::counts().plugInBlocks, earlyBlocks.plugInBlocks);
  EXPECT_EQ(AllocationGate::counts().hostBlocks, earlyBlocks.hostBlocks);
}

}  // namespace
}  // namespace QeltTests
