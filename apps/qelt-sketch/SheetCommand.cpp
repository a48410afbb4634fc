#include <algorithm>
#include <cstddef>
#include <string>

#include "Commands.h"
#include "InkmlReader.h"
#include "LabelFont.h"
#include "OutputFile.h"
#include "PageDrawing.h"
#include "PageLayout.h"
#include "Picture.h"
#include "ProgramFiles.h"
#include "Progress.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"

namespace QeltDesktop {
namespace {

constexpr int kFirstVersion = 1, kLastVersion = 8;
constexpr int kColumns = 2;
// Pixels.
constexpr double kWidestCell = 800.0, kHighestCell = 600.0;
constexpr int kGap = 16;
constexpr int kLabelScale = 2;
constexpr int kLabelSpace = kGlyphHeight * kLabelScale + kGap;
constexpr std::uint32_t kPaper = 0xE8E8E8, kInk = 0x404040;

}  // namespace

void sheetCommand(const Options& asked) {
  Options options = asked;
  const Page page = readInkmlFile(inputPath(options));
  OutputFile file(options.output, inputPath(options));
  const PluginLibrary plugin(pluginPath(options));
  RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::Context);

  const PageArea area =
      pageArea(page, std::nullopt, pageMargin(largestPenSize(plugin, queue, page, options), 0));
  const double fit = std::min({1.0, kWidestCell / area.width, kHighestCell / area.height});
  const PageLayout layout = layOut(area, static_cast<float>(fit), 0.0f);

  constexpr int kVersions = kLastVersion - kFirstVersion + 1;
  Progress progress("drawing stroke", page.traces.size() * kVersions);
  std::optional<Picture> sheet;
  for (int i = 0; i < kVersions; ++i) {
    options.renderingVersion = kFirstVersion + i;
    const Picture cell = drawPage(plugin, queue, page, options, layout, {.stroke = true}, progress);
    const int stepX = cell.width + kGap;
    const int stepY = cell.height + kLabelSpace;
    if (!sheet) {
      constexpr int kRows = (kVersions + kColumns - 1) / kColumns;
      sheet = plainPicture(kColumns * stepX + kGap, kRows * stepY + kGap, kPaper);
    }
    const int x = kGap + i % kColumns * stepX;
    const int y = kGap + i / kColumns * stepY;
    writeLabel(*sheet, x, y, kLabelScale, kInk,
               "RENDERING VERSION " + std::to_string(options.renderingVersion));
    paste(*sheet, cell, x, y + kGlyphHeight * kLabelScale + kGap / 2);
  }
  file.write(encodePng(*sheet));
  file.commit();
}

}  // namespace QeltDesktop
