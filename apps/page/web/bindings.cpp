#include <emscripten/emscripten.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <exception>
#include <memory>
#include <new>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "core/InkPage.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "ink/Ink.h"
#include "ink/InkmlWriter.h"

// What site/engine.js calls, one function for each of its methods. A function returns a number that is not
// negative, or -1 when something was refused; `qelt_error` then says what in one sentence. Longer answers lie
// in two lists, of numbers and of bytes, until the next call. What goes in beside numbers lies in the room
// that `qelt_input` gave. No exception leaves the compiled code: a script could only tell its address.

namespace {

using namespace QeltDesktop;

struct Engine {
  explicit Engine(const Surface& surface)
      : queue(RenderQueue::Mode::Caller, RenderQueue::GL::Context, surface),
        page(plugin, queue, surface.width, surface.height) {}

  PluginLibrary plugin{""};
  RenderQueue queue;
  InkPage page;
};

std::unique_ptr<Engine> gEngine;
std::string gError;
std::vector<double> gInput;  // of doubles, since those want the widest alignment
std::vector<double> gNumbers;
std::vector<std::uint8_t> gBytes;

int refuse(const char* sentence) noexcept {
  try {
    gError = sentence;
  } catch (...) {
    gError.clear();
  }
  return -1;
}

// Makes the call; what it throws becomes a refusal.
template <typename Call>
int answer(Call&& call) noexcept {
  try {
    gNumbers.clear();
    gBytes.clear();
    return call();
  } catch (const std::bad_alloc&) {
    return refuse("There is not enough memory for this.");
  } catch (const std::exception& error) {
    return refuse(error.what());
  } catch (...) {
    return refuse("The pen could not go on.");
  }
}

template <typename Call>
int onPage(Call&& call) noexcept {
  if (gEngine == nullptr) return refuse("The page is not open.");
  return answer([&] { return call(gEngine->page); });
}

int yes(bool is) {
  return is ? 1 : 0;
}

// Ids are below 2^31, so that they are no refusals.
int idOf(StrokeId id) {
  return static_cast<int>(id);
}

int told(const std::optional<PageChange>& change) {
  if (!change) return 0;
  for (const StrokeId id : change->shown) gNumbers.push_back(id);
  for (const StrokeId id : change->hidden) gNumbers.push_back(-static_cast<double>(id));
  return 1;
}

Sample sampleOf(double x, double y, double pressure, double tilt, double orientation, double time) {
  Sample sample;
  sample.x = static_cast<float>(x);
  sample.y = static_cast<float>(y);
  sample.pressure = static_cast<float>(pressure);
  sample.tilt = static_cast<float>(tilt);
  sample.orientation = static_cast<float>(orientation);
  sample.time = time;
  return sample;
}

std::vector<Sample> samplesAt(const double* rows, int count) {
  std::vector<Sample> samples;
  samples.reserve(static_cast<std::size_t>(count));
  for (const double* row = rows; row != rows + 6 * count; row += 6) {
    samples.push_back(sampleOf(row[0], row[1], row[2], row[3], row[4], row[5]));
  }
  return samples;
}

void tell(const Sample& sample) {
  for (const double value :
       {static_cast<double>(sample.x), static_cast<double>(sample.y), static_cast<double>(sample.pressure),
        static_cast<double>(sample.tilt), static_cast<double>(sample.orientation), sample.time}) {
    gNumbers.push_back(value);
  }
}

PageStyle styleOf(int look, double size, std::uint32_t argb, int smooth, double outlineSize,
                  std::uint32_t outlineArgb, int tool) {
  PageStyle style{
      .look = look, .size = static_cast<float>(size), .argb = argb, .smooth = smooth != 0, .tool = tool};
  if (outlineSize != 0.0) style.outline = PageOutline{static_cast<float>(outlineSize), outlineArgb};
  return style;
}

std::array<std::uint8_t, 3> colorOf(int red, int green, int blue) {
  return {static_cast<std::uint8_t>(red), static_cast<std::uint8_t>(green), static_cast<std::uint8_t>(blue)};
}

int told(PagePicture picture) {
  gNumbers = {static_cast<double>(picture.width), static_cast<double>(picture.height)};
  gBytes = std::move(picture.rgba);
  return 0;
}

// The shown strokes, as a page of ink has them.
Strokes strokesOf(const InkPage& page) {
  Strokes strokes;
  std::deque<Brush> brushes;
  for (const StrokeId id : page.strokes()) {
    const PageStyle& style = page.style(id);
    Brush brush;
    brush.width = style.size;
    brush.rgb = style.argb & 0xFFFFFFu;
    brush.transparency = static_cast<std::uint8_t>(255 - (style.argb >> 24));
    brush.renderingVersion = style.look;
    brush.curve = style.smooth;
    if (style.outline) {
      brush.outlineSize = style.outline->size;
      brush.outlineArgb = style.outline->argb;
    }
    strokes.add(page.samples(id), brush, style.tool);
  }
  return strokes;
}

}  // namespace

