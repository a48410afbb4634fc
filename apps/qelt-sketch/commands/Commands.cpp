#include "commands/Commands.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <functional>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <system_error>
#include <thread>
#include <utility>
#include <vector>

#include "commands/Archive.h"
#include "commands/CommandLine.h"
#include "commands/Compare.h"
#include "commands/Info.h"
#include "commands/PageInput.h"
#include "commands/ProgramFiles.h"
#include "commands/Workers.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "desktop/graphics/PenCanvas.h"
#include "desktop/platform/Platform.h"
#include "ink/InkmlWriter.h"
#include "output/LabelFont.h"
#include "output/OutputFile.h"
#include "output/Picture.h"
#include "output/PngWriter.h"
#include "output/StageTimes.h"
#include "output/Terminal.h"
#include "output/UnfinishedFile.h"
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

std::function<void(std::string_view)> writerTo(OutputFile& file) {
  return [&file](std::string_view bytes) { file.write(bytes); };
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

// A page to be drawn to a file, made before there is a GL context, so that what cannot be read or written is
// refused at once.
struct DrawnFile {
  using Abandoned = OutputFile::Abandoned;

  DrawnFile(const Options& asked, StageTimes& times, Abandoned abandoned = Abandoned::Remove)
      : DrawnFile(asked, abandoned, StageTimes::Watch(times, Stage::Read)) {}

  Options options;
  Page page;
  OutputFile file;
  PictureText ink;

 private:
  DrawnFile(const Options& asked, Abandoned abandoned, const StageTimes::Watch&)
      : options(asked),
        page(readPage(options)),
        file(options.output, inputFile(page, options), abandoned),
        ink(options.ink ? inkOf(page, options) : PictureText{}) {}
};

void drawFile(DrawnFile& drawn, const PluginLibrary& plugin, RenderQueue& queue, StageTimes& times,
              Progress& progress) {
  Options& options = drawn.options;
  Page& page = drawn.page;
  // The extent of the whole page: what --points leaves out keeps its place.
  const PageLayout layout = layOutPage(plugin, queue, page, options);
  if (options.points) cutLastStroke(page, *options.points);

  PngWriter png(writerTo(drawn.file), std::move(drawn.ink));
  PageDrawer(plugin, queue, times).draw(page, options, layout, drawablesFor(page, options), progress, png);
  const StageTimes::Watch watch(times, Stage::Encode);
  drawn.file.commit();
}

// What pages are drawn with, one after the other: a plug-in and a GL context.
struct DrawingDesk {
  DrawingDesk(const Options& options, StageTimes& times)
      : DrawingDesk(options, StageTimes::Watch(times, Stage::GL)) {}

  PluginLibrary plugin;
  RenderQueue queue;

 private:
  DrawingDesk(const Options& options, const StageTimes::Watch&)
      : plugin(pluginPath(options)), queue(RenderQueue::Mode::Thread, RenderQueue::GL::Context) {}
};

void tellTimes(const Options& options, StageTimes& times) {
  if (options.timings) std::fputs(times.report().c_str(), stderr);
}

void drawOne(Options options) {
  if (!options.inputs.empty()) options.input = options.inputs.front();
  StageTimes times;
  {
    DrawnFile drawn(options, times);
    DrawingDesk desk(drawn.options, times);
    Progress progress("drawing stroke", strokesToPlay(drawn.page, drawn.options));
    drawFile(drawn, desk.plugin, desk.queue, times, progress);
  }
  tellTimes(options, times);
}

void makeFolder(const fs::path& folder) {
  std::error_code error;
  fs::create_directories(folder, error);
  if (error) throw Refusal(folder.string() + ": no folder for pictures: " + error.message());
}

// One of the processes that draw an archive.
class ArchiveWorker {
 public:
  explicit ArchiveWorker(const Options& options) : mOptions(options), mDesk(options, mTimes) {}
  ~ArchiveWorker() {
    if (mOptions.timings) std::fputs("one of the processes that drew pages:\n", stderr);
    tellTimes(mOptions, mTimes);
  }
  ArchiveWorker(const ArchiveWorker&) = delete;
  ArchiveWorker& operator=(const ArchiveWorker&) = delete;

  void draw(const ArchivePage& page) {
    Options options = mOptions;
    options.input = page.input;
    options.output = page.output.string();
    makeFolder(page.output.parent_path());
    // The picture is as old as what was read of the page: if that is changed meanwhile, it is out of date.
    const FileTime begin = clockOfFiles();
    DrawnFile drawn(options, mTimes, OutputFile::Abandoned::Leave);
    drawn.file.setTime(begin);
    Progress silent = Progress::silent();
    drawFile(drawn, mDesk.plugin, mDesk.queue, mTimes, silent);
  }

 private:
  const Options& mOptions;
  StageTimes mTimes;
  DrawingDesk mDesk;
};

// Each page as a picture of its own in the folder that is the output.
int drawArchive(const Options& options) {
  std::size_t refused = 0;
  const auto refuse = [&](const std::string& line) {
    ++refused;
    std::fprintf(stderr, "%s\n", printable(line).c_str());
  };
  std::vector<std::string> inputs = options.inputs;
  if (inputs.empty()) inputs.push_back(inputPath(options));
  std::vector<ArchivePage> pages = pagesOf(inputs, options.output, refuse);
  const std::size_t all = pages.size() + refused;
  makeFolder(options.output);
  std::set<fs::path> folders;
  for (const ArchivePage& page : pages) folders.insert(page.output.parent_path());
  std::size_t upToDate = 0;
  if (!options.again) {
    const FileTime program = programTime(pluginPath(options));
    upToDate = std::erase_if(pages, [&](const ArchivePage& page) { return isUpToDate(page, program); });
  }

  const std::size_t cores = std::max(std::thread::hardware_concurrency(), 1u);
  const std::size_t jobs =
      std::min(options.jobs ? static_cast<std::size_t>(*options.jobs) : cores, pages.size());
  std::size_t drawn = 0;
  {
    Progress progress("drawing page", pages.size());
    doInWorkers(
        pages.size(), jobs,
        [&]() -> Job {
          // Several processes are enough to keep the cores busy: none shares its drawing among threads.
          if (jobs > 1) setenv("LP_NUM_THREADS", "1", 0);
          const auto worker = std::make_shared<ArchiveWorker>(options);
          return [&pages, worker](std::size_t index) { worker->draw(pages[index]); };
        },
        [&](const JobEnd& end) {
          progress.step();
          if (!end.refusal) {
            ++drawn;
            return;
          }
          // Most refusals name the page; what a driver or a crash says does not.
          const std::string& input = pages[end.index].input;
          progress.clear();
          refuse(end.refusal->starts_with(input) ? *end.refusal : input + ": " + *end.refusal);
        });
  }
  for (const fs::path& folder : folders) removeAbandoned(folder.string());
  std::printf("%zu %s: %zu drawn, %zu up to date, %zu refused\n", all, all == 1 ? "page" : "pages", drawn,
              upToDate, refused);
  finishStandardOutput();
  return refused == 0 ? 0 : 1;
}

// Whether pictures go to a folder: because it is written as one, or because there may be several. Throws
// WrongUsage where several would go to one file. A single page does not go to a folder by mistake.
bool isForFolder(const Options& options) {
  std::error_code error;
  if (options.output.ends_with('/')) return true;
  const bool isFolder = fs::is_directory(options.output, error);
  const std::string first = options.inputs.empty() ? "" : options.inputs.front();
  if (first == kStandardInput && isFolder) return true;
  const bool areSeveral = options.inputs.size() > 1 || fs::is_directory(first, error);
  if (areSeveral && !isFolder)
    throw WrongUsage({"--output: several pages take a folder (DIR/), not '" + options.output + "'\n", 2});
  return areSeveral;
}

int draw(const Options& options) {
  if (isForFolder(options)) return drawArchive(options);
  drawOne(options);
  return 0;
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
  const PageLayout layout = layOut({0.0f, 0.0f, kPanelWidth, kPanelHeight}, options.zoom, 0.0f);
  StageTimes times;
  PngWriter png(writerTo(file));
  PageDrawer(plugin, queue, times).draw(samplePanel(), options, layout, {.preview = true}, progress, png);
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
  constexpr int kUsualLabelScale = 2, kLargestLabelScale = 4;
  constexpr int kLabelWidth = 19 * kGlyphAdvance;  // at scale 1
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
  // Labels go with cells that were asked for.
  const int labelScale = options.fit
                             ? std::clamp(static_cast<int>(layout.width) / kLabelWidth, 1, kLargestLabelScale)
                             : kUsualLabelScale;
  const int labelHeight = kGlyphHeight * labelScale;

  Progress progress("drawing stroke", page.strokes.size() * Qelt::kRenderingVersions.size());
  std::optional<Picture> sheet;
  int column = 0, row = 0;
  for (const Qelt::RenderingVersion& version : Qelt::kRenderingVersions) {
    options.renderingVersion = version.number;
    const Picture cell = drawPage(plugin, queue, page, options, layout, {.stroke = true}, progress);
    const int stepX = cell.width + kGap;
    const int stepY = cell.height + labelHeight + kGap;
    if (!sheet) {
      const int width = kColumns * stepX + kGap, height = kRows * stepY + kGap;
      checkSheetSize(width, height);
      sheet = plainPicture(width, height, kPaper);
    }
    const int x = kGap + column * stepX;
    const int y = kGap + row * stepY;
    writeLabel(*sheet, x, y, labelScale, kInk, "RENDERING VERSION " + std::to_string(version.number));
    paste(*sheet, cell, x, y + labelHeight + kGap / 2);
    if (++column == kColumns) column = 0, ++row;
  }
  file.write(encodePng(*sheet));
  file.commit();
}

}  // namespace

int runCommand(const Options& options) {
  // Without --log, standard error holds only the line that says what could not be done.
  if (!options.log) silenceLog();
  switch (options.command) {
    case Command::Draw:
      return draw(options);
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
