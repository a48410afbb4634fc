#include "commands/Commands.h"

#include <dlfcn.h>
#include <link.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <optional>
#include <span>
#include <string>
#include <system_error>

#include "commands/CommandLine.h"
#include "commands/Compare.h"
#include "commands/PageInput.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/platform/Platform.h"
#include "ink/InkmlWriter.h"
#include "output/LabelFont.h"
#include "output/OutputFile.h"
#include "output/Picture.h"
#include "output/Terminal.h"
#include "pen/RenderingVersions.h"
#include "pencommon/IPenMorphable.h"
#include "play/CallRecorder.h"
#include "play/PageDrawing.h"
#include "play/PageFit.h"
#include "play/PageLayout.h"
#include "play/PagePlayer.h"
#include "play/PenSession.h"
#include "play/SamplePanel.h"
#include "play/StrokeFeeder.h"
#include "text/NumberText.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

namespace fs = std::filesystem;

// A file that comes with the program. It is looked for beside the program, then where installing and building
// put it, seen from the program, so that all of it may be moved together. An installed program takes no file
// of a build tree that it may have been installed into.
std::string besideProgram(const char* fromInstalled, const char* fromBuilt) {
  std::error_code error;
  const fs::path folder = fs::read_symlink("/proc/self/exe", error).parent_path();
  const fs::path installed = (folder / fromInstalled).lexically_normal();
  for (const fs::path& path :
       {folder / installed.filename(), installed, (folder / fromBuilt).lexically_normal()}) {
    if (fs::exists(path, error)) return path.string();
  }
  throw Refusal(installed.string() + ": not there; it comes with the program");
}

// The plug-in that was asked for, else the one built with the program.
std::string pluginPath(const Options& options) {
  if (!options.plugin) return besideProgram(QELT_PLUGIN_FROM_INSTALLED, QELT_PLUGIN_FROM_PROGRAM);
  // The loader looks for a name without a folder among the system's libraries only; here it may also stand
  // in the current folder.
  std::error_code error;
  const fs::path asked = *options.plugin;
  return !asked.has_parent_path() && fs::exists(asked, error) ? (fs::path(".") / asked).string()
                                                              : asked.string();
}

// The page that was asked for, else the sample page.
std::string inputPath(const Options& options) {
  return options.input ? *options.input : besideProgram(QELT_SAMPLE_FROM_INSTALLED, QELT_SAMPLE_FROM_PROGRAM);
}

// The margin of a page that is drawn or traced with all its options.
float marginFor(const PluginLibrary& plugin, RenderQueue& queue, const Page& page, const Options& options) {
  return pageMargin(largestPenSize(plugin, queue, page, options), largestOutlineSize(page, options));
}

// Where the page and its margin lie in the picture. Ink that a pen cannot draw as small as it is grows to the
// size that was asked for.
PageLayout layOutPage(const PluginLibrary& plugin, RenderQueue& queue, Page& page, Options& options) {
  if (options.fit && isBelowStrokeUnits(page))
    enlargeToFit(page, options, marginFor(plugin, queue, page, options));
  const PageArea area = pageArea(page, options.page, marginFor(plugin, queue, page, options));
  const float zoom = options.fit ? zoomToFit(area, options.rotate, *options.fit) : options.zoom;
  return layOut(area, zoom, options.rotate);
}

std::size_t strokesToPlay(const Page& page, const Options& options) {
  return page.strokes.size() * static_cast<std::size_t>(options.repeat);
}

// The page, with the options that the picture was drawn with where it is one.
Page readPage(Options& options) {
  PageInput input = readPageInput(inputPath(options));
  if (input.drawnWith) {
    options = withInstruction(options, input.page.name, *input.drawnWith);
  } else {
    checkWithoutInstruction(options);
  }
  return std::move(input.page);
}

// The file that holds the page, which must not be written over.
std::string inputFile(const Page& page, const Options& options) {
  return options.input == kStandardInput ? "/dev/stdin" : page.name;
}

// What a picture of the page carries, so that it can be drawn again from nothing else.
PictureText inkOf(const Page& page, Options options) {
  // Strokes without a rendering version look the same when another one has become usual.
  const bool someHaveTheirOwn =
      std::any_of(page.strokes.begin(), page.strokes.end(),
                  [](const Stroke& stroke) { return stroke.brush.renderingVersion.has_value(); });
  if (!options.renderingVersion && !someHaveTheirOwn) options.renderingVersion = kUsualRenderingVersion;
  PictureText ink{.keyword = kInkKeyword, .text = writeInkml(page.strokes)};
  ink.text += std::string("<?") + kInstructionTarget + instructionFor(options) + "?>\n";
  if (ink.text.size() > kMostInkBytes) {
    throw Refusal(page.name + ": too large to go with its picture: " + std::to_string(ink.text.size()) +
                  " bytes as InkML, at most " + std::to_string(kMostInkBytes) + "; --no-ink leaves it out");
  }
  return ink;
}

