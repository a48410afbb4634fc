#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "core/PageTypes.h"
#include "ink/Samples.h"

namespace QeltDesktop {

class PluginLibrary;
class RenderQueue;

// A page that somebody draws on: its strokes, their history, and the layers that show them in a window. It
// drives the pens of a plug-in, one for each look and smoothing, as a host does.
//
// What the page shows at rest, when `work` returns false, follows from the shown strokes in their order and
// from the view alone, byte for byte: it does not matter what was drawn, erased, undone, moved or lost on the
// way. A stroke under way is drawn live, on a layer above; once it ends, its stored form takes its place.
//
// Main thread; the queue is of mode Caller, and its tasks run inside the calls. What cannot be done throws:
// Refusal with one clear sentence for the person who draws, std::runtime_error with one for what OpenGL
// cannot do, std::bad_alloc. The page is then as it was before the call, and usable.
class InkPage {
 public:
  // Both outlive the page. Throws std::runtime_error when the window has no layers in this OpenGL.
  InkPage(const PluginLibrary& plugin, RenderQueue& queue, int width, int height,
          const PageMemory& memory = {});
  ~InkPage();
  InkPage(const InkPage&) = delete;
  InkPage& operator=(const InkPage&) = delete;

  // --- The window ---

  // Device pixels, at least 1 each.
  void resize(int width, int height);
  int width() const;
  int height() const;
  // Shows what there is at its new place at once; `work` then redraws it sharp.
  void setView(const PageView& view);
  const PageView& view() const;
  // Shows the page on the surface of the queue's context, on paper (red, green, blue). Call it once a frame.
  // Throws std::runtime_error when the context has no surface. Does nothing while the context is lost.
  void present(const std::array<std::uint8_t, 3>& paper);
  // One slice of redrawing, of about `milliseconds` on this thread and little more for the GPU than that. It
  // does nothing while the GPU has not done with the slice before. True while there is more to do.
  bool work(double milliseconds);
  bool isBusy() const;
  // The context was taken away, and is there again. In between everything works, but nothing is shown.
  // Restoring throws std::runtime_error when there is no context to be had yet.
  void contextLost();
  void contextRestored();

  // --- The pen ---

  // What the pen of a look, 1 to 8, offers.
  PenLimits limits(int look);
  // Begins a stroke and draws its first ink. Refused while a stroke is under way, and for styles and samples
  // that are out of range.
  void begin(const PageStyle& style, const Sample& sample);
  // The samples of one event, oldest first, and those that are expected to follow. Samples that are not
  // finite, or too far away, are dropped; a time that runs back is taken for the one before; pressure and
  // tilt are brought into their ranges. Does nothing when no stroke is under way.
  void move(std::span<const Sample> samples, std::span<const Sample> predicted = {});
  // Ends the stroke and stores it. The sample counts where it lies elsewhere than the last one; a pressure of
  // 0 there is taken for the last one's, since a lifted pen reports none. Returns the stored stroke's number;
  // 0 when no stroke is under way, or in a replay.
  StrokeId end(const Sample& sample);
  // The stroke under way leaves no mark. Harmless when there is none.
  void cancel();
  bool isDrawing() const;

  // --- The history ---

  // These are refused while a stroke or a replay is under way.

  // Hides the strokes that come within `radius` of the line, stroke units. Everything erased until `eraseEnd`
  // is one step. Returns how many strokes were hidden by this call.
  std::size_t erase(float x0, float y0, float x1, float y1, float radius);
  // None when nothing was erased.
  std::optional<PageChange> eraseEnd();
  // None when there is nothing to do.
  std::optional<PageChange> undo();
  std::optional<PageChange> redo();
  std::optional<PageChange> clear();
  bool canUndo() const;
  bool canRedo() const;
  // Adds the strokes of an InkML file, as one step. Throws Refusal, "name:line: what is wrong".
  PageChange openInkml(std::span<const std::uint8_t> bytes, const std::string& name);

  // --- The strokes ---

  // Adds a stroke from its bytes (`PageRecord.h`), as no step of the history. Throws Refusal when they are
  // not a stroke's.
  StrokeId addRecord(std::span<const std::uint8_t> bytes);
  // Shows or hides a stroke as another window on the same page did, as no step of the history. Refused while
  // a stroke or a replay is under way, and where the page has no such stroke.
  void setShown(StrokeId id, bool isShown);
  // The next four throw Refusal where the page has no such stroke. Strokes that are hidden, but may come back
  // by undo or redo, are the page's too.
  std::vector<std::uint8_t> record(StrokeId id) const;
  const PageStyle& style(StrokeId id) const;
  std::vector<Sample> samples(StrokeId id) const;
  bool isShown(StrokeId id) const;
  // The shown strokes, the lowest first.
  std::vector<StrokeId> strokes() const;
  // Of the shown strokes' lines with the width of their pens; none on an empty page.
  std::optional<PageBounds> bounds() const;

  // --- Pictures ---

  // All shown strokes, as `qelt-sketch draw` lays them out and draws them, on the background (red, green,
  // blue) or transparent. Throws Refusal when it is too large or the page is empty.
  PagePicture picture(double zoom, const std::optional<std::array<std::uint8_t, 3>>& background);
  // The sample stroke of `qelt-sketch preview`, fitted into the picture; transparent.
  PagePicture preview(int width, int height, const PageStyle& style);
  // The page at rest or on its way there: its layers as they are now, without a stroke under way, laid over
  // each other; transparent. For tests and for pictures of the window.
  PagePicture windowPicture();

  // --- Replay ---

  // Until `replayEnd` the page is shown empty, and strokes are drawn on it without being stored. Refused
  // while a stroke or a replay is under way.
  void replayBegin();
  // Ends a stroke under way too. Harmless when there is no replay.
  void replayEnd();
  bool isReplaying() const;

  PageStats stats() const;

 private:
  struct Parts;
  std::unique_ptr<Parts> mParts;
};

}  // namespace QeltDesktop
