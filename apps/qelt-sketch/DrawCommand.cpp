#include "Commands.h"
#include "InkmlReader.h"
#include "OutputFile.h"
#include "PageDrawing.h"
#include "PageLayout.h"
#include "Picture.h"
#include "ProgramFiles.h"
#include "Progress.h"
#include "StrokeFeeder.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"

namespace QeltDesktop {

void drawCommand(const Options& options) {
  Page page = readInkmlFile(inputPath(options));
  OutputFile file(options.output, inputPath(options));
  const PluginLibrary plugin(pluginPath(options));
  RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::Context);

  const float margin = pageMargin(largestPenSize(plugin, queue, page, options),
                                  options.outline ? options.outline->size : 0.0f);
  // Whatever --points leaves out keeps its place on the page.
  const PageArea area = pageArea(page, options.page, margin);
  if (options.points) cutLastTrace(page, *options.points);

  Progress progress("drawing stroke", page.traces.size() * static_cast<std::size_t>(options.repeat));
  const Picture picture = drawPage(plugin, queue, page, options, layOut(area, options.zoom, options.rotate),
                                   drawablesFor(options), progress);
  file.write(encodePng(picture));
  file.commit();
}

}  // namespace QeltDesktop
