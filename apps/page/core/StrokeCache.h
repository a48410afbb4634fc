#pragma once

#include <cstddef>
#include <cstdint>
#include <list>

namespace QeltDesktop {

class PageStroke;

// Bounds the drawings of stored strokes that the pens keep: those drawn least recently are dropped. A stroke
// has an entry in the host's cache only while its drawing is kept. Main thread.
class StrokeCache {
 public:
  explicit StrokeCache(std::size_t mostBytes) : mMostBytes(mostBytes) {}
  // Drops everything: the strokes of a page are gone by then, or forgotten one by one.
  ~StrokeCache();
  StrokeCache(const StrokeCache&) = delete;
  StrokeCache& operator=(const StrokeCache&) = delete;

  // Before a stroke is drawn in a view of this zoom: has the pen use what is cached only if it was computed
  // for the very same zoom, or `followsZoom` is false. Throws std::bad_alloc.
  void prepare(PageStroke& stroke, float zoom, bool followsZoom);
  // After it was drawn, and the queue has run.
  void note(PageStroke& stroke);
  // Before a stroke goes.
  void forget(PageStroke& stroke);
  void dropAll();

  std::size_t bytes() const { return mBytes; }
  std::uint64_t hits() const { return mHits; }
  std::uint64_t misses() const { return mMisses; }
  // A stroke that is never cached was drawn.
  void countMiss() { ++mMisses; }

 private:
  const std::size_t mMostBytes;
  std::size_t mBytes = 0;
  std::uint64_t mHits = 0, mMisses = 0;
  std::list<PageStroke*> mKept;  // the one drawn least recently first
};

}  // namespace QeltDesktop
