#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

namespace QeltDesktop {

// Numbers the strokes of a page, from 1, in the order in which they came; none is given twice.
using StrokeId = std::uint32_t;

// The rim around a stroke.
struct PageOutline {
  float size = 0.0f;  // stroke units, 0 to kLargestSize
  std::uint32_t argb = 0;

  bool operator==(const PageOutline&) const = default;
};

// How a stroke is drawn.
struct PageStyle {
  int look = 8;       // the rendering version, 1 to 8
  float size = 1.0f;  // of the pen, stroke units, above 0, at most kLargestSize
  std::uint32_t argb = 0xFF000000u;
  bool smooth = true;  // curves through the samples; else straight lines
  std::optional<PageOutline> outline;
  int tool = 2;  // Qelt::ToolType: 1 finger, 2 stylus, 3 mouse

  bool operator==(const PageStyle&) const = default;
};

// The largest pen or outline that a page takes, far beyond what the pens offer themselves. Stroke units.
constexpr float kLargestSize = 1000.0f;
// How far from the origin a sample may lie, in x and in y: a longer line would take more memory than a page
// may use. Stroke units.
constexpr float kFarthest = 100'000.0f;

// Where the page lies in the window: device pixel = zoom * stroke unit + (x, y).
struct PageView {
  double zoom = 1.0;        // kLeastZoom to kMostZoom
  double x = 0.0, y = 0.0;  // pixels, within kFarthestShift

  bool operator==(const PageView&) const = default;
};

constexpr double kLeastZoom = 0.001, kMostZoom = 1000.0;
constexpr double kFarthestShift = 1e9;

// What an operation did to the page.
struct PageChange {
  std::vector<StrokeId> shown, hidden;
};

struct PageBounds {
  float left, top, right, bottom;  // stroke units
};

// 4 bytes a pixel, red first, not premultiplied, the first row the top.
struct PagePicture {
  int width = 0, height = 0;
  std::vector<std::uint8_t> rgba;
};

// What the pen of a look offers and begins with. Sizes in stroke units.
struct PenLimits {
  float minSize, maxSize, size;
  std::uint32_t argb;
};

struct PageStats {
  std::size_t strokes = 0;      // shown
  std::uint64_t stamps = 0;     // computed so far, of live and stored strokes
  std::size_t tiles = 0;        // of all layers that there are
  std::uint64_t cacheHits = 0;  // stored strokes that were drawn from the cache so far
  std::uint64_t cacheMisses = 0;
  std::size_t cachedBytes = 0;  // vertices in the cache
  std::size_t backupBytes = 0;  // pixels kept for undo and redo
};

// What a page may keep beyond its strokes.
struct PageMemory {
  std::size_t mostCachedBytes = std::size_t{256} << 20;
  std::size_t mostBackupBytes = std::size_t{128} << 20;
};

}  // namespace QeltDesktop