extern "C" {

EMSCRIPTEN_KEEPALIVE const char* qelt_error() {
  return gError.c_str();
}
EMSCRIPTEN_KEEPALIVE const double* qelt_numbers() {
  return gNumbers.data();
}
EMSCRIPTEN_KEEPALIVE int qelt_number_count() {
  return static_cast<int>(gNumbers.size());
}
EMSCRIPTEN_KEEPALIVE const std::uint8_t* qelt_bytes() {
  return gBytes.data();
}
EMSCRIPTEN_KEEPALIVE int qelt_byte_count() {
  return static_cast<int>(gBytes.size());
}
// Room for so many bytes; null when there is none. Valid until the next call of this.
EMSCRIPTEN_KEEPALIVE void* qelt_input(int size) {
  const std::size_t wanted = static_cast<std::size_t>(std::max(size, 1)) / sizeof(double) + 1;
  // A large file's room is given back with the next input.
  constexpr std::size_t kKept = 1 << 16;
  try {
    if (gInput.capacity() > kKept && wanted <= kKept) gInput = {};
    gInput.resize(wanted);
  } catch (...) {
    return nullptr;
  }
  return gInput.data();
}

// Opens the page on the canvas of that selector, once.
EMSCRIPTEN_KEEPALIVE int qelt_open(const char* selector, int width, int height) {
  if (gEngine != nullptr) return refuse("The page is open already.");
  return answer([&] {
    gEngine = std::make_unique<Engine>(Surface{selector, width, height});
    return 0;
  });
}
EMSCRIPTEN_KEEPALIVE int qelt_resize(int width, int height) {
  return onPage([&](InkPage& page) { return page.resize(width, height), 0; });
}
EMSCRIPTEN_KEEPALIVE int qelt_view(double zoom, double x, double y) {
  return onPage([&](InkPage& page) { return page.setView({zoom, x, y}), 0; });
}
EMSCRIPTEN_KEEPALIVE int qelt_present(int red, int green, int blue) {
  return onPage([&](InkPage& page) { return page.present(colorOf(red, green, blue)), 0; });
}
EMSCRIPTEN_KEEPALIVE int qelt_work(double milliseconds) {
  return onPage([&](InkPage& page) { return yes(page.work(milliseconds)); });
}
EMSCRIPTEN_KEEPALIVE int qelt_busy() {
  return onPage([](InkPage& page) { return yes(page.isBusy()); });
}
EMSCRIPTEN_KEEPALIVE int qelt_context_lost() {
  return onPage([](InkPage& page) { return page.contextLost(), 0; });
}
EMSCRIPTEN_KEEPALIVE int qelt_context_restored() {
  return onPage([](InkPage& page) { return page.contextRestored(), 0; });
}

// The pen.

// Answers with the least size, the largest, the pen's own, and its colour.
EMSCRIPTEN_KEEPALIVE int qelt_limits(int look) {
  return onPage([&](InkPage& page) {
    const PenLimits limits = page.limits(look);
    gNumbers = {limits.minSize, limits.maxSize, limits.size, static_cast<double>(limits.argb)};
    return 0;
  });
}
EMSCRIPTEN_KEEPALIVE int qelt_begin(int look, double size, std::uint32_t argb, int smooth, double outlineSize,
                                    std::uint32_t outlineArgb, int tool, double x, double y, double pressure,
                                    double tilt, double orientation, double time) {
  return onPage([&](InkPage& page) {
    page.begin(styleOf(look, size, argb, smooth, outlineSize, outlineArgb, tool),
               sampleOf(x, y, pressure, tilt, orientation, time));
    return 0;
  });
}
// `rows`: six numbers a sample, first those of the event, then the predicted ones.
EMSCRIPTEN_KEEPALIVE int qelt_move(const double* rows, int count, int predicted) {
  return onPage([&](InkPage& page) {
    page.move(samplesAt(rows, count), samplesAt(rows + 6 * count, predicted));
    return 0;
  });
}
EMSCRIPTEN_KEEPALIVE int qelt_end(double x, double y, double pressure, double tilt, double orientation,
                                  double time) {
  return onPage(
      [&](InkPage& page) { return idOf(page.end(sampleOf(x, y, pressure, tilt, orientation, time))); });
}
EMSCRIPTEN_KEEPALIVE int qelt_cancel() {
  return onPage([](InkPage& page) { return page.cancel(), 0; });
}

// The history. What changes the page answers with the ids that are shown now, and those that are hidden,
// negative.

EMSCRIPTEN_KEEPALIVE int qelt_erase(double x0, double y0, double x1, double y1, double radius) {
  return onPage([&](InkPage& page) {
    return static_cast<int>(page.erase(static_cast<float>(x0), static_cast<float>(y0), static_cast<float>(x1),
                                       static_cast<float>(y1), static_cast<float>(radius)));
  });
}
EMSCRIPTEN_KEEPALIVE int qelt_erase_end() {
  return onPage([](InkPage& page) { return told(page.eraseEnd()); });
}
EMSCRIPTEN_KEEPALIVE int qelt_undo() {
  return onPage([](InkPage& page) { return told(page.undo()); });
}
EMSCRIPTEN_KEEPALIVE int qelt_redo() {
  return onPage([](InkPage& page) { return told(page.redo()); });
}
EMSCRIPTEN_KEEPALIVE int qelt_clear() {
  return onPage([](InkPage& page) { return told(page.clear()); });
}
EMSCRIPTEN_KEEPALIVE int qelt_can_undo() {
  return onPage([](InkPage& page) { return yes(page.canUndo()); });
}
EMSCRIPTEN_KEEPALIVE int qelt_can_redo() {
  return onPage([](InkPage& page) { return yes(page.canRedo()); });
}

// The strokes.

EMSCRIPTEN_KEEPALIVE int qelt_strokes() {
  return onPage([](InkPage& page) {
    const std::vector<StrokeId> ids = page.strokes();
    gNumbers.assign(ids.begin(), ids.end());
    return 0;
  });
}
EMSCRIPTEN_KEEPALIVE int qelt_samples(StrokeId id) {
  return onPage([&](InkPage& page) {
    for (const Sample& sample : page.samples(id)) tell(sample);
    return 0;
  });
}
EMSCRIPTEN_KEEPALIVE int qelt_set_shown(StrokeId id, int isShown) {
  return onPage([&](InkPage& page) { return page.setShown(id, isShown != 0), 0; });
}
// Answers with look, size, colour, smoothing, the outline's size (0 without) and colour, and the tool.
EMSCRIPTEN_KEEPALIVE int qelt_style(StrokeId id) {
  return onPage([&](InkPage& page) {
    const PageStyle& style = page.style(id);
    const PageOutline outline = style.outline.value_or(PageOutline{});
    gNumbers = {static_cast<double>(style.look), style.size,   static_cast<double>(style.argb),
                style.smooth ? 1.0 : 0.0,        outline.size, static_cast<double>(outline.argb),
                static_cast<double>(style.tool)};
    return 0;
  });
}
// Answers 1 with left, top, right and bottom; 0 on an empty page.
EMSCRIPTEN_KEEPALIVE int qelt_bounds() {
  return onPage([](InkPage& page) {
    const std::optional<PageBounds> bounds = page.bounds();
    if (bounds) gNumbers = {bounds->left, bounds->top, bounds->right, bounds->bottom};
    return yes(bounds.has_value());
  });
}
EMSCRIPTEN_KEEPALIVE int qelt_record(StrokeId id) {
  return onPage([&](InkPage& page) { return gBytes = page.record(id), 0; });
}
EMSCRIPTEN_KEEPALIVE int qelt_add_record(const std::uint8_t* bytes, int size) {
  return onPage([&](InkPage& page) { return idOf(page.addRecord({bytes, static_cast<std::size_t>(size)})); });
}
// The file's bytes, and after them its name.
EMSCRIPTEN_KEEPALIVE int qelt_open_inkml(const std::uint8_t* bytes, int size, int nameSize) {
  return onPage([&](InkPage& page) {
    const std::string name(bytes + size, bytes + size + nameSize);
    return told(page.openInkml({bytes, static_cast<std::size_t>(size)}, name));
  });
}
EMSCRIPTEN_KEEPALIVE int qelt_inkml() {
  return onPage([](InkPage& page) {
    const std::string text = writeInkml(strokesOf(page));
    gBytes.assign(text.begin(), text.end());
    return 0;
  });
}

// Pictures. They answer with width and height, and the pixels.

EMSCRIPTEN_KEEPALIVE int qelt_picture(double zoom, int transparent, int red, int green, int blue) {
  return onPage([&](InkPage& page) {
    const auto paper = transparent != 0 ? std::nullopt : std::optional(colorOf(red, green, blue));
    return told(page.picture(zoom, paper));
  });
}
// What the window shows at rest, without paper.
EMSCRIPTEN_KEEPALIVE int qelt_window_picture() {
  return onPage([](InkPage& page) { return told(page.windowPicture()); });
}
EMSCRIPTEN_KEEPALIVE int qelt_preview(int width, int height, int look, double size, std::uint32_t argb,
                                      int smooth, double outlineSize, std::uint32_t outlineArgb, int tool) {
  return onPage([&](InkPage& page) {
    return told(
        page.preview(width, height, styleOf(look, size, argb, smooth, outlineSize, outlineArgb, tool)));
  });
}

EMSCRIPTEN_KEEPALIVE int qelt_replay_begin() {
  return onPage([](InkPage& page) { return page.replayBegin(), 0; });
}
EMSCRIPTEN_KEEPALIVE int qelt_replay_end() {
  return onPage([](InkPage& page) { return page.replayEnd(), 0; });
}

// Answers with the fields of PageStats, in their order.
EMSCRIPTEN_KEEPALIVE int qelt_stats() {
  return onPage([](InkPage& page) {
    const PageStats stats = page.stats();
    for (const auto value : {static_cast<double>(stats.strokes), static_cast<double>(stats.stamps),
                             static_cast<double>(stats.tiles), static_cast<double>(stats.cacheHits),
                             static_cast<double>(stats.cacheMisses), static_cast<double>(stats.cachedBytes),
                             static_cast<double>(stats.backupBytes)}) {
      gNumbers.push_back(value);
    }
    return 0;
  });
}

}  // extern "C"
