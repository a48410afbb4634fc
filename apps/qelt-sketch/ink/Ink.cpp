#include "ink/Ink.h"

#include <algorithm>
#include <new>
#include <stdexcept>

namespace QeltDesktop {
namespace {

constexpr std::uint8_t kNoTool = 255;

}  // namespace

std::uint32_t numberAfter(std::size_t count) {
  if (count >= kNoNumber) throw std::bad_alloc();
  return static_cast<std::uint32_t>(count);
}

Stroke Strokes::operator[](std::size_t index) const {
  const Record& record = mRecords[index];
  const std::size_t first = record.first;
  const auto columns = static_cast<Columns>(record.columns);
  const std::size_t end = index + 1 < mRecords.size() ? mRecords[index + 1].first : mOpen.first();
  return {.samples = Samples(mWords, first, (end - first) / wordsPerSample(columns), columns),
          .brush = record.brush == kNoNumber ? Brush{} : mBrushes[record.brush],
          .tool = record.tool == kNoTool ? std::nullopt : std::optional<int>(record.tool)};
}

Stroke Strokes::at(std::size_t index) const {
  if (index >= size()) throw std::out_of_range("no such stroke");
  return (*this)[index];
}

void Strokes::add(const std::vector<Sample>& samples, const Brush& brush, std::optional<int> tool) {
  for (const Sample& sample : samples) addSample(sample);
  mBrushes.push_back(brush);
  finishStroke(numberAfter(mBrushes.size() - 1), tool);
}

void Strokes::cutLast(std::size_t size) {
  const Samples samples = back().samples;
  const Record& last = mRecords.back();
  const std::size_t left = std::min(size, samples.size());
  mWords.resize(last.first + left * wordsPerSample(static_cast<Columns>(last.columns)));
  mOpen = SamplePacker(mWords.size());
}

void Strokes::enlarge(float factor) {
  for (std::size_t i = 0; i < mRecords.size(); ++i) {
    const std::size_t first = mRecords[i].first;
    const std::size_t end = i + 1 < mRecords.size() ? mRecords[i + 1].first : mOpen.first();
    enlargePlaces(mWords, first, end, static_cast<Columns>(mRecords[i].columns), factor);
  }
}

void Strokes::finishStroke(std::uint32_t brush, std::optional<int> tool) {
  mRecords.push_back({.first = mOpen.first(),
                      .columns = mOpen.columns(),
                      .brush = brush,
                      .tool = tool ? static_cast<std::uint8_t>(*tool) : kNoTool});
  mOpen = SamplePacker(mWords.size());
}

void Strokes::dropStroke() {
  mWords.resize(mOpen.first());
  mOpen = SamplePacker(mWords.size());
}

}  // namespace QeltDesktop
