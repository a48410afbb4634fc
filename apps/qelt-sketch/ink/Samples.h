#pragma once

#include <cstddef>
#include <cstdint>
#include <iterator>
#include <vector>

namespace QeltDesktop {

// One point of recorded pen input.
struct Sample {
  float x = 0.0f, y = 0.0f;  // stroke units, y down; always finite
  float pressure = 1.0f;     // 0 to 1, not checked
  float tilt = 0.0f;         // radians from upright
  float orientation = 0.0f;  // radians, clockwise from up, above -pi to pi
  double time = 0.0;         // milliseconds
};

// The time of the sample at `index` when the page gives none: 240 samples a second, in milliseconds.
double usualTime(std::size_t index);

// The 32-bit words that samples are packed into. They lie in blocks, so that adding to a large page never
// copies what is there already.
class PackedWords {
 public:
  std::size_t size() const { return mSize; }
  std::uint32_t& operator[](std::size_t index) { return mBlocks[index / kBlock][index % kBlock]; }
  std::uint32_t operator[](std::size_t index) const { return mBlocks[index / kBlock][index % kBlock]; }
  // Drops all but the first `size` words, or adds zeros up to `size`.
  void resize(std::size_t size);

 private:
  static constexpr std::size_t kBlock = 16384;

  std::vector<std::vector<std::uint32_t>> mBlocks;
  std::size_t mSize = 0;
};

// Which of pressure, tilt, orientation and time the samples of a stroke hold, as bits. What was not recorded
// takes no memory: a page of positions alone takes little more than its file.
using Columns = std::uint8_t;
std::size_t wordsPerSample(Columns columns);

// Multiplies the places of the samples in the words from `first` to `end`, the latter not included.
void enlargePlaces(PackedWords& words, std::size_t first, std::size_t end, Columns columns, float factor);

// The samples of one stroke: a view into words that somebody else keeps, valid as long as those stay. The
// samples come out bit for bit as they went in.
class Samples {
 public:
  class Iterator;

  Samples(const PackedWords& words, std::size_t first, std::size_t size, Columns columns)
      : mWords(&words), mFirst(first), mSize(size), mColumns(columns) {}

  std::size_t size() const { return mSize; }
  bool empty() const { return mSize == 0; }
  Sample operator[](std::size_t index) const;
  // Throws std::out_of_range.
  Sample at(std::size_t index) const;
  Sample front() const { return (*this)[0]; }
  Sample back() const { return (*this)[mSize - 1]; }
  Iterator begin() const;
  Iterator end() const;

 private:
  const PackedWords* mWords;
  std::size_t mFirst;
  std::size_t mSize;
  Columns mColumns;
};

class Samples::Iterator {
 public:
  using iterator_category = std::input_iterator_tag;
  using value_type = Sample;
  using difference_type = std::ptrdiff_t;
  using pointer = const Sample*;
  using reference = Sample;

  Iterator(const Samples& samples, std::size_t index) : mSamples(samples), mIndex(index) {}
  Sample operator*() const { return mSamples[mIndex]; }
  Iterator& operator++() {
    ++mIndex;
    return *this;
  }
  // Of the same samples.
  bool operator==(const Iterator& other) const { return mIndex == other.mIndex; }

 private:
  Samples mSamples;
  std::size_t mIndex;
};

inline Samples::Iterator Samples::begin() const {
  return {*this, 0};
}
inline Samples::Iterator Samples::end() const {
  return {*this, mSize};
}

// Appends the samples of one stroke to the words.
class SamplePacker {
 public:
  SamplePacker() = default;
  explicit SamplePacker(std::size_t first) : mFirst(first) {}

  // All samples go to the same words, and nobody else adds to those in between.
  void add(PackedWords& words, const Sample& sample);

  std::size_t first() const { return mFirst; }
  std::size_t size() const { return mSize; }
  Columns columns() const { return mColumns; }

 private:
  void widen(PackedWords& words, Columns columns);

  std::size_t mFirst = 0;
  std::size_t mSize = 0;
  Columns mColumns = 0;
};

}  // namespace QeltDesktop
