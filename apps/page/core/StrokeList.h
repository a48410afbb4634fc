#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <vector>

#include "core/PageStroke.h"

namespace QeltDesktop {

// The strokes of a page, the lowest first, hidden ones among them. Their numbers ascend.
class StrokeList {
 public:
  std::size_t size() const { return mStrokes.size(); }
  PageStroke& operator[](std::size_t index) { return *mStrokes[index]; }
  const PageStroke& operator[](std::size_t index) const { return *mStrokes[index]; }

  // On top of the others; shown. Throws std::bad_alloc, and has changed nothing then.
  PageStroke& add(std::unique_ptr<PageStroke> stroke);
  // So that adding so many strokes throws nothing.
  void makeRoom(std::size_t count = 1);
  // None where the list has no such stroke.
  std::optional<std::size_t> indexOf(StrokeId id) const;
  std::unique_ptr<PageStroke> take(std::size_t index);

  void show(std::size_t index, bool shown);
  std::size_t shown() const { return mShown; }
  // Changes with every stroke that goes, or is shown or hidden; not when one is added.
  std::uint64_t version() const { return mVersion; }
  // Whether nothing is shown above it.
  bool isTop(std::size_t index) const;

  // An outline begins with the width that the last one below it of the same look and smoothing ended with.
  // That one's index; none where there is none.
  std::optional<std::size_t> outlineBelow(std::size_t index) const;
  // The strokes above whose outlines change when this one comes or goes.
  std::vector<std::size_t> outlinesThatFollow(std::size_t index) const;

 private:
  bool continues(std::size_t index, const PageStyle& style) const;

  std::vector<std::unique_ptr<PageStroke>> mStrokes;
  std::size_t mShown = 0;
  std::uint64_t mVersion = 0;
};

}  // namespace QeltDesktop
