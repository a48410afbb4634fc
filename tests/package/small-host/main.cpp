// The smallest host: it loads the pen, draws one stroke with it, and reads the pixels back.
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <exception>
#include <memory>
#include <vector>

#include "base/RectF.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/CanvasLayer.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/pencommon/PenDataManager.h"
#include "engine/MotionEvent.h"
#include "math/Matrix3.h"
#include "pencommon/Pen.h"
#include "pencommon/PenStrokeDrawableGL.h"

namespace {

constexpr int kWidth = 400, kHeight = 200;  // pixels
constexpr float kZoom = 2.0f;               // pixels per stroke unit

Qelt::MotionEvent eventOf(int action, float x, float y) {
  const Qelt::PointerProperties stylus{0, Qelt::kToolStylus};
  const Qelt::PointerCoords coords{x, y, 0.6f, 0.3f, 0.0f};
  return {0, 0, action, 1, &stylus, &coords, 0, Qelt::kSourceStylus, 0};
}

// From (20, 50) to (180, 50), in stroke units.
void drawLine(Qelt::PenStrokeDrawableGL& stroke) {
  const auto draw = [&](int action, float x) {
    const Qelt::MotionEvent event = eventOf(action, x, 50.0f);
    Qelt::RectF changed;  // in stroke units: what a host with a screen would show anew
    stroke.Draw(&event, &changed);
  };
  draw(Qelt::kActionDown, 20.0f);
  for (float x = 25.0f; x <= 180.0f; x += 5.0f) draw(Qelt::kActionMove, x);
  draw(Qelt::kActionUp, 180.0f);
}

int run() {
  using namespace QeltDesktop;
  const PluginLibrary library(PEN_LIBRARY);
  // What outlives the pen: the render thread with its GL context, and what is drawn into.
  RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::Context);
  CanvasLayer layer(queue, kWidth, kHeight);
  PenCanvas canvas(&queue, &layer);
  PenDataManager manager(&queue);

  const float view[9] = {kZoom, 0.0f, 0.0f, 0.0f, kZoom, 0.0f, 0.0f, 0.0f, 1.0f};
  canvas.setMatrix(Qelt::Matrix3<float>(view));

  const std::unique_ptr<Qelt::Pen> pen(library.createPen());
  if (pen == nullptr) {
    std::fputs("the pen could not be made\n", stderr);
    return 1;
  }
  pen->setPenDataManager(&manager);
  pen->SetScreenResolution(kWidth, kHeight);
  pen->setVersion(8);
  pen->SetSize(6.0f);
  pen->SetColor(static_cast<int>(0xFF202020));
  Qelt::PenStrokeDrawableGL* const stroke = pen->GetStrokeDrawableGL();  // the pen's
  if (stroke == nullptr) {
    std::fputs("the pen draws no strokes\n", stderr);
    return 1;
  }
  stroke->SetCanvas(&canvas);
  drawLine(*stroke);

  // Pixels are read after everything posted so far; each has its alpha last.
  const std::vector<std::uint8_t> pixels = layer.readPixels();
  const auto alphaAt = [&](int x, int y) {
    return static_cast<int>(pixels[static_cast<std::size_t>(y * kWidth + x) * 4 + 3]);
  };
  // The grain leaves single pixels of a line bare: the darkest of the few around its middle.
  int onLine = 0;
  for (int y = 96; y < 104; ++y) {
    for (int x = 196; x < 204; ++x) onLine = alphaAt(x, y) > onLine ? alphaAt(x, y) : onLine;
  }
  const int besideLine = alphaAt(200, 20);
  std::printf("%s\nalpha %d on the line, %d beside it\n", queue.rendererName().c_str(), onLine, besideLine);
  return onLine > 60 && besideLine == 0 ? 0 : 1;
}

}  // namespace

int main() {
  try {
    return run();
  } catch (const std::exception& error) {
    std::fprintf(stderr, "%s\n", error.what());
    return 1;
  }
}
