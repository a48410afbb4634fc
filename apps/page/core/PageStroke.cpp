#include "core/PageStroke.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <numbers>
#include <string>

#include "engine/MotionEvent.h"
#include "pen/RenderingVersions.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

// A pen takes over the width of the outline before until the first move that it draws. It draws a move that
// ends this far from where it went down, and every longer one: shorter ones it may leave out, those of a
// finger or a mouse up to 50 stroke units.
float surelyDrawn(const PageStyle& style) {
  return (style.tool == Qelt::kToolStylus ? 8.0f : 64.0f) + style.size;
}

}  // namespace

PageStroke::PageStroke(StrokeId id, const PageStyle& style, std::span<const Sample> samples)
    : mId(id),
      mStyle(style),
      mSize(samples.size()),
      mPoints(std::make_unique<Qelt::PointF[]>(mSize)),
      mAttitudes(std::make_unique<float[]>(3 * mSize)),
      mTimes(std::make_unique<double[]>(mSize)) {
  const Sample first = samples.front();
  mLine.Set(first.x, first.y, first.x, first.y);
  for (std::size_t i = 0; i < mSize; ++i) {
    const Sample& sample = samples[i];
    mPoints[i] = {.x = sample.x, .y = sample.y};
    mAttitudes[i] = sample.pressure;
    mAttitudes[mSize + i] = sample.tilt;
    mAttitudes[2 * mSize + i] = sample.orientation;
    mTimes[i] = sample.time;
    mLine.MakeRect(sample.x, sample.y);
    if (std::hypot(sample.x - first.x, sample.y - first.y) > surelyDrawn(style)) mSettlesOutline = true;
  }
}

PageStroke::~PageStroke() = default;

Sample PageStroke::sample(std::size_t index) const {
  return {.x = mPoints[index].x,
          .y = mPoints[index].y,
          .pressure = mAttitudes[index],
          .tilt = mAttitudes[mSize + index],
          .orientation = mAttitudes[2 * mSize + index],
          .time = mTimes[index]};
}

std::vector<Sample> PageStroke::samples() const {
  std::vector<Sample> all;
  all.reserve(mSize);
  for (std::size_t i = 0; i < mSize; ++i) all.push_back(sample(i));
  return all;
}

int PageStroke::GetPointCount() const {
  return static_cast<int>(mSize);
}

const Qelt::PointF* PageStroke::GetPoint() const {
  return mPoints.get();
}

const std::int64_t* PageStroke::GetTimeStamp() const {
  static thread_local std::vector<std::int64_t> times;
  times.resize(mSize);
  std::transform(mTimes.get(), mTimes.get() + mSize, times.begin(), wholeMilliseconds);
  return times.data();
}

const float* PageStroke::GetPressure() const {
  return mAttitudes.get();
}

const float* PageStroke::GetTilt() const {
  return mAttitudes.get() + mSize;
}

const float* PageStroke::GetOrientation() const {
  return mAttitudes.get() + 2 * mSize;
}

int PageStroke::GetToolType() const {
  return mStyle.tool;
}

Pointer pointerOf(const PageStyle& style) {
  const int source = style.tool == Qelt::kToolFinger  ? Qelt::kSourceTouchScreen
                     : style.tool == Qelt::kToolMouse ? Qelt::kSourceMouse
                                                      : Qelt::kSourceStylus;
  return {.tool = style.tool, .source = source};
}

// The widest stamps are 3.5 times as wide as the pen, and a ramp may run past its end by as much again.
float reachOf(const PageStyle& style) {
  return 4.0f * style.size + 3.0f + (style.outline ? style.outline->size : 0.0f);
}

void checkStyle(const PageStyle& style) {
  const int first = Qelt::kRenderingVersions.front().number;
  const int last = Qelt::kRenderingVersions.back().number;
  if (style.look < first || style.look > last) {
    throw Refusal("there is no look " + std::to_string(style.look) + ", only " + std::to_string(first) +
                  " to " + std::to_string(last));
  }
  // A NaN fails these comparisons too.
  if (!(style.size > 0.0f && style.size <= kLargestSize)) {
    throw Refusal("a pen's size is above 0 and at most 1000");
  }
  if (style.outline && !(style.outline->size >= 0.0f && style.outline->size <= kLargestSize)) {
    throw Refusal("an outline's size is from 0 to 1000");
  }
  if (style.tool < Qelt::kToolFinger || style.tool > Qelt::kToolMouse) {
    throw Refusal("there is no tool " + std::to_string(style.tool));
  }
}

bool isUsable(const Sample& sample) {
  constexpr double kFarthestTime = 9.0e15;  // milliseconds; whole ones fit into a double
  return std::abs(sample.x) <= kFarthest && std::abs(sample.y) <= kFarthest &&
         std::isfinite(sample.pressure) && std::isfinite(sample.tilt) && std::isfinite(sample.orientation) &&
         std::abs(sample.time) <= kFarthestTime;
}

Sample inRange(Sample sample, double earliest) {
  sample.pressure = std::clamp(sample.pressure, 0.0f, 1.0f);
  sample.tilt = std::clamp(sample.tilt, 0.0f, std::numbers::pi_v<float> / 2.0f);
  sample.time = std::max(sample.time, earliest);
  return sample;
}

}  // namespace QeltDesktop
