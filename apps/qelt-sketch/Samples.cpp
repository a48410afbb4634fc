#include "Samples.h"

#include <algorithm>
#include <array>
#include <bit>
#include <stdexcept>
#include <utility>

namespace QeltDesktop {
namespace {

using TimeWords = std::array<std::uint32_t, 2>;

enum Column : std::uint8_t { kPressure = 1, kTilt = 2, kOrientation = 4, kTime = 8 };

constexpr struct {
  Column column;
  float Sample::*member;
} kFloats[] = {{kPressure, &Sample::pressure}, {kTilt, &Sample::tilt}, {kOrientation, &Sample::orientation}};

std::uint32_t bitsOf(float value) {
  return std::bit_cast<std::uint32_t>(value);
}

// The columns in which a sample says something.
std::uint8_t columnsOf(const Sample& sample, std::size_t index) {
  const Sample plain;
  std::uint8_t columns = 0;
  for (const auto& [column, member] : kFloats) {
    if (bitsOf(sample.*member) != bitsOf(plain.*member)) columns |= column;
  }
  if (std::bit_cast<TimeWords>(sample.time) != std::bit_cast<TimeWords>(usualTime(index))) columns |= kTime;
  return columns;
}

}  // namespace

double usualTime(std::size_t index) {
  constexpr double kMillisecondsAPoint = 1000.0 / 240.0;
  return static_cast<double>(index) * kMillisecondsAPoint;
}

Samples::Samples(std::initializer_list<Sample> samples) {
  for (const Sample& sample : samples) push_back(sample);
}

std::size_t Samples::wordsEach() const {
  return 2 + static_cast<std::size_t>(std::popcount(unsigned{mColumns})) + ((mColumns & kTime) != 0 ? 1 : 0);
}

Sample Samples::operator[](std::size_t index) const {
  const std::uint32_t* word = mWords.data() + index * wordsEach();
  Sample sample;
  sample.x = std::bit_cast<float>(*word++);
  sample.y = std::bit_cast<float>(*word++);
  for (const auto& [column, member] : kFloats) {
    if ((mColumns & column) != 0) sample.*member = std::bit_cast<float>(*word++);
  }
  sample.time =
      (mColumns & kTime) != 0 ? std::bit_cast<double>(TimeWords{word[0], word[1]}) : usualTime(index);
  return sample;
}

Sample Samples::at(std::size_t index) const {
  if (index >= size()) throw std::out_of_range("no such sample");
  return (*this)[index];
}

void Samples::reserve(std::size_t size) {
  mWords.reserve(size * wordsEach());
}

void Samples::push_back(const Sample& sample) {
  const std::uint8_t columns = columnsOf(sample, size());
  if ((columns & ~mColumns) != 0) widen(columns);
  append(sample);
}

void Samples::append(const Sample& sample) {
  mWords.push_back(bitsOf(sample.x));
  mWords.push_back(bitsOf(sample.y));
  for (const auto& [column, member] : kFloats) {
    if ((mColumns & column) != 0) mWords.push_back(bitsOf(sample.*member));
  }
  if ((mColumns & kTime) != 0) {
    for (const std::uint32_t word : std::bit_cast<TimeWords>(sample.time)) mWords.push_back(word);
  }
}

void Samples::widen(std::uint8_t columns) {
  Samples wider;
  wider.mColumns = mColumns | columns;
  wider.reserve(std::max(mWords.capacity() / wordsEach(), size() + 1));
  for (const Sample& sample : *this) wider.append(sample);
  *this = std::move(wider);
}

void Samples::cut(std::size_t size) {
  mWords.resize(std::min(size, this->size()) * wordsEach());
}

}  // namespace QeltDesktop
