#include "ink/Samples.h"

#include <array>
#include <bit>
#include <cstring>
#include <stdexcept>

namespace QeltDesktop {
namespace {

using TimeWords = std::array<std::uint32_t, 2>;

enum Column : Columns { kPressure = 1, kTilt = 2, kOrientation = 4, kTime = 8 };

constexpr struct {
  Column column;
  float Sample::*member;
} kFloats[] = {{kPressure, &Sample::pressure}, {kTilt, &Sample::tilt}, {kOrientation, &Sample::orientation}};

// std::bit_cast, which the web's C++ library lacks.
template <typename To, typename From>
To bitCast(const From& from) {
  static_assert(sizeof(To) == sizeof(From));
  To to;
  std::memcpy(&to, &from, sizeof to);
  return to;
}

std::uint32_t bitsOf(float value) {
  return bitCast<std::uint32_t>(value);
}

// The columns in which a sample differs from what is assumed where nothing was recorded.
Columns columnsOf(const Sample& sample, std::size_t index) {
  const Sample plain;
  Columns columns = 0;
  for (const auto& [column, member] : kFloats) {
    if (bitsOf(sample.*member) != bitsOf(plain.*member)) columns |= column;
  }
  if (bitCast<TimeWords>(sample.time) != bitCast<TimeWords>(usualTime(index))) columns |= kTime;
  return columns;
}

void writeSample(PackedWords& words, std::size_t at, const Sample& sample, Columns columns) {
  words[at++] = bitsOf(sample.x);
  words[at++] = bitsOf(sample.y);
  for (const auto& [column, member] : kFloats) {
    if ((columns & column) != 0) words[at++] = bitsOf(sample.*member);
  }
  if ((columns & kTime) != 0) {
    for (const std::uint32_t word : bitCast<TimeWords>(sample.time)) words[at++] = word;
  }
}

}  // namespace

double usualTime(std::size_t index) {
  constexpr double kMillisecondsAPoint = 1000.0 / 240.0;
  return static_cast<double>(index) * kMillisecondsAPoint;
}

void PackedWords::resize(std::size_t size) {
  const std::size_t blocks = size / kBlock + (size % kBlock != 0 ? 1 : 0);
  if (blocks < mBlocks.size()) mBlocks.resize(blocks);
  while (mBlocks.size() < blocks) {
    if (!mBlocks.empty()) mBlocks.back().resize(kBlock);
    mBlocks.emplace_back().reserve(kBlock);
  }
  if (blocks > 0) mBlocks.back().resize(size - (blocks - 1) * kBlock);
  mSize = size;
}

std::size_t wordsPerSample(Columns columns) {
  return 2 + static_cast<std::size_t>(std::popcount(unsigned{columns})) + ((columns & kTime) != 0 ? 1 : 0);
}

void enlargePlaces(PackedWords& words, std::size_t first, std::size_t end, Columns columns, float factor) {
  const std::size_t each = wordsPerSample(columns);
  for (std::size_t at = first; at < end; at += each) {
    for (const std::size_t place : {at, at + 1}) words[place] = bitsOf(bitCast<float>(words[place]) * factor);
  }
}

Sample Samples::operator[](std::size_t index) const {
  const PackedWords& words = *mWords;
  std::size_t at = mFirst + index * wordsPerSample(mColumns);
  Sample sample;
  sample.x = bitCast<float>(words[at++]);
  sample.y = bitCast<float>(words[at++]);
  for (const auto& [column, member] : kFloats) {
    if ((mColumns & column) != 0) sample.*member = bitCast<float>(words[at++]);
  }
  sample.time =
      (mColumns & kTime) != 0 ? bitCast<double>(TimeWords{words[at], words[at + 1]}) : usualTime(index);
  return sample;
}

Sample Samples::at(std::size_t index) const {
  if (index >= size()) throw std::out_of_range("no such sample");
  return (*this)[index];
}

void SamplePacker::add(PackedWords& words, const Sample& sample) {
  const Columns columns = columnsOf(sample, mSize);
  if ((columns & ~mColumns) != 0) widen(words, mColumns | columns);
  const std::size_t each = wordsPerSample(mColumns);
  words.resize(mFirst + (mSize + 1) * each);
  writeSample(words, mFirst + mSize * each, sample, mColumns);
  ++mSize;
}

// In place, from the last sample to the first: each moves on to words whose samples have moved already.
void SamplePacker::widen(PackedWords& words, Columns columns) {
  const Samples narrow(words, mFirst, mSize, mColumns);
  const std::size_t each = wordsPerSample(columns);
  words.resize(mFirst + mSize * each);
  for (std::size_t i = mSize; i-- > 0;) writeSample(words, mFirst + i * each, narrow[i], columns);
  mColumns = columns;
}

}  // namespace QeltDesktop
