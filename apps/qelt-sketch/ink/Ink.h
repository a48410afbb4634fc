#pragma once

#include <cstddef>
#include <cstdint>
#include <deque>
#include <iterator>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "ink/Samples.h"

namespace QeltDesktop {

// What a page says about the pen that drew a stroke. Whatever it leaves open is up to the pen.
struct Brush {
  std::optional<float> width;                // stroke units, above 0
  std::optional<std::uint32_t> rgb;          // 0xRRGGBB
  std::optional<std::uint8_t> transparency;  // 0 opaque, 255 invisible
  // Settings of this pen, in properties that InkML leaves to the program.
  std::optional<int> renderingVersion;  // 1 to 99
  std::optional<bool> curve;            // false: straight segments
  std::optional<float> outlineSize;     // stroke units, above 0; a stroke with it has an outline
  std::optional<std::uint32_t> outlineArgb;

  bool operator==(const Brush&) const = default;
};

// Brushes, formats and the like are numbered in 30 bits: more of one kind would fill many gigabytes.
constexpr std::uint32_t kNoNumber = (std::uint32_t{1} << 30) - 1;
// The number of the next brush (format, ...) after `count` of them. Throws std::bad_alloc beyond the last
// number.
std::uint32_t numberAfter(std::size_t count);

// One stroke of a page. Its samples are a view into the page: they are valid as long as the page is neither
// moved nor changed.
struct Stroke {
  Samples samples;  // never empty
  Brush brush;
  std::optional<int> tool;  // Qelt::ToolType
};

// The strokes of a page, in order. Their samples are packed, and a Stroke is put together when it is asked
// for, so that even very short strokes take little more memory than the text they were read from.
class Strokes {
 public:
  class Iterator;

  std::size_t size() const { return mRecords.size(); }
  bool empty() const { return mRecords.empty(); }
  Stroke operator[](std::size_t index) const;
  // Throws std::out_of_range.
  Stroke at(std::size_t index) const;
  Stroke front() const { return (*this)[0]; }
  Stroke back() const { return (*this)[size() - 1]; }
  Iterator begin() const;
  Iterator end() const;

  // Makes room for `size` strokes in all.
  void reserve(std::size_t size) { mRecords.reserve(size); }
  void add(const std::vector<Sample>& samples, const Brush& brush = {}, std::optional<int> tool = {});
  // Drops all but the first `size` samples of the last stroke.
  void cutLast(std::size_t size);
  // Multiplies all places.
  void enlarge(float factor);

  // For a reader, which adds sample by sample and then ends the stroke that they make up, or drops it and
  // them. `brush` is an index into the brushes, or kNoNumber.
  void addSample(const Sample& sample) { mOpen.add(mWords, sample); }
  void finishStroke(std::uint32_t brush, std::optional<int> tool);
  void dropStroke();
  // The brushes that `finishStroke` referred to.
  void setBrushes(std::deque<Brush> brushes) { mBrushes = std::move(brushes); }

 private:
  struct Record {
    std::uint64_t first : 60;  // of its words; they end where the next stroke's begin
    std::uint64_t columns : 4;
    std::uint32_t brush;
    std::uint8_t tool;
  };

  PackedWords mWords;
  SamplePacker mOpen;  // of the stroke after the last
  std::vector<Record> mRecords;
  std::deque<Brush> mBrushes;
};

class Strokes::Iterator {
 public:
  using iterator_category = std::input_iterator_tag;
  using value_type = Stroke;
  using difference_type = std::ptrdiff_t;
  using pointer = const Stroke*;
  using reference = Stroke;

  Iterator(const Strokes& strokes, std::size_t index) : mStrokes(&strokes), mIndex(index) {}
  Stroke operator*() const { return (*mStrokes)[mIndex]; }
  Iterator& operator++() {
    ++mIndex;
    return *this;
  }
  bool operator==(const Iterator& other) const = default;

 private:
  const Strokes* mStrokes;
  std::size_t mIndex;
};

inline Strokes::Iterator Strokes::begin() const {
  return {*this, 0};
}
inline Strokes::Iterator Strokes::end() const {
  return {*this, size()};
}

struct Page {
  std::string name;  // what messages call it: the file it was read from
  Strokes strokes;   // never empty once it is read
};

}  // namespace QeltDesktop
