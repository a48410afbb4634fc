#pragma once

#include <cstddef>
#include <cstdint>
#include <initializer_list>
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

// When the sample of that index was taken where nothing says so: 240 a second.
double usualTime(std::size_t index);

// The samples of a trace, packed: what was not recorded takes no memory. A page of places alone is held in
// little more than the file it was read from. They come out bit for bit as they went in.
class Samples {
 public:
  class Iterator;

  Samples() = default;
  Samples(std::initializer_list<Sample> samples);

  std::size_t size() const { return mWords.size() / wordsEach(); }
  bool empty() const { return mWords.empty(); }
  Sample operator[](std::size_t index) const;
  // Throws std::out_of_range.
  Sample at(std::size_t index) const;
  Sample front() const { return (*this)[0]; }
  Sample back() const { return (*this)[size() - 1]; }
  Iterator begin() const;
  Iterator end() const;

  // Makes room for that many in all.
  void reserve(std::size_t size);
  void push_back(const Sample& sample);
  // Leaves the first `size`, if there are more.
  void cut(std::size_t size);

 private:
  std::size_t wordsEach() const;
  void widen(std::uint8_t columns);
  void append(const Sample& sample);

  std::vector<std::uint32_t> mWords;
  std::uint8_t mColumns = 0;  // which of pressure, tilt, orientation and time are held
};

class Samples::Iterator {
 public:
  using iterator_category = std::input_iterator_tag;
  using value_type = Sample;
  using difference_type = std::ptrdiff_t;
  using pointer = const Sample*;
  using reference = Sample;

  Iterator(const Samples& samples, std::size_t index) : mSamples(&samples), mIndex(index) {}
  Sample operator*() const { return (*mSamples)[mIndex]; }
  Iterator& operator++() {
    ++mIndex;
    return *this;
  }
  bool operator==(const Iterator& other) const = default;

 private:
  const Samples* mSamples;
  std::size_t mIndex;
};

inline Samples::Iterator Samples::begin() const {
  return {*this, 0};
}
inline Samples::Iterator Samples::end() const {
  return {*this, size()};
}

}  // namespace QeltDesktop
