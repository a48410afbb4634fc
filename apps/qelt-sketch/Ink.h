#pragma once

#include <cstddef>
#include <cstdint>
#include <deque>
#include <iterator>
#include <optional>
#include <utility>
#include <vector>

#include "Samples.h"

namespace QeltDesktop {

// What a page says of the pen a trace was drawn with; what it leaves open is the pen's own.
struct Brush {
  std::optional<float> width;                // stroke units, above 0
  std::optional<std::uint32_t> rgb;          // 0xRRGGBB
  std::optional<std::uint8_t> transparency;  // 0 opaque, 255 invisible
};

// Brushes, formats and the like are numbered in 30 bits: more of one kind would fill many gigabytes.
constexpr std::uint32_t kNoNumber = (std::uint32_t{1} << 30) - 1;
// The number of the next one when there are that many. Throws std::bad_alloc beyond the last number.
std::uint32_t numberAfter(std::size_t count);

// One stroke of the page, as its traces hand it out: its samples are only good as long as the page stays
// where and as it is.
struct Trace {
  Samples samples;  // never empty
  Brush brush;
  std::optional<int> tool;  // Qelt::ToolType
};

// The strokes of a page in order. However short they are, they take little more memory than their text: what
// they hold is packed, and a Trace is put together when it is asked for.
class Traces {
 public:
  class Iterator;

  std::size_t size() const { return mRecords.size(); }
  bool empty() const { return mRecords.empty(); }
  Trace operator[](std::size_t index) const;
  // Throws std::out_of_range.
  Trace at(std::size_t index) const;
  Trace front() const { return (*this)[0]; }
  Trace back() const { return (*this)[size() - 1]; }
  Iterator begin() const;
  Iterator end() const;

  // Makes room for that many in all.
  void reserve(std::size_t size) { mRecords.reserve(size); }
  void add(const std::vector<Sample>& samples, const Brush& brush = {}, std::optional<int> tool = {});
  // Leaves the last trace its first `size` samples, if there are more.
  void cutLast(std::size_t size);

  // A trace that is read bit by bit: the samples come first. `brush` is a number among the brushes, or
  // kNoNumber. A dropped one leaves nothing.
  void addSample(const Sample& sample) { mOpen.add(mWords, sample); }
  void finishTrace(std::uint32_t brush, std::optional<int> tool);
  void dropTrace();
  // The brushes that the numbers mean.
  void setBrushes(std::deque<Brush> brushes) { mBrushes = std::move(brushes); }

 private:
  struct Record {
    std::uint64_t first : 60;  // of its words; they end where those of the next one begin
    std::uint64_t columns : 4;
    std::uint32_t brush;
    std::uint8_t tool;
  };

  PackedWords mWords;
  SamplePacker mOpen;  // behind the last trace
  std::vector<Record> mRecords;
  std::deque<Brush> mBrushes;
};

class Traces::Iterator {
 public:
  using iterator_category = std::input_iterator_tag;
  using value_type = Trace;
  using difference_type = std::ptrdiff_t;
  using pointer = const Trace*;
  using reference = Trace;

  Iterator(const Traces& traces, std::size_t index) : mTraces(&traces), mIndex(index) {}
  Trace operator*() const { return (*mTraces)[mIndex]; }
  Iterator& operator++() {
    ++mIndex;
    return *this;
  }
  bool operator==(const Iterator& other) const = default;

 private:
  const Traces* mTraces;
  std::size_t mIndex;
};

inline Traces::Iterator Traces::begin() const {
  return {*this, 0};
}
inline Traces::Iterator Traces::end() const {
  return {*this, size()};
}

struct Page {
  Traces traces;  // never empty
};

}  // namespace QeltDesktop