void draw(const Options& asked) {
  Options options = asked;
  Page page = readPage(options);
  OutputFile file(options.output, inputFile(page, options));
  const PictureText ink = options.ink ? inkOf(page, options) : PictureText{};
  const PluginLibrary plugin(pluginPath(options));
  RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::Context);

  // The extent of the whole page: what --points leaves out keeps its place.
  const PageLayout layout = layOutPage(plugin, queue, page, options);
  if (options.points) cutLastStroke(page, *options.points);

  Progress progress("drawing stroke", strokesToPlay(page, options));
  const Picture picture =
      drawPage(plugin, queue, page, options, layout, drawablesFor(page, options), progress);
  file.write(encodePng(picture, ink));
  file.commit();
}

// It tells how the first stroke is drawn.
std::string traceHeader(const PenSet& pens, const Page& page, const Options& options) {
  const Brush brush = page.strokes.front().brush;
  const PenKind kind = penKindFor(brush, options);
  const PenStyle style = styleFor(brush, pens.of(kind).ownStyle(), options);
  std::string line = R"({"kind":"header","renderingVersion":)" + std::to_string(kind.renderingVersion);
  line += R"(,"size":)";
  appendJson(line, style.size);
  line += R"(,"color":")" + formatArgb(style.argb);
  line += R"(","curve":)";
  line += kind.curve ? "true" : "false";
  line += R"(,"mode":")";
  line += nameOf(options.mode);
  line += R"(","drawable":")";
  line += nameOf(options.drawable);
  line += "\"}\n";
  return line;
}

// The drawable whose calls are wanted, and the one it depends on: predictions go on from live strokes.
Canvases canvasesFor(DrawableKind wanted, PenCanvas& canvas) {
  Canvases canvases;
  if (wanted == DrawableKind::Stroke || wanted == DrawableKind::Prediction) canvases.stroke = &canvas;
  if (wanted == DrawableKind::Outline) canvases.outline = &canvas;
  if (wanted == DrawableKind::Preview) canvases.preview = &canvas;
  if (wanted == DrawableKind::Prediction) canvases.prediction = &canvas;
  return canvases;
}

void trace(const Options& asked) {
  Options options = asked;
  Page page = readPage(options);
  OutputFile file(options.output, inputFile(page, options));
  const PluginLibrary plugin(pluginPath(options));
  RenderQueue queue(RenderQueue::Mode::Caller, RenderQueue::GL::None);
  Progress progress("tracing stroke", strokesToPlay(page, options));
  CallRecorder recorder(queue, file, progress, options.drawable);

  PenCanvas canvas(&queue, nullptr);
  canvas.setMatrix(layOutPage(plugin, queue, page, options).matrix);
  if (options.points) cutLastStroke(page, *options.points);

  {
    const PenSet pens(plugin, queue, page, options);
    PagePlayer player(pens, page, options, canvasesFor(options.drawable, canvas));
    file.write(traceHeader(pens, page, options));
    player.play(recorder);
  }
  file.commit();
}

void preview(const Options& asked) {
  Options options = asked;
  options.mode = Mode::Event;
  OutputFile file(options.output);
  const PluginLibrary plugin(pluginPath(options));
  RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::Context);
  Progress progress("drawing stroke", 1);
  const PageLayout layout = layOut({0.0f, 0.0f, kPanelWidth, kPanelHeight}, 1.0f, 0.0f);
  const Picture picture =
      drawPage(plugin, queue, samplePanel(), options, layout, {.preview = true}, progress);
  file.write(encodePng(picture));
  file.commit();
}

// Only the cells that were asked for can make it too large.
void checkSheetSize(int width, int height) {
  if (width <= kLongestSide && height <= kLongestSide && std::int64_t{width} * height <= kMostPixels) return;
  throw Refusal("--fit: the sheet is too large to draw: " + std::to_string(width) + " x " +
                std::to_string(height) + " pixels, at most " + std::to_string(kLongestSide) + " a side and " +
                std::to_string(kMostPixels) + " in all");
}

