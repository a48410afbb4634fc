#include <cstddef>
#include <string>

#include "CallRecorder.h"
#include "Commands.h"
#include "InkmlReader.h"
#include "NumberText.h"
#include "OutputFile.h"
#include "PageDrawing.h"
#include "PageLayout.h"
#include "PagePlayer.h"
#include "PenSession.h"
#include "ProgramFiles.h"
#include "Progress.h"
#include "StrokeFeeder.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/PenCanvas.h"
#include "pencommon/IPenMorphable.h"

namespace QeltDesktop {
namespace {

std::string headerLine(PenSession& session, const Page& page, const Options& options) {
  const PenStyle style = styleFor(page.traces.front().brush, session.ownStyle(), options);
  const bool curve = session.pen().GetMorphable()->IsCurveEnabled();
  std::string line = R"({"kind":"header","renderingVersion":)" + std::to_string(options.renderingVersion);
  line += R"(,"size":)";
  appendJson(line, style.size);
  line += R"(,"color":")" + formatArgb(style.argb);
  line += R"(","curve":)";
  line += curve ? "true" : "false";
  line += R"(,"mode":")";
  line += nameOf(options.mode);
  line += R"(","drawable":")";
  line += nameOf(options.drawable);
  line += "\"}\n";
  return line;
}

// The drawable whose calls are wanted, and what it depends on: predictions go on from live strokes.
Canvases canvasesFor(DrawableKind wanted, PenCanvas& canvas) {
  Canvases canvases;
  if (wanted == DrawableKind::Stroke || wanted == DrawableKind::Prediction) canvases.stroke = &canvas;
  if (wanted == DrawableKind::Outline) canvases.outline = &canvas;
  if (wanted == DrawableKind::Preview) canvases.preview = &canvas;
  if (wanted == DrawableKind::Prediction) canvases.prediction = &canvas;
  return canvases;
}

// Counts strokes on the terminal while the recorder listens.
class CountingRecorder final : public CallRecorder {
 public:
  CountingRecorder(RenderQueue& queue, OutputFile& file, const Options& options, std::size_t strokes)
      : CallRecorder(queue, file, options.drawable, options.renderingVersion),
        mProgress("tracing stroke", strokes) {}

  void strokeEnds() override { mProgress.step(); }

 private:
  Progress mProgress;
};

}  // namespace

void traceCommand(const Options& options) {
  Page page = readInkmlFile(inputPath(options));
  OutputFile file(options.output, inputPath(options));
  const PluginLibrary plugin(pluginPath(options));
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::None);
  CountingRecorder recorder(queue, file, options,
                            page.traces.size() * static_cast<std::size_t>(options.repeat));

  PenCanvas canvas(&queue, nullptr);
  const float margin = pageMargin(largestPenSize(plugin, queue, page, options),
                                  options.outline ? options.outline->size : 0.0f);
  canvas.setMatrix(layOut(pageArea(page, options.page, margin), options.zoom, options.rotate).matrix);
  if (options.points) cutLastTrace(page, *options.points);

  {
    PenSession session(plugin, queue, options);
    PagePlayer player(session, page, options, canvasesFor(options.drawable, canvas));
    file.write(headerLine(session, page, options));
    player.play(recorder);
  }
  file.commit();
}

}  // namespace QeltDesktop
