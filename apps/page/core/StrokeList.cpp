#include "core/StrokeList.h"

#include <algorithm>
#include <cstddef>
#include <utility>

namespace QeltDesktop {

PageStroke& StrokeList::add(std::unique_ptr<PageStroke> stroke) {
  mStrokes.push_back(std::move(stroke));
  if (mStrokes.back()->isShown) ++mShown;
  return *mStrokes.back();
}

void StrokeList::makeRoom(std::size_t count) {
  const std::size_t needed = mStrokes.size() + count;
  if (needed > mStrokes.capacity()) mStrokes.reserve(std::max(needed, 2 * mStrokes.capacity()));
}

std::optional<std::size_t> StrokeList::indexOf(StrokeId id) const {
  const auto found =
      std::lower_bound(mStrokes.begin(), mStrokes.end(), id,
                       [](const auto& stroke, StrokeId wanted) { return stroke->id() < wanted; });
  if (found == mStrokes.end() || (*found)->id() != id) return std::nullopt;
  return static_cast<std::size_t>(found - mStrokes.begin());
}

std::unique_ptr<PageStroke> StrokeList::take(std::size_t index) {
  std::unique_ptr<PageStroke> taken = std::move(mStrokes[index]);
  mStrokes.erase(mStrokes.begin() + static_cast<std::ptrdiff_t>(index));
  if (taken->isShown) --mShown;
  ++mVersion;
  return taken;
}

void StrokeList::show(std::size_t index, bool shown) {
  PageStroke& stroke = *mStrokes[index];
  if (stroke.isShown == shown) return;
  stroke.isShown = shown;
  ++mVersion;
  if (shown) {
    ++mShown;
  } else {
    --mShown;
  }
}

bool StrokeList::isTop(std::size_t index) const {
  return std::none_of(mStrokes.begin() + static_cast<std::ptrdiff_t>(index) + 1, mStrokes.end(),
                      [](const auto& above) { return above->isShown; });
}

bool StrokeList::continues(std::size_t index, const PageStyle& style) const {
  const PageStroke& stroke = *mStrokes[index];
  return stroke.isShown && stroke.style().outline && stroke.style().look == style.look &&
         stroke.style().smooth == style.smooth;
}

std::optional<std::size_t> StrokeList::outlineBelow(std::size_t index) const {
  const PageStyle& style = mStrokes[index]->style();
  while (index-- > 0) {
    if (continues(index, style)) return index;
  }
  return std::nullopt;
}

std::vector<std::size_t> StrokeList::outlinesThatFollow(std::size_t index) const {
  std::vector<std::size_t> following;
  const PageStyle& style = mStrokes[index]->style();
  if (!style.outline) return following;
  for (std::size_t above = index + 1; above < mStrokes.size(); ++above) {
    if (!continues(above, style)) continue;
    following.push_back(above);
    if (mStrokes[above]->settlesOutline()) break;
  }
  return following;
}

}  // namespace QeltDesktop