// Every rendering version in a cell of its own, under a label, row by row.
void sheet(const Options& asked) {
  constexpr int kColumns = 2;
  constexpr int kRows = (static_cast<int>(Qelt::kRenderingVersions.size()) + kColumns - 1) / kColumns;
  // Pixels.
  constexpr int kGap = 16;
  constexpr int kLabelScale = 2;
  constexpr int kLabelHeight = kGlyphHeight * kLabelScale;
  constexpr std::uint32_t kPaper = 0xE8E8E8, kInk = 0x404040;

  Options options = asked;
  Page page = readPage(options);
  OutputFile file(options.output, inputFile(page, options));
  const PluginLibrary plugin(pluginPath(options));
  RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::Context);

  // Without outlines.
  const auto margin = [&] { return pageMargin(largestPenSize(plugin, queue, page, options), 0.0f); };
  if (options.fit && isBelowStrokeUnits(page)) enlargeToFit(page, options, margin());
  const PageArea area = pageArea(page, std::nullopt, margin());
  const float zoom =
      options.fit ? zoomToFit(area, 0.0f, *options.fit) : std::min(1.0f, zoomToFit(area, 0.0f, kUsualCell));
  const PageLayout layout = layOut(area, zoom, 0.0f);

  Progress progress("drawing stroke", page.strokes.size() * Qelt::kRenderingVersions.size());
  std::optional<Picture> sheet;
  int column = 0, row = 0;
  for (const Qelt::RenderingVersion& version : Qelt::kRenderingVersions) {
    options.renderingVersion = version.number;
    const Picture cell = drawPage(plugin, queue, page, options, layout, {.stroke = true}, progress);
    const int stepX = cell.width + kGap;
    const int stepY = cell.height + kLabelHeight + kGap;
    if (!sheet) {
      const int width = kColumns * stepX + kGap, height = kRows * stepY + kGap;
      checkSheetSize(width, height);
      sheet = plainPicture(width, height, kPaper);
    }
    const int x = kGap + column * stepX;
    const int y = kGap + row * stepY;
    writeLabel(*sheet, x, y, kLabelScale, kInk, "RENDERING VERSION " + std::to_string(version.number));
    paste(*sheet, cell, x, y + kLabelHeight + kGap / 2);
    if (++column == kColumns) column = 0, ++row;
  }
  file.write(encodePng(*sheet));
  file.commit();
}

// A row of the plug-in's version table.
struct TableRow {
  std::int32_t strokeVersion, outlineVersion;
};

// The table as the loaded plug-in exports it, which may be of another age than this program. The index is
// the rendering version.
std::span<const TableRow> versionTable(const PluginLibrary& plugin) {
  const void* const table = plugin.symbol("versionTable");
  Dl_info where{};
  const ElfW(Sym)* symbol = nullptr;
  if (table == nullptr ||
      dladdr1(table, &where, reinterpret_cast<void**>(const_cast<ElfW(Sym)**>(&symbol)), RTLD_DL_SYMENT) ==
          0 ||
      symbol == nullptr) {
    throw Refusal(plugin.path() + ": the plug-in has no versionTable");
  }
  return {static_cast<const TableRow*>(table), symbol->st_size / sizeof(TableRow)};
}

// Where the plug-in's table and this program's list of versions disagree, one line for each version.
std::string disagreements(std::span<const TableRow> table) {
  std::string lines;
  const auto tell = [&](std::size_t number, const char* what) {
    lines += "rendering version " + std::to_string(number) + what + '\n';
  };
  const std::size_t known = Qelt::kRenderingVersions.size();
  for (const Qelt::RenderingVersion& version : Qelt::kRenderingVersions) {
    const auto number = static_cast<std::size_t>(version.number);
    if (number >= table.size()) {
      tell(number, " is known to this program, not to the plug-in");
    } else if (table[number].strokeVersion != version.strokeVersion ||
               table[number].outlineVersion != version.outlineVersion) {
      tell(number, (" has stroke version " + std::to_string(version.strokeVersion) + " and outline version " +
                    std::to_string(version.outlineVersion) + " in this program's list")
                       .c_str());
    }
  }
  for (std::size_t number = known + 1; number < table.size(); ++number) {
    tell(number, " is known to the plug-in, not to this program");
  }
  return lines;
}

void info(const Options& options) {
  const PluginLibrary plugin(pluginPath(options));
  std::printf("plug-in      %s\n", printable(plugin.path()).c_str());
  const std::span<const TableRow> table = versionTable(plugin);

  RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::Context);
  std::printf("GL renderer  %s\n", queue.rendererName().c_str());

  PenSession session(plugin, queue, {kUsualRenderingVersion, kUsualCurve});
  const PenStyle& style = session.ownStyle();
  std::printf("pen size     %g to %g, a new pen has %g\n", static_cast<double>(session.pen().GetMinSize()),
              static_cast<double>(session.pen().GetMaxSize()), static_cast<double>(style.size));
  std::printf("pen colour   #%08X\n", static_cast<unsigned int>(style.argb));
  std::printf("\nrendering version  stroke version  outline version\n");
  for (std::size_t version = 0; version < table.size(); ++version) {
    std::printf("%17zu  %14d  %15d\n", version, table[version].strokeVersion, table[version].outlineVersion);
  }
  if (const std::string lines = disagreements(table); !lines.empty()) {
    std::printf("\nThe plug-in is of another age than this program:\n%s", lines.c_str());
  }
  finishStandardOutput();
}

}  // namespace

int runCommand(const Options& options) {
  // Without --log, standard error holds only the line that says what could not be done.
  if (!options.log) silenceLog();
  switch (options.command) {
    case Command::Draw:
      draw(options);
      break;
    case Command::Trace:
      trace(options);
      break;
    case Command::Preview:
      preview(options);
      break;
    case Command::Sheet:
      sheet(options);
      break;
    case Command::Info:
      info(options);
      break;
    case Command::Compare:
      return compare(options.compare);
  }
  return 0;
}

}  // namespace QeltDesktop
